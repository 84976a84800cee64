#include "text.h"

#include <algorithm>
#include <charconv>
#include <climits>
#include <cmath>
#include <optional>

namespace zano::playlists {
namespace {

/* 0x80 to 0x9F; five of them are not assigned and stay control characters. */
constexpr std::array<char16_t, 32> kWindows1252 = {
    0x20AC, 0x0081, 0x201A, 0x0192, 0x201E, 0x2026, 0x2020, 0x2021, 0x02C6, 0x2030, 0x0160,
    0x2039, 0x0152, 0x008D, 0x017D, 0x008F, 0x0090, 0x2018, 0x2019, 0x201C, 0x201D, 0x2022,
    0x2013, 0x2014, 0x02DC, 0x2122, 0x0161, 0x203A, 0x0153, 0x009D, 0x017E, 0x0178};

constexpr char lower(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

constexpr bool isHighByte(char c) {
    return (static_cast<unsigned char>(c) & 0x80) != 0;
}

void append(std::string &text, char32_t character) {
    if (character < 0x80) {
        text.push_back(static_cast<char>(character));  // NUL too, which ends lines
    } else {
        text.append(characterText(character));
    }
}

struct Utf16 {
    std::string_view bytes;
    bool isBigEndian;

    std::size_t size() const { return bytes.size() / 2; }
    char32_t unit(std::size_t index) const {
        const auto first = static_cast<unsigned char>(bytes[2 * index]);
        const auto second = static_cast<unsigned char>(bytes[2 * index + 1]);
        return isBigEndian ? first * 256U + second : second * 256U + first;
    }

    std::string utf8() const {
        std::string text;
        text.reserve(size() + size() / 8);
        for (std::size_t i = 0; i < size(); ++i) {
            char32_t character = unit(i);
            const bool isSurrogate = character >= 0xD800 && character < 0xE000;
            const char32_t low = isSurrogate && i + 1 < size() ? unit(i + 1) : 0;
            if (isSurrogate && character < 0xDC00 && low >= 0xDC00 && low < 0xE000) {
                character = 0x10000 + ((character - 0xD800) << 10) + (low - 0xDC00);
                ++i;
            } else if (isSurrogate) {
                character = 0xFFFD;
            }
            append(text, character);
        }
        return text;
    }
};

std::optional<Utf16> asUtf16(std::string_view bytes) {
    if (bytes.substr(0, 2) == "\xFF\xFE") {
        return Utf16{bytes.substr(2), false};
    }
    if (bytes.substr(0, 2) == "\xFE\xFF") {
        return Utf16{bytes.substr(2), true};
    }
    const auto isZero = [&bytes](std::size_t at) { return bytes[at] == '\0'; };
    if (bytes.size() >= 4 && isZero(0) == isZero(2) && isZero(1) == isZero(3) &&
        isZero(0) != isZero(1)) {
        return Utf16{bytes, isZero(0)};
    }
    return std::nullopt;
}

}  // namespace

std::string_view fileText(std::string_view bytes, std::string &converted) {
    if (const auto utf16 = asUtf16(bytes)) {
        converted = utf16->utf8();
        return converted;
    }
    constexpr std::string_view kBom = "\xEF\xBB\xBF";
    return bytes.substr(0, kBom.size()) == kBom ? bytes.substr(kBom.size()) : bytes;
}

bool isAscii(std::string_view text) {
    return std::none_of(text.begin(), text.end(), isHighByte);
}

std::string fromWindows1252(std::string_view text) {
    std::string utf8;
    utf8.reserve(text.size() + text.size() / 8);
    for (const char c : text) {
        const auto byte = static_cast<unsigned char>(c);
        append(utf8, byte >= 0x80 && byte < 0xA0 ? kWindows1252.at(byte - 0x80U) : byte);
    }
    return utf8;
}

bool equalsIgnoringCase(std::string_view a, std::string_view b) {
    return std::equal(a.begin(), a.end(), b.begin(), b.end(),
                      [](char x, char y) { return lower(x) == lower(y); });
}

bool startsIgnoringCase(std::string_view text, std::string_view start) {
    return equalsIgnoringCase(text.substr(0, start.size()), start);
}

std::size_t findIgnoringCase(std::string_view text, std::string_view part) {
    const auto *at = std::search(text.begin(), text.end(), part.begin(), part.end(),
                                 [](char x, char y) { return lower(x) == y; });
    return at == text.end() ? std::string_view::npos : static_cast<std::size_t>(at - text.begin());
}

std::string_view trimmed(std::string_view text) {
    const auto isBlank = [](char c) { return static_cast<unsigned char>(c) <= ' '; };
    while (!text.empty() && isBlank(text.front())) {
        text.remove_prefix(1);
    }
    while (!text.empty() && isBlank(text.back())) {
        text.remove_suffix(1);
    }
    return text;
}

int leadingInteger(std::string_view text) {
    text = trimmed(text);
    int number = 0;
    const auto result = std::from_chars(text.data(), text.data() + text.size(), number);
    if (result.ec == std::errc::result_out_of_range) {
        return text.front() == '-' ? INT_MIN : INT_MAX;
    }
    return number;
}

double leadingNumber(std::string_view text) {
    text = trimmed(text);
    double number = 0;
    const auto result =
        std::from_chars(text.data(), text.data() + text.size(), number, std::chars_format::fixed);
    return result.ec == std::errc() && std::isfinite(number) ? number : 0;
}

bool Lines::next(std::string_view &line) {
    if (at_ >= text_.size()) {
        return false;
    }
    std::size_t end = text_.size();
    for (std::size_t kind = 0; kind < kEnds.size(); ++kind) {
        if (!isStarted_ || nextEnd_.at(kind) < at_) {
            nextEnd_.at(kind) = std::min(text_.find(kEnds.at(kind), at_), text_.size());
        }
        end = std::min(end, nextEnd_.at(kind));
    }
    isStarted_ = true;
    line = text_.substr(at_, end - at_);
    const bool isPair = text_.substr(end, 2) == "\r\n";
    at_ = end + (isPair ? 2 : 1);
    return true;
}

}  // namespace zano::playlists
