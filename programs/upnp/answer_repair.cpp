#include "answer_repair.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <charconv>
#include <utility>

#include "text.h"

namespace vorelix {

namespace {

constexpr std::array<std::pair<std::string_view, char>, 5> kEntities{
    {{"&lt;", '<'}, {"&gt;", '>'}, {"&quot;", '"'}, {"&apos;", '\''}, {"&amp;", '&'}}};

bool isAllowed(unsigned long character) {
    constexpr unsigned long kFirstPrintable = 0x20;
    constexpr unsigned long kSurrogates = 0xD800;
    constexpr unsigned long kPrivate = 0xE000;
    constexpr unsigned long kNone = 0xFFFE;
    constexpr unsigned long kNextPlane = 0x10000;
    constexpr unsigned long kLast = 0x10FFFF;
    return character == '\t' || character == '\n' || character == '\r' ||
           (character >= kFirstPrintable && character < kSurrogates) ||
           (character >= kPrivate && character < kNone) ||
           (character >= kNextPlane && character <= kLast);
}

/* "&#39;" or "&#x27;" at the start: its length, 0 when there is none. */
std::size_t numericReference(std::string_view text, unsigned long &character) {
    if (!text.starts_with("&#")) {
        return 0;
    }
    const bool isHexadecimal = text.starts_with("&#x");
    const char *const first = text.data() + (isHexadecimal ? 3 : 2);
    const char *const last = text.data() + text.size();
    const auto [end, error] =
        std::from_chars(std::min(first, last), last, character, isHexadecimal ? 16 : 10);
    const bool isWhole = error == std::errc() && end != last && *end == ';';
    return isWhole ? static_cast<std::size_t>(end + 1 - text.data()) : 0;
}

bool isEntity(std::string_view text) {
    return std::any_of(kEntities.begin(), kEntities.end(),
                       [&](const auto &row) { return text.starts_with(row.first); });
}

/* Appends what should stand for the "&" at the start; how much of the text that is. */
std::size_t takeAmpersand(std::string_view text, std::string &out) {
    unsigned long character = 0;
    const std::size_t length = numericReference(text, character);
    if (length > 0) {
        out.append(isAllowed(character) ? text.substr(0, length) : std::string_view());
        return length;
    }
    out += isEntity(text) ? "&" : "&amp;";
    return 1;
}

/* The length of markup at the start that has no place inside a document, 0 when there is none. */
std::size_t misplaced(std::string_view text) {
    constexpr std::array<std::pair<std::string_view, std::string_view>, 4> kMisplaced{
        {{"<?xml ", "?>"}, {"<!DOCTYPE", ">"}, {"<![CDATA[", ""}, {"]]>", ""}}};
    for (const auto &[start, end] : kMisplaced) {
        const std::size_t place = text.starts_with(start) ? text.find(end) : text.npos;
        if (place != text.npos) {
            return std::max(place + end.size(), start.size());
        }
    }
    return 0;
}

bool beginsMarkup(std::string_view text) {
    const auto next = static_cast<unsigned char>(text.size() > 1 ? text[1] : ' ');
    return std::isalpha(next) != 0 || next == '_' || next == '/' || next == '!' || next == '?';
}

std::size_t takeOne(std::string_view text, std::string &out) {
    const std::size_t left = misplaced(text);
    if (left > 0) {
        return left;
    }
    if (text.front() == '&') {
        return takeAmpersand(text, out);
    }
    if (text.front() == '<' && !beginsMarkup(text)) {
        out += "&lt;";
    } else if (isAllowed(static_cast<unsigned char>(text.front()))) {
        out += text.front();
    }
    return 1;
}

std::string unescaped(std::string_view text) {
    std::string out;
    out.reserve(text.size());
    while (!text.empty()) {
        const auto *const row =
            std::find_if(kEntities.begin(), kEntities.end(),
                         [&](const auto &r) { return text.starts_with(r.first); });
        out += row != kEntities.end() ? row->second : text.front();
        text.remove_prefix(row != kEntities.end() ? row->first.size() : 1);
    }
    return out;
}

/* The place behind the name of an element that begins here, npos when none does. */
std::size_t behindName(std::string_view text, std::string_view name) {
    const bool isThere = text.substr(1).starts_with(name) && text.size() > name.size() + 1 &&
                         std::string_view(" \t\r\n/>").find(text[name.size() + 1]) != text.npos;
    return isThere ? name.size() + 1 : text.npos;
}

}  // namespace

std::string repaired(std::string_view text) {
    const std::string valid = validUtf8(text.substr(0, text.find('\0')));
    const bool isEscaped =
        valid.find("<DIDL-Lite") == valid.npos && valid.find("&lt;DIDL-Lite") != valid.npos;
    const std::string source = isEscaped ? unescaped(valid) : valid;
    std::string out;
    out.reserve(source.size());
    const std::size_t first = source.find('<');
    for (std::string_view rest = std::string_view(source).substr(std::min(first, source.size()));
         !rest.empty();) {
        rest.remove_prefix(takeOne(rest, out));
    }
    return out;
}

std::vector<std::string> objectTexts(std::string_view text) {
    std::vector<std::string> objects;
    for (std::size_t place = text.find('<'); place != text.npos;
         place = text.find('<', place + 1)) {
        for (const std::string_view name : {"item", "container"}) {
            const std::string_view rest = text.substr(place);
            if (behindName(rest, name) == text.npos) {
                continue;
            }
            const std::string close = "</" + std::string(name) + ">";
            const std::size_t end = rest.find(close);
            if (end != text.npos) {
                objects.emplace_back(rest.substr(0, end + close.size()));
            }
        }
    }
    return objects;
}

}  // namespace vorelix
