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

/* The widest column gives way first; then columns are left out by their rank. */
TEST(Table, IsFittedToTheTerminal) {
    const std::pair<int, const char *> cases[] = {
        {0,
         "  ID  Title                        Artist             Time\n"
         "   7  音楽                                            3:05\n"
         "1234  A title that is rather long  ␛[1mSomebody e\u0301lse\n"},
        {50,
         "  ID  Title                Artist             Time\n"
         "   7  音楽                                    3:05\n"
         "1234  A title that is ra…  ␛[1mSomebody e\u0301lse\n"},
        {45,
         "  ID  Title                 Artist\n"
         "   7  音楽\n"
         "1234  A title that is rat…  ␛[1mSomebody e\u0301lse\n"},
        {12, "  ID  Title\n   7  音楽\n1234  A tit…\n"},
    };
    for (const auto &[width, text] : cases) {
        EXPECT_EQ(songs().render({.width = width}), text) << width;
    }
}

TEST(Table, NoLineIsWiderThanTheTerminal) {
    for (int width = 10; width < 70; ++width) {
        std::istringstream lines(songs().render({.width = width}));
        for (std::string line; std::getline(lines, line);) {
            EXPECT_LE(displayWidth(line), width) << line;
        }
    }
}

}  // namespace
}  // namespace vorelix
