#include <zanoplatform/settings.h>
#include <array>
#include <fstream>
#include <string_view>

#include "settings/key_value_line.h"
#include "system_paths_internal.h"

namespace {

/* More than any sane settings file; what lies beyond is not read. */
constexpr size_t kMaxBytes = 1 << 20;

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
        const auto line = zano::settings::readKeyValue(zano::settings::takeLine(rest));
        if (line && line->key == key) {
            value = line->value;
        }
    }
    return value;
}
