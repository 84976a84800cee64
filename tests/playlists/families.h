/* The edits that stand twice in the library. */
#pragma once

#include <vorelix/playlists/playlist.h>

#include <ostream>

namespace playlists {

/* The edits of shared playlists by id, and of personal ones by path. */
struct Family {
    bool isShared;
    int (*removeSongs)(const char *playlist, const char *selection);
    int (*updateSongs)(const char *playlist, ZANO_PLAYLIST_REC *records, int start, int count);
    int (*appendSongs)(const char *playlist, ZANO_PLAYLIST_REC *records, int recordCount);
    int (*removeMissing)(const char *playlist);
};
inline std::ostream &operator<<(std::ostream &out, const Family &family) {
    return out << (family.isShared ? "Shared" : "Personal");
}
inline constexpr Family kFamilies[] = {
    {true, ZANOPlaylistRemoveSongs, ZANOPlaylistUpdateSongs, ZANOPlaylistAppendSongs,
     ZANOPlaylistRemoveMissing},
    {false, ZANOPersonalPlaylistRemoveSongs, ZANOPersonalPlaylistUpdateSongs,
     ZANOPersonalPlaylistAppendSongs, ZANOPersonalPlaylistRemoveMissing},
};

}  // namespace playlists
