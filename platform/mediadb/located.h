/* Failures that say which database they are about, where there may be several. */
#pragma once

#include "catalogue.h"

namespace zano::mediadb {

class LocatedError : public DatabaseError {
    using DatabaseError::DatabaseError;
};

/* Runs `action`, whose result it gives; a failure of it names the location, without its password.
 */
template <typename Action>
auto at(const std::string &location, Action action) {
    try {
        return action();
    } catch (const LocatedError &) {
        throw;
    } catch (const DatabaseError &error) {
        const std::string shown = withoutPassword(location, location);
        const std::string words = error.what();
        const bool isNamed = words.find(shown.substr(shown.find(':') + 1)) != std::string::npos;
        throw LocatedError(error.code(), isNamed ? words : shown + ": " + words);
    }
}

}  // namespace zano::mediadb
