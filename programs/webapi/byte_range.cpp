#include "byte_range.h"

#include <strings.h>
#include <algorithm>
#include <charconv>
#include <limits>

namespace webapi {

namespace {

constexpr std::string_view kUnit = "bytes=";
constexpr ByteRange kAll{Wanted::kWhole, 0, 0};

bool isNumber(std::string_view text) {
    return std::all_of(text.begin(), text.end(), [](char c) { return c >= '0' && c <= '9'; });
}

/* Of digits; what is too large for the type is its largest value. */
std::int64_t numberOf(std::string_view digits) {
    std::int64_t number = 0;
    const auto result = std::from_chars(digits.data(), digits.data() + digits.size(), number);
    return result.ec == std::errc() ? number : std::numeric_limits<std::int64_t>::max();
}

std::string_view withoutBlanks(std::string_view text) {
    while (!text.empty() && (text.front() == ' ' || text.front() == '\t')) {
        text.remove_prefix(1);
    }
    while (!text.empty() && (text.back() == ' ' || text.back() == '\t')) {
        text.remove_suffix(1);
    }
    return text;
}

/* The last `count` bytes. */
ByteRange suffixOf(std::int64_t count, std::int64_t size) {
    if (count == 0 || size == 0) {
        return {Wanted::kNothing, 0, 0};
    }
    return {Wanted::kPart, std::max<std::int64_t>(size - count, 0), size - 1};
}

}  // namespace

ByteRange byteRangeOf(std::string_view range, std::int64_t size) {
    if (range.size() < kUnit.size() || strncasecmp(range.data(), kUnit.data(), kUnit.size()) != 0) {
        return kAll;
    }
    const std::string_view bounds = withoutBlanks(range.substr(kUnit.size()));
    const std::size_t dash = bounds.find('-');
    if (dash == std::string_view::npos) {
        return kAll;
    }
    const std::string_view first = bounds.substr(0, dash);
    const std::string_view last = bounds.substr(dash + 1);
    if (!isNumber(first) || !isNumber(last) || (first.empty() && last.empty())) {
        return kAll;  // several ranges too: the comma is no digit
    }
    if (first.empty()) {
        return suffixOf(numberOf(last), size);
    }
    const std::int64_t begin = numberOf(first);
    const std::int64_t end = last.empty() ? size - 1 : std::min(numberOf(last), size - 1);
    if (!last.empty() && numberOf(last) < begin) {
        return kAll;
    }
    if (begin >= size) {
        return {Wanted::kNothing, 0, 0};
    }
    return {Wanted::kPart, begin, end};
}

}  // namespace webapi
