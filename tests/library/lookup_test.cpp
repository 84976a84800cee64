#include <vorelix/library/musiclib.h>

#include <array>
#include <cstring>
#include <string>

#include "support/platform_stand_in.h"

namespace {

using stand_in::row;
using stand_in::script;
using stand_in::takeOpenResults;
using stand_in::takeTrace;

class PathById : public stand_in::Test {};

TEST_F(PathById, GivesTheEscapedPath) {
    ZANO_MEDIA_INFO song = row(12, "it's");
    script().rows = {song, row(13, "other")};
    std::array<char, 64> out{};
    EXPECT_EQ(ZANOMusicGetPathById(out.data(), out.size(), "12"), 0);
    EXPECT_STREQ(out.data(), "/volume1/music/it''s");
    EXPECT_EQ(takeTrace(), "open(4, \"*\", \" id=12 \", null, null, 0, 0, 0)\nclose\n");

    out.fill('#');
    EXPECT_EQ(ZANOMusicGetPathById(out.data(), 9, "1 or 'x'"), 0);
    EXPECT_STREQ(out.data(), "/volume1");
    EXPECT_EQ(out[9], '#');
    EXPECT_EQ(takeTrace(), "open(4, \"*\", \" id=1 or 'x' \", null, null, 0, 0, 0)\nclose\n");
}

TEST_F(PathById, TheLongestPathOfQuotes) {
    ZANO_MEDIA_INFO song = row(1, "");
    std::memset(song.path, '\'', sizeof song.path - 1);
    script().rows = {song};
    std::array<char, 8192> out{};
    EXPECT_EQ(ZANOMusicGetPathById(out.data(), out.size(), "1"), 0);
    EXPECT_EQ(out.data(), std::string(8190, '\''));
}

TEST_F(PathById, WithoutARowThePathIsEmpty) {
    std::string out = "before";
    EXPECT_EQ(ZANOMusicGetPathById(out.data(), static_cast<int>(out.size()), "9"), 0);
    EXPECT_STREQ(out.c_str(), "");
    takeTrace();
    for (const int size : {0, -5}) {
        char untouched = '#';
        EXPECT_EQ(ZANOMusicGetPathById(&untouched, size, "9"), 0);
        EXPECT_EQ(untouched, '#');
    }
}

TEST_F(PathById, ConditionIsCutTo8191Bytes) {
    script().openFails = true;
    char out = '#';
    EXPECT_EQ(ZANOMusicGetPathById(&out, 1, std::string(9000, '1').c_str()), -1);
    const std::string cut = " id=" + std::string(8187, '1');
    EXPECT_EQ(takeTrace(), "open(4, \"*\", \"" + cut + "\", null, null, 0, 0, 0)\n" +
                               "3 musiclib.cpp (231) Failed to open media database (" + cut +
                               ").\n");
    EXPECT_EQ(out, '#');
}

TEST_F(PathById, AFailedEscapeLeavesTheResultOpen) {
    script().rows = {row(1, "a")};
    script().quotesFail = true;
    char out = '#';
    EXPECT_EQ(ZANOMusicGetPathById(&out, 1, "1"), -1);
    EXPECT_EQ(takeTrace(),
              "open(4, \"*\", \" id=1 \", null, null, 0, 0, 0)\n"
              "3 musiclib.cpp (237) Failed to escape path.\n");
    EXPECT_EQ(out, '#');
    EXPECT_EQ(takeOpenResults(), 1);
}

TEST_F(PathById, NullArguments) {
    char out = '#';
    EXPECT_EQ(ZANOMusicGetPathById(nullptr, 10, "1"), -1);
    EXPECT_EQ(ZANOMusicGetPathById(&out, 1, nullptr), -1);
    EXPECT_EQ(takeTrace(), "");
}

class Keyword : public stand_in::Test {};

TEST_F(Keyword, GivesTheEscapedValue) {
    script().rows = {row(1, "Guns N' Roses")};
    const struct {
        int category;
        std::string select;
    } cases[] = {{2, " artist as title "}, {3, " album as title "}, {4, " genre as title "}};
    for (const auto &each : cases) {
        std::array<char, 64> out{};
        EXPECT_EQ(ZANOMusicGetKeyword(each.category, out.data(), out.size(), "id=1"), 0);
        EXPECT_STREQ(out.data(), "Guns N'' Roses");
        EXPECT_EQ(takeTrace(),
                  "open(0, \"" + each.select + "\", \"id=1\", null, null, 0, 0, 0)\nclose\n");
    }
    std::array<char, 5> small{};
    EXPECT_EQ(ZANOMusicGetKeyword(2, small.data(), small.size(), nullptr), 0);
    EXPECT_STREQ(small.data(), "Guns");
    EXPECT_EQ(takeTrace(), "open(0, \" artist as title \", null, null, null, 0, 0, 0)\nclose\n");
}

TEST_F(Keyword, WithoutARowTheValueIsEmpty) {
    std::array<char, 8> out{"before"};
    EXPECT_EQ(ZANOMusicGetKeyword(2, out.data(), out.size(), "id=0"), 0);
    EXPECT_STREQ(out.data(), "");
}

TEST_F(Keyword, OtherCategoriesAndNoBuffer) {
    char out = '#';
    for (const int category : {-1, 0, 1, 5, 6}) {
        EXPECT_EQ(ZANOMusicGetKeyword(category, &out, 1, "id=1"), -1) << category;
    }
    EXPECT_EQ(ZANOMusicGetKeyword(2, nullptr, 1, "id=1"), -1);
    EXPECT_EQ(takeTrace(), "");
    EXPECT_EQ(out, '#');
}

TEST_F(Keyword, Failures) {
    char out = '#';
    script().openFails = true;
    EXPECT_EQ(ZANOMusicGetKeyword(3, &out, 1, "id="), -1);
    EXPECT_EQ(ZANOMusicGetKeyword(3, &out, 1, nullptr), -1);
    EXPECT_EQ(takeTrace(),
              "open(0, \" album as title \", \"id=\", null, null, 0, 0, 0)\n"
              "3 musiclib.cpp (290) Failed to open media database (id=).\n"
              "open(0, \" album as title \", null, null, null, 0, 0, 0)\n"
              "3 musiclib.cpp (290) Failed to open media database ((null)).\n");

    script().openFails = false;
    script().quotesFail = true;
    EXPECT_EQ(ZANOMusicGetKeyword(3, &out, 1, "id=1"), -1);
    EXPECT_EQ(takeTrace(),
              "open(0, \" album as title \", \"id=1\", null, null, 0, 0, 0)\n"
              "3 musiclib.cpp (296) Failed to escape condition.\n");
    EXPECT_EQ(out, '#');
    EXPECT_EQ(takeOpenResults(), 1);  // left open after a failed escape
}

}  // namespace
