#include <unistd.h>
#include <vorelix/playlists/playlist.h>

#include <array>
#include <cerrno>
#include <cstddef>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <string>
#include <tuple>

#include "support/failing_allocator.h"
#include "support/platform_stand_in.h"

namespace {

using stand_in::outcome;
using stand_in::Playlists;
using stand_in::row;
using stand_in::script;
using stand_in::takeTrace;

class Catalogue : public stand_in::Test {};

ZANO_MEDIA_INFO playlist(int id, const std::string &title, const std::string &album) {
    ZANO_MEDIA_INFO info = row(id, title);
    album.copy(info.album, sizeof info.album - 1);
    return info;
}

/* The whole call of MediaInfoDBOpen for one playlist, and its close. */
std::string asked(const std::string &select, const std::string &condition) {
    return "open(3, \"" + select + "\", \"" + condition + "\", null, null, 0, 0, 0)\n";
}

TEST_F(Catalogue, ByIdsOnlyThePathIsFilled) {
    script().rows = {playlist(3, "three", "x"), playlist(7, "seven", "y")};
    Playlists list;
    EXPECT_EQ(outcome(ZANOPlayListListGetByID(list.address(), "7,3")),
              "0 " + asked("path", "id in (7,3)") + "close\n");
    EXPECT_EQ(list.text(), "0   /volume1/music/three\n0   /volume1/music/seven\n");

    script().openFails = true;
    Playlists none;
    EXPECT_EQ(outcome(ZANOPlayListListGetByID(none.address(), "'")),
              "0 " + asked("path", "id in (')"));
    EXPECT_EQ(none.head(), nullptr);
}

TEST_F(Catalogue, ListingFillsWholeNodesInTheOrderOfTheRows) {
    script().rows = {playlist(3, "three", "Playlists"), playlist(7, "seven", "")};
    std::memset(script().rows[0].title, 't', 254);
    std::memset(script().rows[0].path, 'p', 4095);
    Playlists list;
    EXPECT_EQ(outcome(ZANOPlaylistListAll(list.address(), 20, 10, 0)),
              "0 open(3, \"*\", \"path like '/volume1/music/%'\", null, "
              "\"lower(title) asc, lower(album) \", 20, 10, 1)\nclose\n");
    EXPECT_EQ(list.text(), "3 " + std::string(254, 't') + " Playlists " + std::string(4095, 'p') +
                               "\n7 seven  /volume1/music/seven\n");
}

TEST_F(Catalogue, ListingOfOneFolderAndWithoutDatabase) {
    script().openFails = true;
    Playlists list;
    EXPECT_EQ(outcome(ZANOPlaylistListAll(list.address(), 0, 0, -1)),
              "0 open(3, \"*\", \"path like '/volume1/music/%' and album ilike 'playlists'\", "
              "null, \"lower(title) asc, lower(album) \", 0, 0, 1)\n");
    EXPECT_EQ(list.head(), nullptr);
    script().musicRoot = "/" + std::string(600, 'r');
    EXPECT_EQ(ZANOPlaylistListAll(list.address(), 0, 0, 1), 0);
    EXPECT_NE(takeTrace().find("\"path like '/" + std::string(499, 'r') + "\", null"),
              std::string::npos);
}

TEST_F(Catalogue, ListingWithoutTheMusicLink) {
    script().linkError = ENOENT;
    Playlists list;
    ZANO_PLAYLIST stale{};
    *list.address() = &stale;
    EXPECT_EQ(outcome(ZANOPlaylistListAll(list.address(), 0, 0, 0)),
              "-1 3 playlist.cpp:369 Failed to readlink(" ZANO_ROOT
              "/var/services/music). [No such file or directory]\n");
    EXPECT_EQ(list.head(), nullptr);
    EXPECT_EQ(outcome(ZANOPlaylistListAll(nullptr, 0, 0, 0)), "-1 ");
    script().count = -2;
    EXPECT_EQ(outcome(ZANOPlaylistTotalGet()), "-2 count(3, \"*\", null, 0, 0)\n");
}

/* One row with an id, a path and a title; every lookup writes one of them into eight bytes. */
TEST_F(Catalogue, OneValueOfOnePlaylist) {
    using Out = std::array<char, 8>;
    const struct {
        int (*call)(Out &out, int size);
        std::string asked;
        const char *found;
        std::string withoutRow;
        std::string notFound;
        std::string notOpened;
    } cases[] = {
        {[](Out &out, int size) { return ZANOPlaylistPathGet(12, out.data(), size); },
         asked("path", "id = 12"), "/volume", "-1 ", "", ""},
        {[](Out &out, int size) { return ZANOPlaylistIDGet("/it's", out.data(), size); },
         asked("id", "path = '/it''s'"), "4294967", "-1 ", "", ""},
        {[](Out &out, int size) { return ZANOPlaylistTitleGet("12x", out.data(), size); },
         asked("title", "id = 12"), "title b", "0 ", "", ""},
        {[](Out &out, int size) { return ZANOPlaylistTitleGet("", out.data(), size); },
         asked("title", "id = 0"), "title b", "0 ", "", ""},
        {[](Out &out, int size) { return ZANOPlaylistTitleGet("4294967299", out.data(), size); },
         asked("title", "id = 2147483647"), "title b", "0 ", "", ""},
        {[](Out &out, int size) { return ZANOPlaylistTitleGetByPath("/it's", out.data(), size); },
         asked("title", "path = '/it''s'"), "title b", "-1 ",
         "3 playlist.cpp:590 Failed to MediaInfoDBGet()\n",
         "3 playlist.cpp:585 Failed to MediaInfoDBOpen()\n"},
    };
    for (const auto &each : cases) {
        Out out;
        out.fill('#');
        script().rows = {row(-1, "title beyond"), row(2, "other")};
        EXPECT_EQ(outcome(each.call(out, -1)), "0 " + each.asked + "close\n");
        EXPECT_EQ(out[0], '#') << each.asked;
        EXPECT_EQ(outcome(each.call(out, out.size())), "0 " + each.asked + "close\n");
        EXPECT_STREQ(out.data(), each.found) << each.asked;

        out.fill('#');
        script().rows.clear();
        EXPECT_EQ(outcome(each.call(out, out.size())),
                  each.withoutRow + each.asked + each.notFound + "close\n");
        script().openFails = true;
        EXPECT_EQ(outcome(each.call(out, out.size())),
                  each.withoutRow + each.asked + each.notOpened);
        EXPECT_EQ(out[0], '#') << each.asked;
        script().openFails = false;
    }
}

TEST_F(Catalogue, BadParameters) {
    const auto bad = [](const std::string &text) { return "-1 3 playlist.cpp" + text + ".\n"; };
    char out = '#';
    ZANO_PLAYLIST *list = nullptr;
    for (const char *none : {"", static_cast<const char *>(nullptr)}) {
        EXPECT_EQ(outcome(ZANOPlayListListGetByID(&list, none)), bad(" (172) Bad parameter"));
        EXPECT_EQ(outcome(ZANOPlaylistIDGet(none, &out, 1)), bad(" (290) Bad parameters"));
        EXPECT_EQ(outcome(ZANOPlaylistTitleGetByPath(none, &out, 1)), bad(":562 Bad parameters"));
    }
    EXPECT_EQ(outcome(ZANOPlayListListGetByID(nullptr, "1")), bad(" (172) Bad parameter"));
    EXPECT_EQ(outcome(ZANOPlaylistPathGet(0, &out, 1)), bad(" (240) Bad parameter"));
    EXPECT_EQ(outcome(ZANOPlaylistPathGet(1, nullptr, 1)), bad(" (240) Bad parameter"));
    EXPECT_EQ(outcome(ZANOPlaylistIDGet("/a", nullptr, 1)), bad(" (290) Bad parameters"));
    EXPECT_EQ(outcome(ZANOPlaylistTitleGet(nullptr, &out, 1)), bad(" (518) Bad parameters"));
    EXPECT_EQ(outcome(ZANOPlaylistTitleGet("1", nullptr, 1)), bad(" (518) Bad parameters"));
    EXPECT_EQ(outcome(ZANOPlaylistTitleGetByPath("/a", nullptr, 1)), bad(":562 Bad parameters"));
    EXPECT_EQ(outcome(ZANOPlayListUnlink(nullptr)), bad(" (627) Bad parameters"));
    EXPECT_EQ(out, '#');
}

TEST_F(Catalogue, TextsThatCannotBeMade) {
    std::array<char, 8> out{};
    script().quotesFail = true;
    EXPECT_EQ(outcome(ZANOPlaylistTitleGetByPath("/it's", out.data(), out.size())),
              "-1 3 playlist.cpp:573 Failed to escape path [/it's]\n");
    EXPECT_EQ(outcome(ZANOPlaylistIDGet("/it's", out.data(), out.size())),
              "-1 " + asked("id", "path = ''") + "close\n");
    script().quotesFail = false;
    script().textFails = true;
    EXPECT_EQ(outcome(ZANOPlaylistTitleGetByPath("/a", out.data(), out.size())),
              "-1 3 playlist.cpp:578 Failed to ZANOStrGet()[0x0200]\n");
}

/* The condition of ids and that of a path, and the second node of a list. */
TEST_F(Catalogue, OutOfMemory) {
    std::array<char, 8> out{};
    Playlists list;
    const auto byIds = [&] { return ZANOPlayListListGetByID(list.address(), "3,7"); };
    const auto all = [&] { return ZANOPlaylistListAll(list.address(), 0, 0, 0); };
    const auto id = [&] { return ZANOPlaylistIDGet("/it's", out.data(), out.size()); };
    const auto title = [&] { return ZANOPlaylistTitleGetByPath("/it's", out.data(), out.size()); };
    const std::tuple<std::function<int()>, std::size_t, int, std::string> cases[] = {
        {byIds, 39, 0, "3 playlist.cpp (180) Failed to alloc memory 39\n"},
        {byIds, sizeof(ZANO_PLAYLIST), 1, "close\n3 playlist.cpp (196) Failed to alloc 4616\n"},
        {all, sizeof(ZANO_PLAYLIST), 1, "3 playlist.cpp (386) Failed to alloc 4616\nclose\n"},
        {id, 11, 0, "3 playlist.cpp (297) Failed to alloc(11)\n"},
        {id, 18, 0, "3 playlist.cpp (306) Failed to alloc(18)\n"},
        {title, 11, 0, "3 playlist.cpp:568 Failed to calloc(11) Cannot allocate memory\n"},
    };
    script().rows = {row(3, "three"), row(7, "seven")};
    for (const auto &[call, size, after, lines] : cases) {
        failing_allocator::failOnSize(size, after);
        EXPECT_EQ(call(), -1) << lines;
        EXPECT_TRUE(failing_allocator::hasFailed()) << lines;
        EXPECT_TRUE(takeTrace().ends_with(lines)) << lines;
        EXPECT_EQ(list.head(), nullptr) << lines;
    }
}

TEST_F(Catalogue, UnlinkRemovesFilesAndRows) {
    std::string file = testing::TempDir() + "unlink_XXXXXX";
    ASSERT_NE(close(mkstemp(file.data())), -1);
    ZANO_PLAYLIST nodes[2] = {};
    std::string("/nowhere/gone.m3u").copy(nodes[0].path, sizeof nodes[0].path - 1);
    nodes[0].next = &nodes[1];
    file.copy(nodes[1].path, sizeof nodes[1].path - 1);
    script().noticed = -1;
    EXPECT_EQ(outcome(ZANOPlayListUnlink(nodes)),
              "0 delete(3, \"/nowhere/gone.m3u\")\nnotice(\"/nowhere/gone.m3u\", null, 2)\n"
              "delete(3, \"" +
                  file + "\")\nnotice(\"" + file + "\", null, 2)\n");
    EXPECT_NE(access(file.c_str(), F_OK), 0);
}

}  // namespace
