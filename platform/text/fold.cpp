#include "fold.h"

#include <utf8proc.h>
#include <algorithm>
#include <array>

namespace zano {
namespace {

struct Spelling {
    char32_t letter;
    std::string_view plain;
};

/* Sorted by letter. Capitals are here as their small letters: case folding comes first. */
constexpr Spelling kSpellings[] = {
    {U'\u00E6', "ae"}, {U'\u00F0', "d"},  {U'\u00F8', "o"},  {U'\u0111', "d"},
    {U'\u0127', "h"},  {U'\u0131', "i"},  {U'\u0142', "l"},  {U'\u0153', "oe"},
    {U'\u02B9', "'"},  // modifier letter prime
    {U'\u02BC', "'"},  // modifier letter apostrophe
    {U'\u2018', "'"},  {U'\u2019', "'"},  {U'\u201A', "'"},  {U'\u201B', "'"},
    {U'\u201C', "\""}, {U'\u201D', "\""}, {U'\u201E', "\""}, {U'\u201F', "\""},
    {U'\u2032', "'"},  {U'\u2044', "/"},  // fraction slash, which ½ decomposes to
    {U'\u2212', "-"},                     // minus sign
};
static_assert(std::is_sorted(std::begin(kSpellings), std::end(kSpellings),
                             [](const Spelling &a, const Spelling &b) {
                                 return a.letter < b.letter;
                             }));

constexpr char32_t kVoicing = U'\u3099';
constexpr char32_t kHalfVoicing = U'\u309A';

/* Canonical combining classes of marks that make another letter of the one before:
 * 8 kana voicing, 9 virama, 103 and 118 Thai and Lao vowels, 129-132 Tibetan vowels. */
bool isLetterMaking(int combiningClass) {
    constexpr std::array kClasses = {8, 9, 103, 118, 129, 130, 132};
    return std::find(kClasses.begin(), kClasses.end(), combiningClass) != kClasses.end();
}

bool isAccent(const utf8proc_property_t &property) {
    switch (property.category) {
        case UTF8PROC_CATEGORY_ME:
            return true;
        case UTF8PROC_CATEGORY_MN:
        case UTF8PROC_CATEGORY_MC:
            return property.combining_class != 0 && !isLetterMaking(property.combining_class);
        default:
            return false;
    }
}

void appendCharacter(std::string &key, char32_t character) {
    std::array<utf8proc_uint8_t, 4> bytes{};
    const auto length =
        utf8proc_encode_char(static_cast<utf8proc_int32_t>(character), bytes.data());
    key.append(reinterpret_cast<const char *>(bytes.data()), static_cast<size_t>(length));
}

char32_t lastCharacter(std::string_view key) {
    size_t begin = key.size() - 1;
    while (begin > 0 && (static_cast<unsigned char>(key[begin]) & 0xC0) == 0x80) {
        --begin;
    }
    std::string_view last = key.substr(begin);
    return takeCharacter(last);
}

/* Joins the voicing of kana with its letter again, or a search for the plain letter would find
 * the voiced one. */
void appendVoicing(std::string &key, char32_t mark) {
    if (!key.empty()) {
        const char32_t letter = lastCharacter(key);
        std::array<utf8proc_int32_t, 2> pair{static_cast<utf8proc_int32_t>(letter),
                                             static_cast<utf8proc_int32_t>(mark)};
        const auto options = static_cast<utf8proc_option_t>(UTF8PROC_COMPOSE | UTF8PROC_STABLE);
        if (utf8proc_normalize_utf32(pair.data(), pair.size(), options) == 1) {
            while ((static_cast<unsigned char>(key.back()) & 0xC0) == 0x80) {
                key.pop_back();
            }
            key.pop_back();
            appendCharacter(key, static_cast<char32_t>(pair[0]));
            return;
        }
    }
    appendCharacter(key, mark);
}

/* A character that decomposes and folds no further. */
void appendPlain(std::string &key, char32_t character) {
    const auto *property = utf8proc_get_property(static_cast<utf8proc_int32_t>(character));
    if (isAccent(*property) || property->ignorable) {
        return;
    }
    if (character == kVoicing || character == kHalfVoicing) {
        appendVoicing(key, character);
        return;
    }
    if (property->category == UTF8PROC_CATEGORY_CC || property->category == UTF8PROC_CATEGORY_ZL ||
        property->category == UTF8PROC_CATEGORY_ZP) {
        key.push_back(' ');
        return;
    }
    if (property->category == UTF8PROC_CATEGORY_PD) {
        key.push_back('-');
        return;
    }
    const auto *spelling =
        std::lower_bound(std::begin(kSpellings), std::end(kSpellings), character,
                         [](const Spelling &row, char32_t wanted) { return row.letter < wanted; });
    if (spelling != std::end(kSpellings) && spelling->letter == character) {
        key.append(spelling->plain);
    } else {
        appendCharacter(key, character);
    }
}

/* Decomposition and case folding can each make work for the other (U+1E9B, say), so this goes
 * on until nothing changes; three rounds are the most that Unicode has. */
void appendFolded(std::string &key, char32_t character) {
    std::array<utf8proc_int32_t, 32> parts{};
    int boundary = 0;
    const auto options =
        static_cast<utf8proc_option_t>(UTF8PROC_DECOMPOSE | UTF8PROC_COMPAT | UTF8PROC_CASEFOLD);
    const auto count = utf8proc_decompose_char(static_cast<utf8proc_int32_t>(character),
                                               parts.data(), parts.size(), options, &boundary);
    if (count <= 0 || count > static_cast<utf8proc_ssize_t>(parts.size())) {
        appendPlain(key, character);
        return;
    }
    if (count == 1 && parts[0] == static_cast<utf8proc_int32_t>(character)) {
        appendPlain(key, character);
        return;
    }
    for (utf8proc_ssize_t i = 0; i < count; ++i) {
        appendFolded(key, static_cast<char32_t>(parts[static_cast<size_t>(i)]));
    }
}

}  // namespace

char32_t takeCharacter(std::string_view &text) {
    utf8proc_int32_t character = -1;
    const auto length = utf8proc_iterate(
        reinterpret_cast<const utf8proc_uint8_t *>(text.data()),
        static_cast<utf8proc_ssize_t>(std::min<size_t>(text.size(), 4)), &character);
    if (length <= 0) {
        text.remove_prefix(1);
        return U'\uFFFD';
    }
    text.remove_prefix(static_cast<size_t>(length));
    return static_cast<char32_t>(character);
}

std::string foldedKey(std::string_view text) {
    std::string key;
    key.reserve(text.size());
    while (!text.empty()) {
        const auto byte = static_cast<unsigned char>(text.front());
        if (byte >= 0x80) {
            appendFolded(key, takeCharacter(text));
            continue;
        }
        text.remove_prefix(1);
        if (byte >= 'A' && byte <= 'Z') {
            key.push_back(static_cast<char>(byte - 'A' + 'a'));
        } else {
            key.push_back(byte < 0x20 || byte == 0x7F ? ' ' : static_cast<char>(byte));
        }
    }
    return key;
}

std::string lowerCase(std::string_view text) {
    std::string lower;
    lower.reserve(text.size());
    while (!text.empty()) {
        const auto character = static_cast<utf8proc_int32_t>(takeCharacter(text));
        appendCharacter(lower, static_cast<char32_t>(utf8proc_tolower(character)));
    }
    return lower;
}

std::string_view cutAtCharacter(std::string_view text, size_t maxBytes) {
    if (text.size() <= maxBytes) {
        return text;
    }
    size_t end = maxBytes;
    while (end > 0 && maxBytes - end < 4 &&
           (static_cast<unsigned char>(text[end]) & 0xC0) == 0x80) {
        --end;
    }
    return text.substr(0, end);
}

}  // namespace zano
