#include "table.h"

#include <gtest/gtest.h>
#include <sstream>

#include "text.h"

namespace vorelix {
namespace {

Table songs() {
    Table table({{.header = "ID", .right = true},
                 {.header = "Title", .cut = true},
                 {.header = "Artist", .cut = true, .rank = 1},
                 {.header = "Time", .right = true, .rank = 2}});
    table.addRow({"7", "音楽", "", "3:05"});
    table.addRow({"1234", "A title that is rather long", "\x1b[1mSomebody e\u0301lse", ""});
    return table;
}

TEST(Table, WithoutLimitNothingIsCut) {
    EXPECT_EQ(songs().render({}),
              "  ID  Title                        Artist             Time\n"
              "   7  音楽                                            3:05\n"
              "1234  A title that is rather long  ␛[1mSomebody e\u0301lse\n");
}

TEST(Table, TheWidestColumnGivesWayFirst) {
    EXPECT_EQ(songs().render({.width = 50}),
              "  ID  Title                Artist             Time\n"
              "   7  音楽                                    3:05\n"
              "1234  A title that is ra…  ␛[1mSomebody e\u0301lse\n");
}

TEST(Table, ColumnsAreLeftOutByRank) {
    EXPECT_EQ(songs().render({.width = 45}),
              "  ID  Title                 Artist\n"
              "   7  音楽\n"
              "1234  A title that is rat…  ␛[1mSomebody e\u0301lse\n");
    EXPECT_EQ(songs().render({.width = 12}),
              "  ID  Title\n"
              "   7  音楽\n"
              "1234  A tit…\n");
}

TEST(Table, NoLineIsWiderThanTheTerminal) {
    for (int width = 10; width < 70; ++width) {
        std::istringstream lines(songs().render({.width = width}));
        for (std::string line; std::getline(lines, line);) {
            EXPECT_LE(displayWidth(line), width) << line;
        }
    }
}

TEST(Table, OnlyTheHeaderIsBold) {
    Table table({{.header = "Artist"}});
    table.addRow({"x"});
    EXPECT_EQ(table.render({.bold = true}), "\x1b[1mArtist\x1b[0m\nx\n");
}

}  // namespace
}  // namespace vorelix
