/* A command could not do what it was asked to. */
#pragma once

#include <stdexcept>
#include <string>

namespace vorelix {

/* what() is for the user: what was tried, and what to do next. */
class Failure : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

/* Throws the Failure of a library call that gave no result, right after it: what could not be
 * done, what is wrong and what to do next, and on a second line the platform's own words. */
[[noreturn]] void throwDatabaseFailure(const std::string &what);

}  // namespace vorelix
