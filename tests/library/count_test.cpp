#include <vorelix/library/musiclib.h>

#include <cerrno>
#include <functional>
#include <string>

#include "support/platform_stand_in.h"

namespace {

using stand_in::outcome;
using stand_in::script;

class Count : public stand_in::Test {};

TEST_F(Count, TextsThatReachTheDatabase) {
    const std::string inRoot = "path like '/volume1/music/%'";
    const struct {
        int songs;
        int category;
        const char *keyword;
        int table;
        std::string condition;
    } cases[] = {
        {0, 0, nullptr, 3, '"' + inRoot + '"'},
        {0, 1, "it's", 3, '"' + inRoot + '"'},
        {1, 0, nullptr, 0, '"' + inRoot + '"'},
        {-1, 5, "", 0, '"' + inRoot + '"'},
        {1, 0, "Bob", 0, "null"},
        {1, 1, "Bob", 0, '"' + inRoot + " and title ilike '%Bob%'\""},
        {1, 4, "'\\", 0, '"' + inRoot + " and genre ilike '%''\\%'\""},
        {2, 5, "a'b", 0,
         '"' + inRoot +
             " and (title ilike '%a''b%' or artist ilike '%a''b%' or album ilike '%a''b%' or "
             "genre ilike '%a''b%')\""},
        {1, 6, "x", 0, '"' + inRoot + " and  ilike '%x%'\""},
    };
    for (const auto &each : cases) {
        script().rowCount = each.songs == 0 ? 0 : 42;
        int count = -5;
        EXPECT_EQ(outcome(ZANOPageTotalRowCount(each.songs, each.category, each.keyword, &count)),
                  "0 open(" + std::to_string(each.table) + ", \"*\", " + each.condition +
                      ", null, null, 0, 0, 0)\nclose\n");
        EXPECT_EQ(count, script().rowCount);
    }
}

TEST_F(Count, FailedOpenLeavesTheCount) {
    script().openFails = true;
    // A condition without a keyword has 4095 bytes.
    script().musicRoot = std::string(4090, 'r');
    int count = -5;
    EXPECT_EQ(
        outcome(ZANOPageTotalRowCount(1, 0, nullptr, &count)),
        "0 open(0, \"*\", \"path like '" + std::string(4084, 'r') + "\", null, null, 0, 0, 0)\n");
    EXPECT_EQ(count, -5);
}

TEST_F(Count, Failures) {
    const struct {
        std::function<void()> prepare;
        int songs;
        int category;
        std::string line;
    } cases[] = {
        {[] { script().linkError = EACCES; }, 0, 0,
         "musiclib.cpp:401 Failed to readlink(" ZANO_ROOT
         "/var/services/music). [Permission denied]"},
        {[] { script().quotesFail = true; }, 1, 0,
         "musiclib.cpp (434) Failed to escape condition."},
        {[] { script().templateFails = true; }, 1, 5,
         "musiclib.cpp (443) Failed to alloc memory 7"},
        {[] { script().templateFails = true; }, 1, 6,
         "musiclib.cpp (449) Failed to alloc memory 7"},
    };
    for (const auto &each : cases) {
        script() = stand_in::Script();
        each.prepare();
        int count = -5;
        EXPECT_EQ(outcome(ZANOPageTotalRowCount(each.songs, each.category, "Bob", &count)),
                  "-1 3 " + each.line + "\n");
        EXPECT_EQ(count, -5);
    }
    EXPECT_EQ(outcome(ZANOPageTotalRowCount(1, 0, nullptr, nullptr)), "-1 ");
}

}  // namespace
