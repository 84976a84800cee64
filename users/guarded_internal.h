/* Keeps exceptions inside the unit. */
#pragma once

#include <exception>

namespace vorelix::users {

/* What call() gives; `otherwise` when it throws, which it does when memory runs out. */
template <typename Result, typename Call>
Result guarded(Result otherwise, Call call) {
    try {
        return call();
    } catch (const std::exception &) {
        return otherwise;
    }
}

}  // namespace vorelix::users
