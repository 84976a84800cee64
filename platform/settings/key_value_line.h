/* The lines of the files of settings. Views are into the text that was given. */
#pragma once

#include <optional>
#include <string_view>

namespace zano::settings {

struct KeyValue {
    std::string_view key;
    std::string_view value;
};

/* Takes the first line of a text, with its line feed, from its front. */
std::string_view takeLine(std::string_view &text);

/* Blanks around key and value and one pair of quotes around the value are dropped. Null for a
 * comment, and for a line without '='. */
std::optional<KeyValue> readKeyValue(std::string_view line);

}  // namespace zano::settings
