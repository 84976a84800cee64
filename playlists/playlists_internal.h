/* What the functions of the unit playlist share. */
#pragma once

#include <strings.h>
#include <vorelix/playlists/playlist.h>
#include <zanoplatform/strings.h>

#include <algorithm>
#include <climits>
#include <cstdlib>
#include <memory>
#include <string_view>

namespace vorelix::playlist {

/* The unit's name in the log. */
inline constexpr const char *kUnit = "playlist.cpp";

/* A whole list of playlists by its head. */
struct FreePlaylists {
    void operator()(ZANO_PLAYLIST *list) const { ZANOPlayListFree(list); }
};
using PlaylistList = std::unique_ptr<ZANO_PLAYLIST, FreePlaylists>;

/* The platform's list of texts. */
struct FreeStrings {
    void operator()(PSZLIST list) const { KLIBCSzListFree(list); }
};
using StringList = std::unique_ptr<SZLIST, FreeStrings>;

/* Pushes a zero-filled node at the head of a list; false when memory ran out. */
inline bool pushNode(PlaylistList &list) {
    auto *const node = static_cast<ZANO_PLAYLIST *>(std::calloc(1, sizeof(ZANO_PLAYLIST)));
    if (node == nullptr) {
        return false;
    }
    node->next = list.release();
    list.reset(node);
    return true;
}

/* The number that an id's text begins with, 0 for none. What does not fit into an id is the
 * nearest one that does, wherever the library runs, and so is the id of no other playlist. */
inline int playlistId(const char *text) {
    return static_cast<int>(
        std::clamp<long long>(std::strtoll(text, nullptr, 10), INT_MIN, INT_MAX));
}

/* What is neither written as a path nor missing when no file is there; https is none. */
inline bool isWebAddress(const char *path) {
    constexpr std::string_view kScheme = "http://";
    return strncasecmp(path, kScheme.data(), kScheme.size()) == 0;
}

}  // namespace vorelix::playlist
