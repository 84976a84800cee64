#include "settings/key_value_line.h"

#include <algorithm>

namespace zano::settings {
namespace {

std::string_view trimmed(std::string_view text) {
    constexpr std::string_view kSpaces = " \t\r\n";
    const size_t first = text.find_first_not_of(kSpaces);
    if (first == std::string_view::npos) {
        return {};
    }
    return text.substr(first, text.find_last_not_of(kSpaces) - first + 1);
}

std::string_view unquoted(std::string_view text) {
    if (text.size() >= 2 && text.front() == '"' && text.back() == '"') {
        return text.substr(1, text.size() - 2);
    }
    return text;
}

}  // namespace

std::string_view takeLine(std::string_view &text) {
    const std::string_view line = text.substr(0, std::min(text.find('\n'), text.size() - 1) + 1);
    text.remove_prefix(line.size());
    return line;
}

std::optional<KeyValue> readKeyValue(std::string_view line) {
    line = trimmed(line);
    const size_t equals = line.find('=');
    if (equals == std::string_view::npos || line.front() == '#') {
        return std::nullopt;
    }
    return KeyValue{trimmed(line.substr(0, equals)), unquoted(trimmed(line.substr(equals + 1)))};
}

}  // namespace zano::settings
