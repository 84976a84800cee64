#include <vorelix/playlists/playlist.h>

#include <cstddef>
#include <string_view>

#include "bounded_text_internal.h"
#include "log_internal.h"
#include "playlists_internal.h"

using vorelix::BoundedText;

namespace {

constexpr vorelix::LogMessage<> kBadParameters{vorelix::playlist::kUnit, "%s (%d) Bad parameters.",
                                               1222};

constexpr std::string_view kStep = "/..";

}  // namespace

int ZANOPathRelativeToABS(const char *path, char *out, int size) {
    if (path == nullptr || out == nullptr || size <= 0) {
        kBadParameters();
        return -1;
    }
    BoundedText<4096> work;
    work.append(path);
    const std::string_view text = work.text();
    const std::size_t step = text.find(kStep);
    if (step == std::string_view::npos) {
        vorelix::writeText(out, size, path);
        return 0;
    }
    // Without a '/' in front of the step nothing is taken from the path: npos keeps all of it.
    const std::string_view before = text.substr(0, step);
    BoundedText<4096> shorter;
    shorter.append(before.substr(0, before.rfind('/')), text.substr(step + kStep.size()));
    vorelix::writeText(out, size, shorter.text());
    return 0;
}
