#include <zanoplatform/settings.h>
#include <algorithm>
#include <array>
#include <fstream>
#include <string_view>

#include "system_paths_internal.h"

namespace {

/* More than any sane settings file; what lies beyond is not read. */
constexpr size_t kMaxBytes = 1 << 20;

std::string_view trimmed(std::string_view text) {
    constexpr std::string_view kSpaces = " \t\r";
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

ZanoConf::ZanoConf() {
    /* What cannot be read, a folder of that name included, leaves the stream failed and adds
     * nothing. */
    std::ifstream file(ZANO_PATH_CONF, std::ios::binary);
    std::array<char, 4096> piece{};
    while (file && text_.size() < kMaxBytes) {
        file.read(piece.data(), piece.size());
        text_.append(piece.data(), static_cast<size_t>(file.gcount()));
    }
}

std::string ZanoConf::Info(const std::string &key, const std::string &fallback) const {
    std::string value = fallback;
    std::string_view rest(text_);
    while (!rest.empty()) {
        const size_t end = std::min(rest.find('\n'), rest.size());
        const std::string_view line = trimmed(rest.substr(0, end));
        rest.remove_prefix(std::min(end + 1, rest.size()));
        const size_t equals = line.find('=');
        if (equals == std::string_view::npos || line.front() == '#') {
            continue;
        }
        if (trimmed(line.substr(0, equals)) == key) {
            value = unquoted(trimmed(line.substr(equals + 1)));
        }
    }
    return value;
}
