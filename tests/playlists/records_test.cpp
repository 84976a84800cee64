#include <gtest/gtest.h>
#include <vorelix/playlists/playlist.h>

#include <cstdlib>

namespace {

/* Three linked nodes come back in reverse; the first one is the last, and alone, then. */
template <typename Node>
void expectReversal(Node *(*reverse)(Node *), unsigned (*count)(const Node *)) {
    Node nodes[3] = {};
    nodes[0].next = &nodes[1];
    nodes[1].next = &nodes[2];
    EXPECT_EQ(count(nodes), 3U);
    EXPECT_EQ(reverse(nodes), &nodes[2]);
    EXPECT_EQ(nodes[2].next, &nodes[1]);
    EXPECT_EQ(nodes[1].next, &nodes[0]);
    EXPECT_EQ(reverse(nodes), nodes);
    EXPECT_EQ(nodes[0].next, nullptr);
    EXPECT_EQ(count(nullptr), 0U);
    EXPECT_EQ(reverse(nullptr), nullptr);
}

TEST(Lists, ReversedCountedAndFreed) {
    expectReversal(PlaylistRecReverse, ZANOPlaylistRecCount);
    expectReversal(PlaylistReverse, ZANOPlaylistCount);
    auto *const list = static_cast<ZANO_PLAYLIST *>(std::calloc(1, sizeof(ZANO_PLAYLIST)));
    list->next = static_cast<ZANO_PLAYLIST *>(std::calloc(1, sizeof(ZANO_PLAYLIST)));
    EXPECT_EQ(ZANOPlayListFree(list), nullptr);  // a node that is left is a leak
    EXPECT_EQ(ZANOPlayListFree(nullptr), nullptr);
}

}  // namespace
