/* Texts that programs write. */
#pragma once

#include <gtest/gtest.h>

#include <string>
#include <string_view>

namespace text {

/* Whether a text has this part; a failure shows both. */
inline testing::AssertionResult contains(const std::string &text, std::string_view part) {
    if (text.find(part) != std::string::npos) {
        return testing::AssertionSuccess();
    }
    return testing::AssertionFailure() << "no '" << part << "' in: " << text.substr(0, 2000);
}

}  // namespace text
