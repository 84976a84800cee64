#include <vorelix/library/musiclib.h>

#include <cerrno>
#include <functional>
#include <string>
#include <tuple>

#include "support/platform_stand_in.h"

namespace {

using stand_in::outcome;
using stand_in::script;

class Count : public stand_in::Test {};

TEST_F(Count, TextsThatReachTheDatabase) {
    const std::string inRoot = "path like '/volume1/music/%'";
    const std::tuple<int, int, const char *, int, std::string> cases[] = {
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
    int count = -5;
    for (const auto &[songs, category, keyword, table, condition] : cases) {
        script().rowCount = songs == 0 ? 0 : 42;
        EXPECT_EQ(outcome(ZANOPageTotalRowCount(songs, category, keyword, &count)),
                  "0 open(" + std::to_string(table) + ", \"*\", " + condition +
                      ", null, null, 0, 0, 0)\nclose\n");
        EXPECT_EQ(count, script().rowCount);
    }
    script().openFails = true;
    // A condition without a keyword has 4095 bytes.
    script().musicRoot = std::string(4090, 'r');
    EXPECT_EQ(
        outcome(ZANOPageTotalRowCount(1, 0, nullptr, &count)),
        "0 open(0, \"*\", \"path like '" + std::string(4084, 'r') + "\", null, null, 0, 0, 0)\n");
    EXPECT_EQ(count, 42);
}

TEST_F(Count, Failures) {
    const std::tuple<std::function<void()>, int, int, std::string> cases[] = {
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
    for (const auto &[prepare, songs, category, line] : cases) {
        script() = stand_in::Script();
        prepare();
        int count = -5;
        EXPECT_EQ(outcome(ZANOPageTotalRowCount(songs, category, "Bob", &count)),
                  "-1 3 " + line + "\n");
        EXPECT_EQ(count, -5);
    }
    EXPECT_EQ(outcome(ZANOPageTotalRowCount(1, 0, nullptr, nullptr)), "-1 ");
}

}  // namespace
