#include "text.h"

#include <utf8proc.h>
#include <algorithm>
#include <cctype>
#include <cstring>

namespace vorelix {

namespace {

constexpr std::string_view kReplacement = "\xEF\xBF\xBD";
constexpr std::string_view kEllipsis = "\xE2\x80\xA6";
constexpr int kWideCells = 2;
constexpr utf8proc_int32_t kEmojiPresentation = 0xFE0F;

struct CodePoint {
    utf8proc_int32_t value;  // negative: this byte is not valid UTF-8
    size_t bytes;
};

CodePoint firstOf(std::string_view text) {
    utf8proc_int32_t value = -1;
    const auto bytes = utf8proc_iterate(reinterpret_cast<const utf8proc_uint8_t *>(text.data()),
                                        static_cast<utf8proc_ssize_t>(text.size()), &value);
    return bytes > 0 ? CodePoint{value, static_cast<size_t>(bytes)} : CodePoint{-1, 1};
}

/* A character as a reader sees it. */
struct Cluster {
    size_t bytes;
    int width;
};

Cluster firstClusterOf(std::string_view text) {
    CodePoint current = firstOf(text);
    const int baseWidth = utf8proc_charwidth(current.value);
    Cluster cluster{current.bytes, baseWidth};
    bool emoji = false;
    utf8proc_int32_t state = 0;
    while (cluster.bytes < text.size()) {
        const CodePoint next = firstOf(text.substr(cluster.bytes));
        if (utf8proc_grapheme_break_stateful(current.value, next.value, &state)) {
            break;
        }
        cluster.bytes += next.bytes;
        cluster.width += utf8proc_charwidth(next.value);
        emoji = emoji || next.value == kEmojiPresentation;
        current = next;
    }
    // what is joined to a wide character (a skin tone, the rest of a family) is drawn over it
    if (emoji || baseWidth == kWideCells) {
        cluster.width = kWideCells;
    }
    return cluster;
}

bool turnsDirection(utf8proc_int32_t value) {
    return (value >= 0x202A && value <= 0x202E) || (value >= 0x2066 && value <= 0x2069);
}

void appendCodePoint(std::string &out, utf8proc_int32_t value) {
    utf8proc_uint8_t buffer[4];
    const auto bytes = utf8proc_encode_char(value, buffer);
    out.append(reinterpret_cast<const char *>(buffer), static_cast<size_t>(bytes));
}

void appendPrintable(std::string &out, std::string_view bytes, utf8proc_int32_t value) {
    constexpr utf8proc_int32_t kDelete = 0x7F;
    constexpr utf8proc_int32_t kControlPictures = 0x2400;
    constexpr utf8proc_int32_t kDeletePicture = 0x2421;
    switch (value < 0 ? UTF8PROC_CATEGORY_CC : utf8proc_category(value)) {
        case UTF8PROC_CATEGORY_CC:
            if (value == kDelete) {
                appendCodePoint(out, kDeletePicture);
            } else if (value >= 0 && value < ' ') {
                appendCodePoint(out, kControlPictures + value);
            } else {
                out += kReplacement;
            }
            break;
        case UTF8PROC_CATEGORY_ZL:
        case UTF8PROC_CATEGORY_ZP:
            out += kReplacement;
            break;
        default:
            out += turnsDirection(value) ? kReplacement : bytes;
    }
}

template <typename Append>
std::string rewritten(std::string_view text, Append append) {
    std::string out;
    out.reserve(text.size());
    while (!text.empty()) {
        const CodePoint first = firstOf(text);
        append(out, text.substr(0, first.bytes), first.value);
        text.remove_prefix(first.bytes);
    }
    return out;
}

}  // namespace

std::string validUtf8(std::string_view text) {
    return rewritten(text, [](std::string &out, std::string_view bytes, utf8proc_int32_t value) {
        out += value < 0 ? kReplacement : bytes;
    });
}

std::string printable(std::string_view text) {
    return rewritten(text, appendPrintable);
}

int displayWidth(std::string_view text) {
    int width = 0;
    while (!text.empty()) {
        const Cluster cluster = firstClusterOf(text);
        width += cluster.width;
        text.remove_prefix(cluster.bytes);
    }
    return width;
}

std::string cutToWidth(std::string_view text, int width) {
    if (displayWidth(text) <= width) {
        return std::string(text);
    }
    if (width < 1) {
        return {};
    }
    size_t kept = 0;
    int used = 1;  // the ellipsis
    while (true) {
        const Cluster cluster = firstClusterOf(text.substr(kept));
        if (used + cluster.width > width) {
            return std::string(text.substr(0, kept)).append(kEllipsis);
        }
        used += cluster.width;
        kept += cluster.bytes;
    }
}

std::string shellQuoted(std::string_view word) {
    const auto isPlain = [](unsigned char c) {
        return c >= 0x80 || std::isalnum(c) != 0 || std::strchr("_@%+:,./=-", c) != nullptr;
    };
    if (!word.empty() && std::all_of(word.begin(), word.end(), isPlain)) {
        return std::string(word);
    }
    std::string quoted = "'";
    for (const char c : word) {
        quoted += c == '\'' ? std::string_view("'\\''") : std::string_view(&c, 1);
    }
    return quoted + "'";
}

}  // namespace vorelix
