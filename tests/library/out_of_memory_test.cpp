#include <vorelix/library/musiclib.h>

#include <cstddef>
#include <functional>
#include <string>
#include <tuple>

#include "support/failing_allocator.h"
#include "support/platform_stand_in.h"

namespace {

using stand_in::List;

/* The keyword is 20 letters long: its buffers have 41 and 83 bytes. */
const char *const kKeyword = "abcdefghijklmnopqrst";

class MusicOutOfMemory : public stand_in::Test {};

TEST_F(MusicOutOfMemory, EachAllocationIsReported) {
    ZANO_PLAYLIST_REC stale{};
    const auto listing = [&stale](ZANO_PLAYLIST_REC **list) {
        *list = &stale;
        return ZANOMusicListAll(list, 0, kKeyword, "random", 1, 0, 0);
    };
    const auto browse = [&stale](ZANO_PLAYLIST_REC **list) {
        *list = &stale;
        return ZANOMusicBrowse(0, list, nullptr, nullptr, nullptr, nullptr, 0, 0);
    };
    const auto count = [](ZANO_PLAYLIST_REC **) {
        int rows = 0;
        return ZANOPageTotalRowCount(1, 1, kKeyword, &rows);
    };
    const std::string listed = "open(0, \"*\", null, null, \"RANDOM()\", 0, 0, 0)\n";
    const std::string browsed = "open(0, \"*\", null, null, null, 0, 0, 0)\n";
    const std::tuple<std::function<int(ZANO_PLAYLIST_REC **)>, std::size_t, int, std::string>
        cases[] = {
            {listing, 41, 0, "3 musiclib.cpp (125) Failed to malloc(41)\n"},
            {listing, 83, 0, "3 musiclib.cpp (130) Failed to malloc(83)\n"},
            {listing, 7344, 0, listed + "3 musiclib.cpp (176) Failed to alloc 7344\nclose\n"},
            {listing, 7344, 1, listed + "3 musiclib.cpp (176) Failed to alloc 7344\nclose\n"},
            {browse, 7344, 0, browsed + "3 musiclib.cpp (347) Failed to alloc 7344\nclose\n"},
            {browse, 7344, 1, browsed + "3 musiclib.cpp (347) Failed to alloc 7344\nclose\n"},
            {count, 41, 0, "3 musiclib.cpp (430) Failed to malloc(41)\n"},
        };
    stand_in::script().rows = {stand_in::row(1, "a"), stand_in::row(2, "b")};
    for (const auto &[call, size, after, trace] : cases) {
        failing_allocator::failOnSize(size, after);
        List list;
        EXPECT_EQ(stand_in::outcome(call(list.address())), "-1 " + trace);
        EXPECT_TRUE(failing_allocator::hasFailed()) << trace;
        EXPECT_EQ(list.head(), nullptr) << trace;
    }
    // Memory that is missing only behind the last row is not missed.
    failing_allocator::failOnSize(7344, 2);
    List list;
    EXPECT_EQ(ZANOMusicListAll(list.address(), 0, nullptr, "random", 1, 0, 0), 0);
    EXPECT_TRUE(failing_allocator::hasFailed());
    EXPECT_EQ(list.text(), "1 a, 2 b");
}

}  // namespace
