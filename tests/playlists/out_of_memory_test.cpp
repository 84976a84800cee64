#include <vorelix/playlists/playlist.h>

#include <array>
#include <cstddef>
#include <functional>
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

/* The condition of ids and that of a path, and the second node of a list. */
TEST_F(LookupOutOfMemory, EachAllocationOfTheCatalogueIsReported) {
    std::array<char, 8> out{};
    stand_in::Playlists list;
    const auto byIds = [&] { return ZANOPlayListListGetByID(list.address(), "3,7"); };
    const auto all = [&] { return ZANOPlaylistListAll(list.address(), 0, 0, 0); };
    const auto id = [&] { return ZANOPlaylistIDGet("/it's", out.data(), out.size()); };
    const auto title = [&] { return ZANOPlaylistTitleGetByPath("/it's", out.data(), out.size()); };
    const struct {
        std::function<int()> call;
        std::size_t size;
        int after;
        std::string trace;
    } cases[] = {
        {byIds, 39, 0, "3 playlist.cpp (180) Failed to alloc memory 39\n"},
        {byIds, sizeof(ZANO_PLAYLIST), 1,
         "open(3, \"path\", \"id in (3,7)\", null, null, 0, 0, 0)\nclose\n"
         "3 playlist.cpp (196) Failed to alloc 4616\n"},
        {all, sizeof(ZANO_PLAYLIST), 1,
         "open(3, \"*\", \"path like '/volume1/music/%'\", null, "
         "\"lower(title) asc, lower(album) \", 0, 0, 1)\n"
         "3 playlist.cpp (386) Failed to alloc 4616\nclose\n"},
        {id, 11, 0, "3 playlist.cpp (297) Failed to alloc(11)\n"},
        {id, 18, 0, "3 playlist.cpp (306) Failed to alloc(18)\n"},
        {title, 11, 0, "3 playlist.cpp:568 Failed to calloc(11) Cannot allocate memory\n"},
    };
    stand_in::script().rows = {stand_in::row(3, "three"), stand_in::row(7, "seven")};
    for (const auto &each : cases) {
        failing_allocator::failOnSize(each.size, each.after);
        EXPECT_EQ(each.call(), -1) << each.trace;
        EXPECT_TRUE(failing_allocator::hasFailed()) << each.trace;
        EXPECT_EQ(stand_in::takeTrace(), each.trace);
        EXPECT_EQ(list.head(), nullptr) << each.trace;
    }
}

}  // namespace
