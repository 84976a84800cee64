#include <vorelix/library/musiclib.h>

#include <algorithm>
#include <cerrno>
#include <functional>
#include <string>
#include <tuple>
#include <vector>

#include "support/platform_stand_in.h"

namespace {

using stand_in::bytes;
using stand_in::List;
using stand_in::outcome;
using stand_in::row;
using stand_in::script;

const std::string kDefaultOrder =
    "\" lower(title) , album, disc, track, title, artist, genre, year, path, duration \"";

class Listing : public stand_in::Test {};

TEST_F(Listing, TextsThatReachTheDatabase) {
    const auto expectOpen = [](const std::string &condition, const std::string &order, int category,
                               const char *keyword, const char *column, int direction) {
        List list;
        EXPECT_EQ(outcome(ZANOMusicListAll(list.address(), category, keyword, column, direction,
                                           100, 50)),
                  "0 open(0, \"*\", " + condition + ", null, " + order + ", 100, 50, 0)\nclose\n");
    };
    const std::string inRoot = "\"path like '/volume1/music/%' and ";
    const std::tuple<int, const char *, std::string> conditions[] = {
        {0, nullptr, "null"},
        {1, "", "null"},
        {0, "any", "null"},
        {1, "Bob", inRoot + "title ilike '%Bob%'\""},
        {2, "Bob", inRoot + "artist ilike '%Bob%'\""},
        {3, "Bob", inRoot + "album ilike '%Bob%'\""},
        {4, "Bob", inRoot + "genre ilike '%Bob%'\""},
        {5, "it's",
         inRoot + "(title ilike '%it''s%' or artist ilike '%it''s%' or album ilike '%it''s%' or "
                  "genre ilike '%it''s%')\""},
        {-1, "x", inRoot + " ilike '%x%'\""},
        {6, "x", inRoot + " ilike '%x%'\""},
        {1, "'\\%_", inRoot + "title ilike '%''\\\\%_%'\""},
        {1, "\xFF@ZANO:NEVAR", inRoot + "title ilike '%\xFF@ZANO:NEVAR%'\""},
    };
    for (const auto &[category, keyword, condition] : conditions) {
        const bool isFirst = category == 1;
        expectOpen(condition, kDefaultOrder, category, keyword, isFirst ? "" : nullptr,
                   isFirst ? 7 : 1);
    }
    const std::string tail = ", album, disc, track, title, artist, genre, year, path, duration ";
    const std::pair<std::string, std::string> orders[] = {
        {"random", "RANDOM()"},
        {"Random", " Random desc" + tail},
        {"artist", " artist desc, album, disc, track, title, genre, year, path, duration "},
        // 26 bytes, a space and "desc" are the 31 that a term may have; beyond, it is cut.
        {"abcdefghijklmnopqrstuvwxyz", " abcdefghijklmnopqrstuvwxyz desc" + tail},
        {"abcdefghijklmnopqrstuvwxyz1", " abcdefghijklmnopqrstuvwxyz1 des" + tail},
        {"abcdefghijklmnopqrstuvwxyz123456", " abcdefghijklmnopqrstuvwxyz12345" + tail},
    };
    for (const auto &each : orders) {
        expectOpen("null", '"' + each.second + '"', 0, nullptr, each.first.c_str(), 0);
    }
}

TEST_F(Listing, OfTheKeywordNothingIsCutAndOfTheRootAllBehind4095Bytes) {
    const std::string keyword(10000, '\'');
    script().musicRoot = std::string(5000, 'r');
    List list;
    EXPECT_EQ(outcome(ZANOMusicListAll(list.address(), 1, keyword.c_str(), "random", 1, 0, 0)),
              "0 open(0, \"*\", \"path like '" + std::string(4095, 'r') + "/%' and title ilike '%" +
                  keyword + keyword + "%'\", null, \"RANDOM()\", 0, 0, 0)\nclose\n");
}

TEST_F(Listing, WholeRowsInTheirOrder) {
    ZANO_MEDIA_INFO full;
    std::fill_n(reinterpret_cast<unsigned char *>(&full), sizeof full, 0xA5);
    script().rows = {row(4, "d"), row(1, "a"), full};
    List list;
    EXPECT_EQ(ZANOMusicListAll(list.address(), 0, nullptr, nullptr, 1, 0, 0), 0);
    ASSERT_EQ(list.text().rfind("4 d, 1 a, ", 0), 0U) << list.text();
    EXPECT_EQ(bytes(list.head()->next->next->info), bytes(full));
    EXPECT_EQ(list.head()->next->next->next, nullptr);

    script().openFails = true;
    List none;
    EXPECT_EQ(ZANOMusicListAll(none.address(), 6, "x", "random", 1, 0, 0), 0);
    EXPECT_EQ(none.head(), nullptr);
    EXPECT_EQ(script().backslashSize, 7) << "twice what the quotes may need";
}

TEST_F(Listing, Failures) {
    const std::tuple<std::function<void()>, int, const char *, std::string> cases[] = {
        {[] { script().linkError = ENOENT; }, 0, nullptr,
         "musiclib.cpp:97 Failed to readlink(" ZANO_ROOT
         "/var/services/music). [No such file or directory]"},
        {[] { script().quotesFail = true; }, 0, "Bob",
         "musiclib.cpp (134) Failed to escape condition."},
        {[] { script().backslashesFail = true; }, 0, "Bob",
         "musiclib.cpp (138) Failed to escape condition."},
        {[] { script().templateFails = true; }, 5, "Bob",
         "musiclib.cpp (145) Failed to alloc memory 15"},
        {[] { script().templateFails = true; }, 1, "Bob",
         "musiclib.cpp (152) Failed to alloc memory 15"},
        {[] { script().templateFails = true; }, 6, "Bob",
         "musiclib.cpp (152) Failed to alloc memory 15"},
    };
    for (const auto &[prepare, category, keyword, line] : cases) {
        script() = stand_in::Script();
        prepare();
        List list;
        EXPECT_EQ(outcome(ZANOMusicListAll(list.address(), category, keyword, nullptr, 1, 0, 0)),
                  "-1 3 " + line + "\n");
        EXPECT_EQ(list.head(), nullptr);
    }
    EXPECT_EQ(outcome(ZANOMusicListAll(nullptr, 0, nullptr, nullptr, 1, 0, 0)),
              "-1 3 musiclib.cpp (84) Bad parameter.\n");
}

class Browse : public stand_in::Test {};

TEST_F(Browse, TextsThatReachTheDatabase) {
    script().count = 123;
    script().rows = {row(2, "b"), row(1, "a")};
    List list;
    EXPECT_EQ(outcome(ZANOMusicBrowse(3, list.address(), " album as title ", "year > 0", "album",
                                      "album desc", 10, 20)),
              "123 open(3, \" album as title \", \"year > 0\", \"album\", \"album desc\", 10, 20, "
              "0)\nclose\ncount(3, \"DISTINCT album\", \"year > 0\", 0, 0)\n");
    EXPECT_EQ(list.text(), "2 b, 1 a");
    const std::string longest(2000, 'c');
    const std::tuple<const char *, std::string, std::string> cases[] = {
        {nullptr, "null", "id"},
        {"", "\"\"", "id"},
        {longest.c_str(), '"' + longest + '"', "DISTINCT " + std::string(1014, 'c')},
    };
    for (const auto &[distinct, shown, counted] : cases) {
        List page;
        EXPECT_EQ(
            outcome(ZANOMusicBrowse(0, page.address(), nullptr, nullptr, distinct, nullptr, 0, 0)),
            "123 open(0, \"*\", null, " + shown + ", null, 0, 0, 0)\nclose\ncount(0, \"" + counted +
                "\", null, 0, 0)\n");
    }
}

TEST_F(Browse, Failures) {
    script().rows = {row(1, "a")};
    script().count = -7;
    List list;
    EXPECT_EQ(ZANOMusicBrowse(0, list.address(), nullptr, nullptr, nullptr, nullptr, 0, 0), -7);
    EXPECT_EQ(list.head(), nullptr) << "a failed count releases it";
    stand_in::takeTrace();
    script().openFails = true;
    EXPECT_EQ(outcome(ZANOMusicBrowse(4, list.address(), "id", "no such", nullptr, nullptr, 0, 0)),
              "-1 open(4, \"id\", \"no such\", null, null, 0, 0, 0)\n"
              "3 musiclib.cpp (340) Failed to open media database (no such).\n");
    EXPECT_EQ(outcome(ZANOMusicBrowse(4, list.address(), "id", nullptr, nullptr, nullptr, 0, 0)),
              "-1 open(4, \"id\", null, null, null, 0, 0, 0)\n"
              "3 musiclib.cpp (340) Failed to open media database ((null)).\n");
    EXPECT_EQ(list.head(), nullptr);
    EXPECT_EQ(outcome(ZANOMusicBrowse(0, nullptr, "id", "x", nullptr, nullptr, 0, 0)),
              "-1 3 musiclib.cpp (333) Bad parameter.\n");
}

}  // namespace
