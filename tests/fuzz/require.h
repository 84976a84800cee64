/* What the readers of inputs hold to. */
#pragma once

#include <cstdlib>

namespace vorelix::fuzz {

/* Aborts, which a fuzzer reports with the input, when something is not so. */
inline void require(bool isSo) {
    if (!isSo) {
        std::abort();
    }
}

}  // namespace vorelix::fuzz
