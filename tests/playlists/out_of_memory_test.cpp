#include <vorelix/playlists/playlist.h>

#include <cstddef>
#include <string>

#include "support/failing_allocator.h"
#include "support/platform_stand_in.h"

namespace {

class LookupOutOfMemory : public stand_in::Test {};

TEST_F(LookupOutOfMemory, EachAllocationIsReported) {
    const std::string opened = "open(0, \"*\", \"id in (3,7)\", null, null, 0, 0, 0)\n";
    const struct {
        std::size_t size;
        int after;
        std::string trace;
    } cases[] = {
        {35, 0, "3 playlist.cpp (104) Failed to alloc memory 35\n"},
        {7344, 0, opened + "3 playlist.cpp (121) Failed to alloc 7344\nclose\n"},
        {7344, 1, opened + "3 playlist.cpp (121) Failed to alloc 7344\nclose\n"},
    };
    stand_in::script().rows = {stand_in::row(3, "three"), stand_in::row(7, "seven")};
    for (const auto &each : cases) {
        failing_allocator::failOnSize(each.size, each.after);
        stand_in::List list;
        EXPECT_EQ(ZANOMusicListGetByID(list.address(), "3,7"), -1) << each.trace;
        EXPECT_TRUE(failing_allocator::hasFailed()) << each.trace;
        EXPECT_EQ(stand_in::takeTrace(), each.trace);
        EXPECT_EQ(list.head(), nullptr) << each.trace;
    }
}

}  // namespace
