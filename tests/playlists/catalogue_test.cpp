#include <unistd.h>
#include <vorelix/playlists/playlist.h>

#include <array>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <string>

#include "support/platform_stand_in.h"

namespace {

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
    EXPECT_EQ(ZANOPlayListListGetByID(list.address(), "7,3"), 0);
    EXPECT_EQ(list.text(), "0   /volume1/music/three\n0   /volume1/music/seven\n");
    EXPECT_EQ(takeTrace(), asked("path", "id in (7,3)") + "close\n");

    script().openFails = true;
    Playlists none;
    EXPECT_EQ(ZANOPlayListListGetByID(none.address(), "'"), 0);
    EXPECT_EQ(none.head(), nullptr);
    EXPECT_EQ(takeTrace(), asked("path", "id in (')"));
}

TEST_F(Catalogue, ListingFillsWholeNodesInTheOrderOfTheRows) {
    script().rows = {playlist(3, "three", "Playlists"), playlist(7, "seven", "")};
    std::memset(script().rows[0].title, 't', 254);
    std::memset(script().rows[0].path, 'p', 4095);
    Playlists list;
    EXPECT_EQ(ZANOPlaylistListAll(list.address(), 20, 10, 0), 0);
    EXPECT_EQ(list.text(), "3 " + std::string(254, 't') + " Playlists " + std::string(4095, 'p') +
                               "\n7 seven  /volume1/music/seven\n");
    EXPECT_EQ(takeTrace(),
              "open(3, \"*\", \"path like '/volume1/music/%'\", null, "
              "\"lower(title) asc, lower(album) \", 20, 10, 1)\nclose\n");
}

TEST_F(Catalogue, ListingOfOneFolderAndWithoutDatabase) {
    script().openFails = true;
    Playlists list;
    EXPECT_EQ(ZANOPlaylistListAll(list.address(), 0, 0, -1), 0);
    EXPECT_EQ(list.head(), nullptr);
    EXPECT_EQ(takeTrace(),
              "open(3, \"*\", \"path like '/volume1/music/%' and album ilike 'playlists'\", null, "
              "\"lower(title) asc, lower(album) \", 0, 0, 1)\n");
    script().musicRoot = "/" + std::string(600, 'r');
    EXPECT_EQ(ZANOPlaylistListAll(list.address(), 0, 0, 1), 0);
    EXPECT_NE(takeTrace().find("\"path like '/" + std::string(499, 'r') + "\", null"),
              std::string::npos);
}

TEST_F(Catalogue, ListingWithoutTheMusicLink) {
    script().linkError = ENOENT;
    Playlists list;
    EXPECT_EQ(ZANOPlaylistListAll(list.address(), 0, 0, 0), -1);
    EXPECT_EQ(ZANOPlaylistListAll(nullptr, 0, 0, 0), -1);
    EXPECT_EQ(takeTrace(), "3 playlist.cpp:369 Failed to readlink(" ZANO_ROOT
                           "/var/services/music). [No such file or directory]\n");
}

/* One row with an id, a path and a title; every lookup writes one of them into eight bytes. */
TEST_F(Catalogue, OneValueOfOnePlaylist) {
    using Out = std::array<char, 8>;
    const struct {
        const char *what;
        int (*call)(Out &out, int size);
        std::string asked;
        const char *found;
        int withoutRow;
        std::string notFound;
        std::string notOpened;
    } cases[] = {
        {"path", [](Out &out, int size) { return ZANOPlaylistPathGet(12, out.data(), size); },
         asked("path", "id = 12"), "/volume", -1, "", ""},
        {"id", [](Out &out, int size) { return ZANOPlaylistIDGet("/it's", out.data(), size); },
         asked("id", "path = '/it''s'"), "4294967", -1, "", ""},
        {"title", [](Out &out, int size) { return ZANOPlaylistTitleGet("12x", out.data(), size); },
         asked("title", "id = 12"), "title b", 0, "", ""},
        {"no digits", [](Out &out, int size) { return ZANOPlaylistTitleGet("", out.data(), size); },
         asked("title", "id = 0"), "title b", 0, "", ""},
        {"beyond an id",
         [](Out &out, int size) { return ZANOPlaylistTitleGet("4294967299", out.data(), size); },
         asked("title", "id = 2147483647"), "title b", 0, "", ""},
        {"title by path",
         [](Out &out, int size) { return ZANOPlaylistTitleGetByPath("/it's", out.data(), size); },
         asked("title", "path = '/it''s'"), "title b", -1,
         "3 playlist.cpp:590 Failed to MediaInfoDBGet()\n",
         "3 playlist.cpp:585 Failed to MediaInfoDBOpen()\n"},
    };
    for (const auto &each : cases) {
        Out out;
        out.fill('#');
        script().rows = {row(-1, "title beyond"), row(2, "other")};
        EXPECT_EQ(each.call(out, out.size()), 0) << each.what;
        EXPECT_STREQ(out.data(), each.found) << each.what;
        EXPECT_EQ(takeTrace(), each.asked + "close\n") << each.what;

        out.fill('#');
        EXPECT_EQ(each.call(out, -1), 0) << each.what;
        takeTrace();
        script().rows.clear();
        EXPECT_EQ(each.call(out, out.size()), each.withoutRow) << each.what;
        EXPECT_EQ(takeTrace(), each.asked + each.notFound + "close\n") << each.what;
        script().openFails = true;
        EXPECT_EQ(each.call(out, out.size()), each.withoutRow) << each.what;
        EXPECT_EQ(takeTrace(), each.asked + each.notOpened) << each.what;
        EXPECT_EQ(out[0], '#') << each.what;
        script().openFails = false;
    }
}

