#include <vorelix/playlists/playlist.h>

#include <algorithm>
#include <cstddef>
#include <random>
#include <string>
#include <tuple>
#include <vector>

#include "support/failing_allocator.h"
#include "support/platform_stand_in.h"

namespace {

using stand_in::List;
using stand_in::outcome;
using stand_in::row;
using stand_in::script;

class Lookup : public stand_in::Test {};

TEST_F(Lookup, SongsInTheOrderOfTheIds) {
    script().rows = {row(0, "zero"), row(3, "three"), row(7, "seven"), row(-1, "below zero"),
                     row(12, "twelve")};
    const std::pair<const char *, const char *> cases[] = {
        {"7,3,7", "7 seven, 3 three"},
        {"12,99,3", "12 twelve, 3 three"},
        {"99", ""},
        {"3 ,7", "7 seven"},
        {" 3,\t7,+12", "3 three, 7 seven, 12 twelve"},
        {"3x,x,0xC, ,7", "7 seven"},
        {",3,,", "0 zero, 3 three"},
        {"-1,4294967295", "-1 below zero"},
        {"4294967299,18446744073709551619,3", "-1 below zero, 3 three"},  // 2^32 + 3, 2^64 + 3
        {"4294967294,-4294967299,7", "-1 below zero, 7 seven"},
    };
    for (const auto &[ids, songs] : cases) {
        List list;
        EXPECT_EQ(
            outcome(ZANOMusicListGetByID(list.address(), ids)),
            "0 open(0, \"*\", \"id in (" + std::string(ids) + ")\", null, null, 0, 0, 0)\nclose\n");
        EXPECT_EQ(list.text(), songs) << ids;
    }
}

/* Whatever makes lookups quick must place nodes as a plain walk over the fetched list does: the
 * last row first, each node once. */
TEST_F(Lookup, PlacesNodesAsAPlainWalkDoes) {
    std::mt19937 random(20240601);
    for (int round = 0; round < 12; ++round) {
        const int range = round % 2 == 0 ? 40 : 20000;  // many rows of one id, or few
        const int step = round % 3 == 0 ? 4096 : 1;
        std::vector<ZANO_MEDIA_INFO> walked;
        walked.reserve(300);
        for (int index = 0; index < 300; ++index) {
            walked.push_back(row(static_cast<int>(random() % static_cast<unsigned>(range)) * step,
                                 std::to_string(index)));
        }
        script().rows.assign(walked.rbegin(), walked.rend());

        std::string ids;
        std::string expected;
        for (int index = 0; index < 200; ++index) {
            const int id = walked.empty() || index % 5 == 0
                               ? static_cast<int>(random() % static_cast<unsigned>(range)) * step
                               : walked[random() % walked.size()].id;
            ids += (ids.empty() ? "" : ",") + std::to_string(id);
            const auto found = std::find_if(walked.begin(), walked.end(),
                                            [id](const auto &each) { return each.id == id; });
            if (found != walked.end()) {
                expected +=
                    (expected.empty() ? "" : ", ") + std::to_string(id) + " " + found->title;
                walked.erase(found);
            }
        }
        List list;
        ASSERT_EQ(ZANOMusicListGetByID(list.address(), ids.c_str()), 0);
        ASSERT_EQ(list.text(), expected) << "round " << round;
    }
}

TEST_F(Lookup, Failures) {
    List list;
    const std::string bad = "-1 3 playlist.cpp (97) Bad parameter.\n";
    EXPECT_EQ(outcome(ZANOMusicListGetByID(nullptr, "1")), bad);
    EXPECT_EQ(outcome(ZANOMusicListGetByID(list.address(), nullptr)), bad);
    EXPECT_EQ(outcome(ZANOMusicListGetByID(list.address(), "")), bad);

    script().rows = {row(3, "three")};
    script().stringListFails = true;
    EXPECT_EQ(ZANOMusicListGetByID(list.address(), "3"), 0) << "without it nothing is placed";
    EXPECT_EQ(list.head(), nullptr);
    stand_in::takeTrace();

    script().openFails = true;
    ZANO_PLAYLIST_REC stale{};
    *list.address() = &stale;
    EXPECT_EQ(outcome(ZANOMusicListGetByID(list.address(), "1,'x")),
              "-1 open(0, \"*\", \"id in (1,'x)\", null, null, 0, 0, 0)\n"
              "3 playlist.cpp (113) Failed to open media database (id in (1,'x)).\n");
    EXPECT_EQ(list.head(), nullptr);
}

TEST_F(Lookup, OutOfMemory) {
    const std::string opened = "open(0, \"*\", \"id in (3,7)\", null, null, 0, 0, 0)\n";
    const std::tuple<std::size_t, int, std::string> cases[] = {
        {35, 0, "3 playlist.cpp (104) Failed to alloc memory 35\n"},
        {7344, 0, opened + "3 playlist.cpp (121) Failed to alloc 7344\nclose\n"},
        {7344, 1, opened + "3 playlist.cpp (121) Failed to alloc 7344\nclose\n"},
    };
    script().rows = {row(3, "three"), row(7, "seven")};
    for (const auto &[size, after, trace] : cases) {
        failing_allocator::failOnSize(size, after);
        List list;
        EXPECT_EQ(outcome(ZANOMusicListGetByID(list.address(), "3,7")), "-1 " + trace);
        EXPECT_TRUE(failing_allocator::hasFailed()) << trace;
        EXPECT_EQ(list.head(), nullptr) << trace;
    }
}

}  // namespace
