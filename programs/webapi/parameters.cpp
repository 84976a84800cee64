#include "parameters.h"

#include <algorithm>
#include <charconv>
#include <string_view>

#include "refusal.h"
#include "text.h"

namespace webapi {

namespace {

/* The byte of "%C3", or -1. */
int escapedByte(std::string_view text) {
    constexpr int kHexadecimal = 16;
    unsigned char byte = 0;
    if (text.size() < 3 || text[0] != '%') {
        return -1;
    }
    const auto [end, error] = std::from_chars(&text[1], text.data() + 3, byte, kHexadecimal);
    return error == std::errc() && end == text.data() + 3 ? byte : -1;
}

std::string decoded(std::string_view text) {
    std::string out;
    out.reserve(text.size());
    for (std::size_t at = 0; at < text.size(); ++at) {
        const int byte = escapedByte(text.substr(at, 3));
        if (byte >= 0) {
            out += static_cast<char>(byte);
            at += 2;
        } else {
            out += text[at] == '+' ? ' ' : text[at];
        }
    }
    return out;
}

bool isText(const std::string &text) {
    return text.find('\0') == std::string::npos && vorelix::validUtf8(text) == text;
}

/* Takes what stands in front of a sign away, with the sign. */
std::string_view takeUpTo(char sign, std::string_view &text) {
    const std::size_t length = std::min(text.find(sign), text.size());
    const std::string_view taken = text.substr(0, length);
    text.remove_prefix(std::min(length + 1, text.size()));
    return taken;
}

}  // namespace

void Parameters::add(std::string_view form) {
    std::string bad;
    while (!form.empty()) {
        std::string_view value = takeUpTo('&', form);
        if (value.empty()) {
            continue;
        }
        const std::string name = decoded(takeUpTo('=', value));
        std::string text = decoded(value);
        if (!isText(name)) {
            bad = "query";
        } else if (!isText(text)) {
            bad = name;
        } else {
            values_.insert_or_assign(name, std::move(text));
        }
    }
    if (!bad.empty()) {
        throw Refusal(kBadRequest, bad);
    }
}

const std::string *Parameters::find(std::string_view name) const {
    const auto found = values_.find(name);
    return found != values_.end() ? &found->second : nullptr;
}

void Parameters::refuse(const char *name, int line) {
    throw Refusal(kBadRequest, name, {}, line);
}

std::string Parameters::text(const char *name, std::size_t mostBytes) const {
    const std::string *value = find(name);
    if (value != nullptr && value->size() > mostBytes) {
        refuse(name);
    }
    return value != nullptr ? *value : "";
}

int Parameters::number(const char *name, Bounds bounds) const {
    const std::string *value = find(name);
    int number = 0;
    if (value == nullptr || !readNumber(*value, bounds, number)) {
        refuse(name);
    }
    return number;
}

int Parameters::numberOr(int otherwise, const char *name, Bounds bounds) const {
    return has(name) ? number(name, bounds) : otherwise;
}

std::vector<int> Parameters::numbers(const char *name, Bounds bounds) const {
    std::vector<int> numbers;
    const std::string *value = find(name);
    std::string_view rest = value != nullptr ? std::string_view(*value) : std::string_view();
    if (rest.ends_with(',')) {
        refuse(name);
    }
    while (!rest.empty()) {
        int number = 0;
        if (!readNumber(takeUpTo(',', rest), bounds, number) || numbers.size() == kMostNumbers) {
            refuse(name);
        }
        numbers.push_back(number);
    }
    return numbers;
}

bool readNumber(std::string_view text, Bounds bounds, int &number) {
    const char *const end = text.data() + text.size();
    const auto [rest, error] = std::from_chars(text.data(), end, number);
    return error == std::errc() && rest == end && text.front() != '-' && number >= bounds.least &&
           number <= bounds.most;
}

}  // namespace webapi
