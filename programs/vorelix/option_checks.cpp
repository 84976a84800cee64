#include "option_checks.h"

#include <charconv>

#include "text.h"

namespace vorelix {

CLI::Validator wholeNumber(int least, int most) {
    const std::string range = "from " + std::to_string(least) + " to " + std::to_string(most);
    return {[=](std::string &text) {
                int number = 0;
                const char *end = text.data() + text.size();
                const auto [rest, error] = std::from_chars(text.data(), end, number);
                if (error != std::errc() || rest != end || number < least || number > most) {
                    return "'" + printable(text) + "' is not a whole number " + range;
                }
                text = std::to_string(number);
                return std::string();
            },
            ""};
}

CLI::Validator notEmpty() {
    return {[](std::string &text) { return text.empty() ? "it is empty" : std::string(); }, ""};
}

}  // namespace vorelix
