#include <vorelix/playlists/playlist.h>

#include <cstdlib>

namespace {

template <typename Node>
Node *reversed(Node *list) {
    Node *head = nullptr;
    while (list != nullptr) {
        Node *const rest = list->next;
        list->next = head;
        head = list;
        list = rest;
    }
    return head;
}

template <typename Node>
unsigned counted(const Node *list) {
    unsigned count = 0;
    for (; list != nullptr; list = list->next) {
        ++count;
    }
    return count;
}

}  // namespace

ZANO_PLAYLIST_REC *PlaylistRecReverse(ZANO_PLAYLIST_REC *list) {
    return reversed(list);
}

unsigned ZANOPlaylistRecCount(const ZANO_PLAYLIST_REC *list) {
    return counted(list);
}

ZANO_PLAYLIST *PlaylistReverse(ZANO_PLAYLIST *list) {
    return reversed(list);
}

unsigned ZANOPlaylistCount(const ZANO_PLAYLIST *list) {
    return counted(list);
}

ZANO_PLAYLIST *ZANOPlayListFree(ZANO_PLAYLIST *list) {
    while (list != nullptr) {
        ZANO_PLAYLIST *const rest = list->next;
        std::free(list);
        list = rest;
    }
    return nullptr;
}
