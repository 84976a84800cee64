#include <vorelix/library/musiclib.h>

#include <array>
#include <cstring>
#include <string>
#include <tuple>

#include "support/platform_stand_in.h"

namespace {

using stand_in::outcome;
using stand_in::row;
using stand_in::script;
using stand_in::takeOpenResults;

std::string opened(const std::string &arguments) {
    return "open(" + arguments + ", null, null, 0, 0, 0)\n";
}

class PathById : public stand_in::Test {};

TEST_F(PathById, GivesTheEscapedPath) {
    script().rows = {row(12, "it's"), row(13, "other")};
    const std::tuple<const char *, int, const char *> cases[] = {
        {"12", 64, "/volume1/music/it''s"}, {"1 or 'x'", 9, "/volume1"}, {"9", 1, ""}};
    for (const auto &[id, size, path] : cases) {
        std::string out(65, '#');
        EXPECT_EQ(outcome(ZANOMusicGetPathById(out.data(), size, id)),
                  "0 " + opened("4, \"*\", \" id=" + std::string(id) + " \"") + "close\n");
        EXPECT_STREQ(out.c_str(), path);
        EXPECT_EQ(out.find('#'), std::strlen(path) + 1);
    }
    script().rows[0] = row(1, "");
    std::memset(script().rows[0].path, '\'', sizeof script().rows[0].path - 1);
    std::array<char, 8192> longest{};
    EXPECT_EQ(ZANOMusicGetPathById(longest.data(), longest.size(), "1"), 0);
    EXPECT_EQ(longest.data(), std::string(8190, '\''));

    script().rows.clear();
    std::array<char, 8> out{"before"};
    for (const int size : {-5, 0, 1}) {
        EXPECT_EQ(ZANOMusicGetPathById(out.data(), size, "9"), 0);
        EXPECT_STREQ(out.data(), size > 0 ? "" : "before");
    }
}

TEST_F(PathById, Failures) {
    char out = '#';
    EXPECT_EQ(outcome(ZANOMusicGetPathById(nullptr, 10, "1")), "-1 ");
    EXPECT_EQ(outcome(ZANOMusicGetPathById(&out, 1, nullptr)), "-1 ");

    script().openFails = true;
    const std::string cut = " id=" + std::string(8187, '1');
    EXPECT_EQ(outcome(ZANOMusicGetPathById(&out, 1, std::string(9000, '1').c_str())),
              "-1 " + opened("4, \"*\", \"" + cut + "\"") +
                  "3 musiclib.cpp (231) Failed to open media database (" + cut + ").\n");

    script().openFails = false;
    script().quotesFail = true;
    EXPECT_EQ(
        outcome(ZANOMusicGetPathById(&out, 1, "1")),
        "-1 " + opened("4, \"*\", \" id=1 \"") + "3 musiclib.cpp (237) Failed to escape path.\n");
    EXPECT_EQ(takeOpenResults(), 1);  // left open
    EXPECT_EQ(out, '#');
}

class Keyword : public stand_in::Test {};

TEST_F(Keyword, GivesTheEscapedValue) {
    const std::pair<int, std::string> cases[] = {{2, "artist"}, {3, "album"}, {4, "genre"}};
    for (const auto &[category, column] : cases) {
        script().rows = {row(1, "Guns N' Roses")};
        std::array<char, 9> out{};
        EXPECT_EQ(outcome(ZANOMusicGetKeyword(category, out.data(), out.size(), "id=1")),
                  "0 " + opened("0, \" " + column + " as title \", \"id=1\"") + "close\n");
        EXPECT_STREQ(out.data(), "Guns N''");
        script().rows.clear();
        EXPECT_EQ(ZANOMusicGetKeyword(category, out.data(), out.size(), nullptr), 0);
        EXPECT_STREQ(out.data(), "");
        stand_in::takeTrace();
    }
}

TEST_F(Keyword, Failures) {
    char out = '#';
    for (const int category : {-1, 0, 1, 5, 6}) {
        EXPECT_EQ(outcome(ZANOMusicGetKeyword(category, &out, 1, "id=1")), "-1 ") << category;
    }
    EXPECT_EQ(outcome(ZANOMusicGetKeyword(2, nullptr, 1, "id=1")), "-1 ");

    script().openFails = true;
    const std::string album = "0, \" album as title \", ";
    EXPECT_EQ(outcome(ZANOMusicGetKeyword(3, &out, 1, "id=")),
              "-1 " + opened(album + "\"id=\"") +
                  "3 musiclib.cpp (290) Failed to open media database (id=).\n");
    EXPECT_EQ(outcome(ZANOMusicGetKeyword(3, &out, 1, nullptr)),
              "-1 " + opened(album + "null") +
                  "3 musiclib.cpp (290) Failed to open media database ((null)).\n");

    script().openFails = false;
    script().quotesFail = true;
    EXPECT_EQ(
        outcome(ZANOMusicGetKeyword(3, &out, 1, "id=1")),
        "-1 " + opened(album + "\"id=1\"") + "3 musiclib.cpp (296) Failed to escape condition.\n");
    EXPECT_EQ(takeOpenResults(), 1);  // left open
    EXPECT_EQ(out, '#');
}

}  // namespace
