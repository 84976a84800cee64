#include <glob.h>
#include <sys/stat.h>
#include <unistd.h>
#include <vorelix/ipod/ipod.h>
#include <vorelix/playlists/playlist.h>

#include <array>
#include <cstddef>
#include <cstdlib>
#include <memory>
#include <string_view>

#include "bounded_text_internal.h"
#include "ipod_internal.h"
#include "log_internal.h"
#include "media_rows_internal.h"
#include "system_paths_internal.h"

using vorelix::LogMessage;
using vorelix::ipod::kUnit;

namespace {

constexpr LogMessage<> kBadParameter{kUnit, "%s (%d) Bad parameter.", 451};
constexpr LogMessage<> kNoCurrentDirectory{kUnit, "%s (%d) Failed to get current directory", 457};
constexpr LogMessage<int> kNoNode{kUnit, "%s (%d) Failed to alloc %d", 481};

constexpr std::string_view kTrackList = "tracks.m3u";

struct FreePlaylists {
    void operator()(ZANO_PLAYLIST *list) const { ZANOPlayListFree(list); }
};
using PlaylistList = std::unique_ptr<ZANO_PLAYLIST, FreePlaylists>;

/* The names with a dot in the working directory, sorted. */
class Names {
  public:
    Names() : result_(glob("*.*", 0, nullptr, &found_)) {}
    ~Names() { globfree(&found_); }
    Names(const Names &) = delete;
    Names &operator=(const Names &) = delete;

    std::size_t count() const { return result_ == 0 ? found_.gl_pathc : 0; }
    const char *name(std::size_t index) const { return found_.gl_pathv[index]; }

  private:
    glob_t found_{};
    int result_;
};

bool isFolder(const char *path) {
    struct stat status {};
    return stat(path, &status) == 0 && S_ISDIR(status.st_mode);
}

bool isPlaylist(const char *name) {
    struct stat status {};
    return stat(name, &status) == 0 && S_ISREG(status.st_mode) && name != kTrackList;
}

bool push(std::string_view name, PlaylistList &list) {
    auto *const node = static_cast<ZANO_PLAYLIST *>(std::calloc(1, sizeof(ZANO_PLAYLIST)));
    if (node == nullptr) {
        // Intended and kept: the size of a track's record.
        kNoNode(vorelix::kNodeSize);
        return false;
    }
    vorelix::BoundedText<sizeof node->path> path;
    path.append(ZANO_PATH_IPOD_FOLDER, name);
    vorelix::writeText(node->path, sizeof node->path, path.text());
    name.substr(0, name.rfind('.')).copy(node->title, sizeof node->title - 1);
    node->next = list.release();
    list.reset(node);
    return true;
}

bool takePlaylists(PlaylistList &list) {
    const Names names;
    for (std::size_t index = 0; index < names.count(); ++index) {
        if (isPlaylist(names.name(index)) && !push(names.name(index), list)) {
            return false;
        }
    }
    return true;
}

}  // namespace

int ZANOIPodPlaylistGetAll(ZANO_PLAYLIST **list) {
    if (list == nullptr) {
        kBadParameter();
        return -1;
    }
    *list = nullptr;
    std::array<char, 4096> former;
    if (getcwd(former.data(), former.size()) == nullptr) {
        kNoCurrentDirectory();
        return -1;
    }
    if (!isFolder(ZANO_PATH_IPOD_FOLDER) || chdir(ZANO_PATH_IPOD_FOLDER) != 0) {
        return -1;
    }
    PlaylistList playlists;
    if (!takePlaylists(playlists)) {
        // Intended and kept: the working directory stays the folder.
        return -1;
    }
    *list = PlaylistReverse(playlists.release());
    // A folder that is gone meanwhile is nowhere to go back to.
    [[maybe_unused]] const int result = chdir(former.data());
    return 0;
}
