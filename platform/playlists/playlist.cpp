#include "playlist.h"

#include <algorithm>

namespace zano::playlists {

std::string_view TextStore::keep(std::initializer_list<std::string_view> pieces) {
    std::size_t size = 0;
    for (const std::string_view piece : pieces) {
        size += piece.size();
    }
    char *const text = static_cast<char *>(memory_.allocate(size, 1));
    char *end = text;
    for (const std::string_view piece : pieces) {
        end = std::copy(piece.begin(), piece.end(), end);
    }
    return {text, size};
}

Entry &Playlist::add(std::string_view location, const Tags &tags) {
    if (entries.size() == kMaxEntries) {
        throw PlaylistError(KLIB_ERR_PLAYLIST_TOO_LARGE, "more than 1000000 entries");
    }
    Entry &entry = entries.emplace_back();
    entry.location = location;
    entry.tags = tags;
    return entry;
}

}  // namespace zano::playlists