TEST_F(Catalogue, BadParameters) {
    char out = '#';
    ZANO_PLAYLIST *list = nullptr;
    const struct {
        int result;
        const char *line;
    } cases[] = {
        {ZANOPlayListListGetByID(nullptr, "1"), " (172) Bad parameter."},
        {ZANOPlayListListGetByID(&list, nullptr), " (172) Bad parameter."},
        {ZANOPlayListListGetByID(&list, ""), " (172) Bad parameter."},
        {ZANOPlaylistPathGet(0, &out, 1), " (240) Bad parameter."},
        {ZANOPlaylistPathGet(-3, &out, 1), " (240) Bad parameter."},
        {ZANOPlaylistPathGet(1, nullptr, 1), " (240) Bad parameter."},
        {ZANOPlaylistIDGet(nullptr, &out, 1), " (290) Bad parameters."},
        {ZANOPlaylistIDGet("", &out, 1), " (290) Bad parameters."},
        {ZANOPlaylistIDGet("/a", nullptr, 1), " (290) Bad parameters."},
        {ZANOPlaylistTitleGet(nullptr, &out, 1), " (518) Bad parameters."},
        {ZANOPlaylistTitleGet("1", nullptr, 1), " (518) Bad parameters."},
        {ZANOPlaylistTitleGetByPath(nullptr, &out, 1), ":562 Bad parameters."},
        {ZANOPlaylistTitleGetByPath("", &out, 1), ":562 Bad parameters."},
        {ZANOPlaylistTitleGetByPath("/a", nullptr, 1), ":562 Bad parameters."},
        {ZANOPlayListUnlink(nullptr), " (627) Bad parameters."},
    };
    std::string lines;
    for (const auto &each : cases) {
        EXPECT_EQ(each.result, -1) << each.line;
        lines += "3 playlist.cpp" + std::string(each.line) + "\n";
    }
    EXPECT_EQ(takeTrace(), lines);
    EXPECT_EQ(out, '#');
}

TEST_F(Catalogue, TextsThatCannotBeMade) {
    std::array<char, 8> out{};
    script().quotesFail = true;
    EXPECT_EQ(ZANOPlaylistTitleGetByPath("/it's", out.data(), out.size()), -1);
    EXPECT_EQ(takeTrace(), "3 playlist.cpp:573 Failed to escape path [/it's]\n");
    EXPECT_EQ(ZANOPlaylistIDGet("/it's", out.data(), out.size()), -1);
    EXPECT_EQ(takeTrace(), asked("id", "path = ''") + "close\n");
    script().quotesFail = false;
    script().textFails = true;
    EXPECT_EQ(ZANOPlaylistTitleGetByPath("/a", out.data(), out.size()), -1);
    EXPECT_EQ(takeTrace(), "3 playlist.cpp:578 Failed to ZANOStrGet()[0x0200]\n");
}

TEST_F(Catalogue, TotalIsTheDatabasesAnswer) {
    for (const int count : {5, 0, -2}) {
        script().count = count;
        EXPECT_EQ(ZANOPlaylistTotalGet(), count);
        EXPECT_EQ(takeTrace(), "count(3, \"*\", null, 0, 0)\n");
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
    EXPECT_EQ(ZANOPlayListUnlink(nodes), 0);
    EXPECT_NE(access(file.c_str(), F_OK), 0);
    EXPECT_EQ(takeTrace(),
              "delete(3, \"/nowhere/gone.m3u\")\nnotice(\"/nowhere/gone.m3u\", null, 2)\n"
              "delete(3, \"" +
                  file + "\")\nnotice(\"" + file + "\", null, 2)\n");
}

}  // namespace
