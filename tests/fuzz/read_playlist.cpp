#include <cstring>
#include <string>

#include "playlists/format.h"
#include "playlists/locations.h"
#include "playlists/text.h"
#include "readers.h"

namespace vorelix::fuzz {
namespace {

using namespace zano::playlists;

bool isPath(std::string_view path) {
    return !path.empty() && path.front() == '/' && path.find('\0') == std::string_view::npos;
}

void check(Playlist &playlist, std::string_view folder) {
    const Locations locations(folder, playlist.texts);
    for (const Entry &entry : playlist.entries) {
        require(!entry.location.empty());
        require(entry.tagsSharedWith <= playlist.entries.size());
        if (isWebAddress(entry.location)) {
            continue;
        }
        const std::string_view path = locations.path(entry.location);
        require(isPath(path));
        for (const std::string &other : locations.otherPaths(entry)) {
            require(isPath(other) && other != path);
        }
        require(zano::isUtf8(fromWindows1252(entry.tags.title)));
    }
}

}  // namespace

void readAsPlaylist(const std::uint8_t *bytes, std::size_t size) {
    const std::string_view all(reinterpret_cast<const char *>(bytes), size);
    for (const char *name : {"/m/a.m3u", "/m/a.pls", "/m/a.wpl", "/m/a"}) {
        std::string converted;
        Playlist playlist;
        try {
            readPlaylist(fileText(all, converted), name, playlist);
        } catch (const PlaylistError &error) {
            require(std::strlen(error.what()) > 0);
        }
        check(playlist, "/m");
        check(playlist, "");
    }
}

}  // namespace vorelix::fuzz
