#include <strings.h>

#include <algorithm>
#include <climits>
#include <cstdlib>
#include <cstring>
#include <string_view>

#include "ipod_internal.h"

namespace vorelix::ipod {
namespace {

struct KeyName {
    std::string_view name;
    Key key;
};
constexpr std::array<KeyName, 7> kKeyNames{{{"#title", Key::Title},
                                            {"#artist", Key::Artist},
                                            {"#album", Key::Album},
                                            {"#genre", Key::Genre},
                                            {"#duration", Key::Duration},
                                            {"#bitrate", Key::Bitrate},
                                            {"#frequency", Key::Frequency}}};

}  // namespace

char *Lines::next() {
    char *line = nullptr;
    do {
        line = std::fgets(line_.data(), static_cast<int>(line_.size()), file_.get());
    } while (line != nullptr && (*line == '\r' || *line == '\n'));
    return line;
}

Key keyOf(const char *line) {
    // Intended and kept: a longer word that begins with a key is that key.
    const auto *const found =
        std::find_if(kKeyNames.begin(), kKeyNames.end(), [line](const KeyName &each) {
            return strncasecmp(line, each.name.data(), each.name.size()) == 0;
        });
    return found != kKeyNames.end() ? found->key : Key::None;
}

char *valueOf(char *line) {
    constexpr std::string_view kSeparator = ": ";
    char *const separator = std::strstr(line, kSeparator.data());
    return separator != nullptr ? separator + kSeparator.size() : line + std::strlen(line);
}

int numberIn(const char *text, int factor) {
    constexpr int kDecimal = 10;
    const long long number =
        std::clamp<long long>(std::strtoll(text, nullptr, kDecimal), INT_MIN, INT_MAX);
    return static_cast<int>(std::clamp<long long>(number * factor, INT_MIN, INT_MAX));
}

char *textField(Key key, ZANO_MEDIA_INFO &info) {
    switch (key) {
        case Key::Title:
            return info.title;
        case Key::Artist:
            return info.artist;
        case Key::Album:
            return info.album;
        case Key::Genre:
            return info.genre;
        default:
            return nullptr;
    }
}

}  // namespace vorelix::ipod
