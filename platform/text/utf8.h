/* Texts in UTF-8 as they are: whether they are valid, one character, the Unicode forms. */
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace zano {

bool isUtf8(std::string_view text);

/* A character in UTF-8; U+FFFD for a number that is none, or NUL. */
std::string characterText(char32_t character);

/* UTF-8 composed (NFC) or decomposed (NFD); null when it is not UTF-8. */
enum class Form { Composed, Decomposed };
std::optional<std::string> normalised(std::string_view text, Form form);

}  // namespace zano
