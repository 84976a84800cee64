#include "text.h"

#include <algorithm>
#include <array>
#include <cstdio>

#include "text/fold.h"

namespace zano::index {
namespace {

constexpr char32_t kReplacement = U'\uFFFD';

/* Windows-1252 from 0x80 to 0x9F; from 0xA0 on it is Latin-1. */
constexpr std::array<char16_t, 32> kWindows1252 = {
    u'\u20AC', u'\uFFFD', u'\u201A', u'\u0192', u'\u201E', u'\u2026', u'\u2020', u'\u2021',
    u'\u02C6', u'\u2030', u'\u0160', u'\u2039', u'\u0152', u'\uFFFD', u'\u017D', u'\uFFFD',
    u'\uFFFD', u'\u2018', u'\u2019', u'\u201C', u'\u201D', u'\u2022', u'\u2013', u'\u2014',
    u'\u02DC', u'\u2122', u'\u0161', u'\u203A', u'\u0153', u'\uFFFD', u'\u017E', u'\u0178'};

bool isPlainAscii(std::string_view text) {
    return std::all_of(text.begin(), text.end(), [](char c) { return c >= 0x20 && c < 0x7F; });
}

bool isControl(char32_t c) {
    return c < 0x20 || (c >= 0x7F && c < 0xA0);
}

/* A character from the front of text and the bytes it came from. */
struct Taken {
    char32_t character;
    std::string_view bytes;
    bool valid;
};

Taken take(std::string_view &text) {
    const auto before = text;
    const auto character = takeCharacter(text);
    const auto bytes = before.substr(0, before.size() - text.size());
    return {character, bytes, character != kReplacement || bytes.size() > 1};
}

/* For the characters of Windows-1252 beyond ASCII, which take two or three bytes. */
void appendWindows1252(std::string &out, unsigned char byte) {
    const unsigned code = byte < 0xA0 ? kWindows1252[byte - 0x80U] : byte;
    if (code < 0x800) {
        out.push_back(static_cast<char>(0xC0U | (code >> 6U)));
    } else {
        out.push_back(static_cast<char>(0xE0U | (code >> 12U)));
        out.push_back(static_cast<char>(0x80U | ((code >> 6U) & 0x3FU)));
    }
    out.push_back(static_cast<char>(0x80U | (code & 0x3FU)));
}

void appendStorable(std::string &out, const Taken &taken) {
    if (!taken.valid) {
        appendWindows1252(out, static_cast<unsigned char>(taken.bytes.front()));
    } else if (!isControl(taken.character)) {
        out.append(taken.bytes);
    } else if (taken.character >= U'\t' && taken.character <= U'\r') {
        out.push_back(' ');
    }
}

std::string_view trimmed(std::string_view text) {
    const auto first = text.find_first_not_of(' ');
    if (first == std::string_view::npos) {
        return {};
    }
    return text.substr(first, text.find_last_not_of(' ') - first + 1);
}

void appendEscaped(std::string &out, std::string_view bytes) {
    for (const char c : bytes) {
        std::array<char, 5> code{};
        std::snprintf(code.data(), code.size(), "\\x%02X", static_cast<unsigned char>(c));
        out.append(code.data());
    }
}

}  // namespace

std::string toUtf8(std::string_view bytes) {
    if (isPlainAscii(bytes)) {
        return std::string(bytes);
    }
    std::string out;
    while (!bytes.empty()) {
        const auto taken = take(bytes);
        if (taken.valid) {
            out.append(taken.bytes);
        } else {
            appendWindows1252(out, static_cast<unsigned char>(taken.bytes.front()));
        }
    }
    return out;
}

std::string storableText(std::string_view bytes) {
    if (isPlainAscii(bytes) && bytes.size() <= kMaxTextBytes) {
        return std::string(trimmed(bytes));
    }
    std::string out;
    // A damaged tag can hold megabytes; what is behind the cut is not looked at.
    while (!bytes.empty() && out.size() < 2 * kMaxTextBytes) {
        appendStorable(out, take(bytes));
    }
    return std::string(trimmed(cutAtCharacter(trimmed(out), kMaxTextBytes)));
}

std::string titleOfPath(std::string_view path) {
    const auto name = path.substr(path.rfind('/') + 1);
    auto title = storableText(name.substr(0, name.rfind('.')));
    if (title.empty()) {
        title = storableText(name);
    }
    return title.empty() ? "?" : title;
}

std::string printable(std::string_view bytes) {
    if (isPlainAscii(bytes)) {
        return std::string(bytes);
    }
    std::string out;
    while (!bytes.empty()) {
        const auto taken = take(bytes);
        if (taken.valid && !isControl(taken.character)) {
            out.append(taken.bytes);
        } else if (taken.character == U'\n') {
            out.append("\\n");
        } else {
            appendEscaped(out, taken.bytes);
        }
    }
    return out;
}

bool isUtf8(std::string_view bytes) {
    while (!bytes.empty()) {
        if (!take(bytes).valid) {
            return false;
        }
    }
    return true;
}

}  // namespace zano::index
