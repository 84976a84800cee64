/* The folded key by which titles, albums, artists and genres are searched and sorted.
 *
 * Two texts that differ only in case, accents, composed or decomposed letters, width, hyphens
 * or typographic quotes have one key. A key is built character by character, so the key of a
 * part of a text is a part of the key of the text (where the part does not cut a kana from its
 * voicing), and a key is its own key.
 *
 * What is done to each character: compatibility decomposition (Unicode NFKD) and full case
 * folding; accents dropped (marks with a combining class, but not the voicing of kana, viramas
 * and the vowel signs of Thai, Lao and Tibetan, which make another letter), as are characters
 * that are never seen (soft hyphen, joiners, variation selectors); letters that Unicode does not
 * decompose (ø ł đ ð ħ ı æ œ) spelled plainly; every dash a hyphen; control characters blanks.
 */
#pragma once

#include <string>
#include <string_view>

namespace zano {

/* The key of a text in UTF-8; a byte that is not part of a valid sequence counts as U+FFFD. */
std::string foldedKey(std::string_view text);

/* The text with its capitals as small letters, character by character. */
std::string lowerCase(std::string_view text);

/* Takes one character, or one invalid byte, from the front of text, which is not empty. */
char32_t takeCharacter(std::string_view &text);

/* The longest front of text with at most maxBytes that does not cut a character in two. */
std::string_view cutAtCharacter(std::string_view text, size_t maxBytes);

}  // namespace zano
