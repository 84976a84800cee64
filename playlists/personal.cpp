#include <glob.h>
#include <sys/stat.h>
#include <vorelix/playlists/playlist.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>

#include "bounded_text_internal.h"
#include "edit_internal.h"
#include "edit_messages_internal.h"
#include "log_internal.h"
#include "playlists_internal.h"

using vorelix::BoundedText;
using vorelix::LogMessage;
using namespace vorelix::playlist;

namespace {

constexpr LogMessage<const char *> kListNotAPath{kUnit, "%s:%d %s is not a valid path", 1349};
constexpr LogMessage<const char *> kListNotAName{kUnit, "%s:%d %s is not a valid filename", 1354};
constexpr LogMessage<> kListNoNode{kUnit, "%s:%d failed to calloc memory", 1360};

/* The personal playlists of a directory, sorted by name. */
class Matches {
  public:
    explicit Matches(const char *directory) {
        BoundedText<4096> pattern;
        pattern.append(directory, "/playlists/*.m3u");
        result_ = glob(pattern.text(), 0, nullptr, &found_);
    }
    ~Matches() { globfree(&found_); }
    Matches(const Matches &) = delete;
    Matches &operator=(const Matches &) = delete;

    bool isOutOfMemory() const { return result_ == GLOB_NOSPACE; }
    std::size_t count() const { return result_ == 0 ? found_.gl_pathc : 0; }
    const char *path(std::size_t index) const { return found_.gl_pathv[index]; }

  private:
    glob_t found_{};
    int result_;
};

bool canBeExamined(const char *path) {
    struct stat status {};
    return stat(path, &status) == 0;
}

void fill(ZANO_PLAYLIST &node, int id, const char *path, std::string_view title) {
    node.id = id;
    vorelix::writeText(node.path, sizeof node.path, path);
    title.copy(node.title, sizeof node.title - 1);
    title.copy(node.album, sizeof node.album - 1);
}

/* Pushes a node for a match at the head of the list. */
bool take(const char *path, int id, PlaylistList &list) {
    if (!canBeExamined(path)) {
        return false;
    }
    const char *const slash = std::strrchr(path, '/');
    if (slash == nullptr) {
        kListNotAPath(path);
        return false;
    }
    const char *const name = slash + 1;
    const char *const dot = std::strrchr(name, '.');
    if (dot == nullptr) {
        kListNotAName(name);
        return false;
    }
    if (!pushNode(list)) {
        kListNoNode();
        return false;
    }
    fill(*list, id, path, {name, static_cast<std::size_t>(dot - name)});
    return true;
}

/* The number of matches taken, the last one at the head of the list; -1 when one of them could not
 * be. */
int takePage(const Matches &matches, int offset, int limit, PlaylistList &list) {
    const std::size_t first = static_cast<std::size_t>(std::max(offset, 0));
    const std::size_t end = limit > 0
                                ? std::min(matches.count(), first + static_cast<std::size_t>(limit))
                                : matches.count();
    int taken = 0;
    for (std::size_t index = first; index < end; ++index) {
        if (!take(matches.path(index), taken + 1, list)) {
            return -1;
        }
        ++taken;
    }
    return taken;
}

}  // namespace

int ZANOPersonalPlaylistListAll(const char *directory, ZANO_PLAYLIST **list, int offset,
                                int limit) {
    if (directory == nullptr || list == nullptr) {
        return -1;
    }
    const Matches matches(directory);
    if (matches.isOutOfMemory()) {
        return -1;
    }
    if (matches.count() == 0) {
        return 0;
    }
    PlaylistList playlists(*list);
    const int taken = takePage(matches, offset, limit, playlists);
    *list = playlists.release();
    // Intended and kept: after a failure it stays in reverse.
    if (taken != -1) {
        *list = PlaylistReverse(*list);
    }
    return taken;
}

int ZANOPersonalPlaylistTotalGet(const char *directory) {
    if (directory == nullptr) {
        return -1;
    }
    const Matches matches(directory);
    if (matches.isOutOfMemory()) {
        return -1;
    }
    for (std::size_t index = 0; index < matches.count(); ++index) {
        if (!canBeExamined(matches.path(index))) {
            return -1;
        }
    }
    return static_cast<int>(matches.count());
}

int ZANOPersonalPlaylistAppendSongs(const char *path, ZANO_PLAYLIST_REC *records, int recordCount) {
    if (path == nullptr || records == nullptr) {
        kPersonalMessages.append.badParameter();
        return -1;
    }
    return appendSongs({nullptr, path}, records, recordCount, kPersonalMessages.append);
}

int ZANOPersonalPlaylistRemoveSongs(const char *path, const char *selection) {
    if (path == nullptr || selection == nullptr) {
        kPersonalMessages.removal.badParameter();
        return -1;
    }
    return removeSongs({nullptr, path}, selection, kPersonalMessages.removal);
}

int ZANOPersonalPlaylistRemoveMissing(const char *path) {
    if (path == nullptr) {
        kPersonalMessages.missing.badParameter();
        return -1;
    }
    return removeMissing({nullptr, path}, kPersonalMessages.missing);
}

int ZANOPersonalPlaylistUpdateSongs(const char *path, ZANO_PLAYLIST_REC *records, int start,
                                    int count) {
    if (path == nullptr || records == nullptr) {
        kPersonalMessages.update.badParameter();
        return -1;
    }
    return updateSongs({nullptr, path}, records, start, count, kPersonalMessages.update);
}
