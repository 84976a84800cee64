/* One line of the configuration file. */
#pragma once

#include <optional>

namespace vorelix::config {

/* Texts in the line itself. */
struct KeyValue {
    const char *key;
    const char *value;
};

/* Takes a line, with or without its line feed, apart by writing NULs into it; null for a comment
 * and a blank line. */
std::optional<KeyValue> splitLine(char *line);

}  // namespace vorelix::config
