/* Texts that tests make, and that programs write. */
#pragma once

#include <gtest/gtest.h>

#include <string>
#include <string_view>

namespace text {

inline std::string repeated(std::size_t count, std::string_view part) {
    std::string all;
    while (count-- > 0) {
        all += part;
    }
    return all;
}

/* Whether a text has this part; a failure shows both. */
inline testing::AssertionResult contains(const std::string &text, std::string_view part) {
    if (text.find(part) != std::string::npos) {
        return testing::AssertionSuccess();
    }
    return testing::AssertionFailure() << "no '" << part << "' in: " << text.substr(0, 2000);
}

}  // namespace text
