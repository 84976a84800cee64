#include <gtest/gtest.h>
#include <vorelix/playlists/playlist.h>

#include <cstdlib>
#include <string>

#include "support/platform_stand_in.h"

namespace {

/* A list of playlists with the ids from 1 to count. */
ZANO_PLAYLIST *playlists(int count) {
    ZANO_PLAYLIST *list = nullptr;
    for (int id = count; id > 0; --id) {
        auto *node = static_cast<ZANO_PLAYLIST *>(std::calloc(1, sizeof(ZANO_PLAYLIST)));
        node->id = id;
        node->next = list;
        list = node;
    }
    return list;
}

template <typename Node, typename IdOf>
std::string ids(const Node *list, IdOf idOf) {
    std::string text;
    for (; list != nullptr; list = list->next) {
        text += std::to_string(idOf(list)) + " ";
    }
    return text;
}

TEST(Playlists, ReversedCountedAndFreed) {
    const auto idOf = [](const ZANO_PLAYLIST *node) { return node->id; };
    for (const auto &[count, reversed] :
         {std::pair{0U, ""}, std::pair{1U, "1 "}, std::pair{4U, "4 3 2 1 "}}) {
        ZANO_PLAYLIST *const list = PlaylistReverse(playlists(static_cast<int>(count)));
        EXPECT_EQ(ids(list, idOf), reversed);
        EXPECT_EQ(ZANOPlaylistCount(list), count);
        EXPECT_EQ(ZANOPlayListFree(list), nullptr);
    }
}

TEST(Records, ReversedAndCounted) {
    const auto idOf = [](const ZANO_PLAYLIST_REC *node) { return node->info.id; };
    ZANO_PLAYLIST_REC nodes[3] = {};
    for (int index = 0; index < 3; ++index) {
        nodes[index].info.id = index + 1;
        nodes[index].next = index < 2 ? &nodes[index + 1] : nullptr;
    }
    EXPECT_EQ(ZANOPlaylistRecCount(nodes), 3U);
    EXPECT_EQ(ids(PlaylistRecReverse(nodes), idOf), "3 2 1 ");
    EXPECT_EQ(PlaylistRecReverse(nodes), nodes);  // the last node now, and alone
    EXPECT_EQ(nodes[0].next, nullptr);
    EXPECT_EQ(ZANOPlaylistRecCount(nullptr), 0U);
    EXPECT_EQ(PlaylistRecReverse(nullptr), nullptr);
}

}  // namespace
