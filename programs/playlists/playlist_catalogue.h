/* Which playlists there are, and where a new one belongs.
 *
 * Shared playlists are rows of the media database; new ones are made in the folder playlists of
 * the music. Personal ones are the m3u files in the folder playlists of a directory, which every
 * function here takes: "" means the shared ones. */
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "playlist_draft.h"
#include "songs.h"

namespace vorelix {

struct Playlist {
    int id = 0;  // of the row, or a personal playlist's number in the list; 0: neither
    std::string title;
    std::string folder;  // the row's word for its folder; of a personal one its title
    std::string path;
};

struct PlaylistListing {
    std::vector<Playlist> playlists;
    int total;
};

/* Ordered by title. Throws Failure. */
PlaylistListing listPlaylists(const std::string &directory, const Span &span);

/* The one playlist that a user means by an id, a title or a path. A shared title may be given in
 * any case and with any accents as long as no other playlist is meant then. Without a directory
 * the path of any playlist file is taken. Throws Failure for none and for several. */
Playlist findPlaylist(const std::string &name, const std::string &directory);

/* The shared playlist with an id, if there is one. Throws Failure when the database cannot tell. */
std::optional<Playlist> playlistById(int id);

/* Whether a text can be a playlist's title, and so a file's name too. */
bool isTitle(const std::string &title);

/* Throws Failure for what is no title. Makes the folder. */
Playlist newPlaylist(const std::string &title, const std::string &form,
                     const std::string &directory);

/* Gives a new playlist its id, and a shared one its row. Throws Failure. */
void enterPlaylist(Playlist &playlist, const std::string &directory);

/* A draft that was written becomes the new playlist, in place of a file only with `replaces`, and
 * it is entered. What cannot be entered is taken away again. Throws Failure. */
void putPlaylist(Playlist &playlist, Draft &draft, bool replaces, const std::string &directory);

/* Deletes file and row, or the file of a personal one. Throws Failure when one of them stays. */
void deletePlaylist(const Playlist &playlist, const std::string &directory, Deadline deadline);

}  // namespace vorelix
