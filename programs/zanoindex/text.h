/* Texts of tags and file names, made fit for storing and for showing. */
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace zano::index {

/* The longest text that is stored, in bytes. */
inline constexpr std::size_t kMaxTextBytes = 4096;

/* UTF-8 from bytes that should be it. A byte that is not part of a valid sequence is read as
 * Windows-1252, which is what nearly all tags and names that are not UTF-8 are in. */
std::string toUtf8(std::string_view bytes);

/* toUtf8, without control characters (white space among them becomes a blank), without blanks at
 * both ends, and cut to kMaxTextBytes between characters. */
std::string storableText(std::string_view bytes);

/* The title of a file that names none: its base name without the suffix, as storable text. */
std::string titleOfPath(std::string_view path);

/* A path or text for a message: one line, valid UTF-8, nothing that a terminal obeys; control
 * characters and bytes that are not UTF-8 are written as \n and \xNN. */
std::string printable(std::string_view bytes);

/* true when all of it is valid UTF-8. */
bool isUtf8(std::string_view bytes);

}  // namespace zano::index
