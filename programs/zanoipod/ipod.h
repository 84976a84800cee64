/* What an iPod has, read with libgpod. */
#pragma once

#include <cstddef>
#include <string>
#include <vector>

namespace zano::ipod {

/* Texts are UTF-8 of any length; numbers are 0 where the iPod does not tell. */
struct Track {
    std::string title;
    std::string artist;
    std::string album;
    std::string genre;
    int seconds = 0;
    int kilobits = 0;  // per second
    int hertz = 0;
    std::string path;  // of a file that is there; absolute
};

struct Playlist {
    std::string name;
    std::vector<std::size_t> tracks;  // indexes into Contents::tracks
};

struct Contents {
    std::vector<Track> tracks;
    std::vector<Playlist> playlists;   // without the master playlist, which is all tracks
    std::vector<std::string> missing;  // titles of tracks whose files are not there; in no list
};

/* Reads the iPod, or the copy of its file tree, at a folder. Throws std::runtime_error when there
 * is none, or when it is damaged. */
Contents readIPod(const std::string &folder);

}  // namespace zano::ipod
