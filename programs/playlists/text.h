/* Texts on a terminal: what may be shown, and how many cells it takes.
 *
 * Tags and file names come from anywhere. What is shown went through printable() first; the
 * other functions take such text. All text is UTF-8.
 */
#pragma once

#include <string>
#include <string_view>

namespace vorelix {

/* The text with U+FFFD in the place of every byte that is not part of valid UTF-8. */
std::string validUtf8(std::string_view text);

/* The text as it may be written to a terminal: valid UTF-8 in one line, without anything that
 * a terminal obeys. Control characters become their pictures (ESC is U+241B); line separators
 * and marks that turn the direction of what follows become U+FFFD. */
std::string printable(std::string_view text);

/* The cells that the text takes. A letter with its combining marks, an emoji sequence and a flag
 * count as one character. */
int displayWidth(std::string_view text);

/* The text, or as many of its first characters as fit into `width` cells together with the "…"
 * that marks the cut. "" when width is 0. */
std::string cutToWidth(std::string_view text, int width);

/* The text as one word of a shell command line. */
std::string shellQuoted(std::string_view word);

}  // namespace vorelix
