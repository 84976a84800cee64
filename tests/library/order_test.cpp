#include <gtest/gtest.h>
#include <vorelix/library/musiclib.h>

#include <array>
#include <string>

namespace {

TEST(Order, TieBreaksFollowThePrimaryTerm) {
    const std::pair<const char *, const char *> cases[] = {
        {nullptr, " album, disc, track, title, artist, genre, year, path, duration "},
        {"artist desc", " artist desc, album, disc, track, title, genre, year, path, duration "},
        {"lower(title) ",
         " lower(title) , album, disc, track, title, artist, genre, year, path, duration "},
        {"year ", " year , album, disc, track, title, artist, genre, path, duration "},
        {"titles", " titles, album, disc, track, artist, genre, year, path, duration "},
        {"Tit", " Tit, album, disc, track, title, artist, genre, year, path, duration "},
    };
    for (const auto &[primary, order] : cases) {
        std::array<char, 1024> out{};
        EXPECT_EQ(GenerateOrderString(primary, out.data(), out.size()),
                  static_cast<int>(std::string(order).size()));
        EXPECT_STREQ(out.data(), order);
    }
}

TEST(Order, CutToTheBuffer) {
    const std::string whole = " path, album, disc, track, title, artist, genre, year, duration ";
    for (const int size : {-1, 0, 1, 2, 8}) {
        std::string out(10, '#');
        EXPECT_EQ(GenerateOrderString("path", out.data(), size), static_cast<int>(whole.size()));
        const std::string expected = size > 0 ? whole.substr(0, size - 1U) + '\0' : "";
        EXPECT_EQ(out, expected + std::string(10 - expected.size(), '#'));
    }
    EXPECT_EQ(GenerateOrderString("path", nullptr, 100), static_cast<int>(whole.size()));
}

TEST(Order, TermsAreCutTo1023Bytes) {
    std::array<char, 2048> out{};
    for (const auto &[term, order] :
         {std::pair{std::string(1020, 'x'), std::string(1020, 'x') + ", a"},
          {std::string(3000, 'y'), std::string(1023, 'y')}}) {
        EXPECT_EQ(GenerateOrderString(term.c_str(), out.data(), out.size()), 1025);
        EXPECT_EQ(out.data(), " " + order + " ");
    }
}

}  // namespace
