/* The playlist formats: one row each. */
#pragma once

#include <array>
#include <string_view>

#include "playlist.h"

namespace zano::playlists {

struct Format {
    std::string_view name;
    std::array<std::string_view, 2> suffixes;  // in small letters, without the dot; may be ""
    /* Whether a text begins as only this format does. */
    bool (*isBegunBy)(std::string_view text);
    /* Appends the entries of a text, which outlives them. Throws PlaylistError when the text is
     * not of this format at all; damage costs the entries that it is in and no others. */
    void (*read)(std::string_view text, Playlist &playlist);
};

/* Reads a text of any format. The text decides where it begins as one format does, since
 * servers and people name files wrongly; else the suffix of the path does. A text of blanks is an
 * empty playlist. Throws PlaylistError. */
void readPlaylist(std::string_view text, std::string_view path, Playlist &playlist);

bool isM3uBegunBy(std::string_view text);
void readM3u(std::string_view text, Playlist &playlist);
bool isPlsBegunBy(std::string_view text);
void readPls(std::string_view text, Playlist &playlist);
bool isWplBegunBy(std::string_view text);
void readWpl(std::string_view text, Playlist &playlist);

}  // namespace zano::playlists
