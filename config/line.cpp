#include <cstddef>
#include <cstring>
#include <string_view>

#include "line_internal.h"

namespace vorelix::config {
namespace {

/* The length of a text without the characters of a set at its end. */
std::size_t lengthWithout(std::string_view text, const char *characters) {
    return text.find_last_not_of(characters) + 1;
}

/* Ends the value behind its last character and takes its quotes off. */
const char *trimValue(char *value) {
    std::size_t length = lengthWithout(value, " \t\n");
    if (length > 0 && *value == '"' && value[length - 1] == '"') {
        ++value;
        // A single quote is first and last character at once.
        length -= length > 1 ? 2 : 1;
    }
    value[length] = '\0';
    return value;
}

}  // namespace

std::optional<KeyValue> splitLine(char *line) {
    char *const key = line + std::strspn(line, " \t");
    if (*key == '#' || *key == '\n' || *key == '\0') {
        return std::nullopt;
    }
    const std::size_t keyLength = lengthWithout({key, std::strcspn(key, "=")}, " \t\n=");
    char *value = key + keyLength;
    // One character ends the key, whichever it is.
    if (*value != '\0') {
        *value++ = '\0';
    }
    value += std::strspn(value, " \t=");
    return KeyValue{key, trimValue(value)};
}

}  // namespace vorelix::config
