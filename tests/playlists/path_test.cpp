#include <vorelix/playlists/playlist.h>

#include <array>
#include <string>
#include <tuple>

#include "support/platform_stand_in.h"

namespace {

using stand_in::outcome;

class PathSteps : public stand_in::Test {};

TEST_F(PathSteps, OnlyTheFirstIsTakenOut) {
    const std::string longest(5000, 'a');
    const std::tuple<std::string, int, std::string> cases[] = {
        {"/a/b/../c", 8192, "/a/c"},
        {"/a/b", 8192, "/a/b"},
        {"../x", 8192, "../x"},
        {"a/../x", 8192, "a/x"},
        {"/a/b/../../c", 8192, "/a/../c"},
        {"/../c", 8192, "/c"},
        {"/a/b/..c", 8192, "/ac"},
        {"", 1, ""},
        {longest, 8192, longest},
        {"/a/../" + longest, 8192, "/" + longest.substr(0, 4089)},
        {"/a/b/../cdef", 4, "/a/"},
        {"/a/cdef", 4, "/a/"},
    };
    for (const auto &[path, size, expected] : cases) {
        std::array<char, 8193> out;
        out.fill('#');
        EXPECT_EQ(ZANOPathRelativeToABS(path.c_str(), out.data(), size), 0) << path;
        EXPECT_EQ(out.data(), expected) << path;
        EXPECT_EQ(out[static_cast<std::size_t>(size)], '#') << path;
    }
    char out = '#';
    const std::string bad = "-1 3 playlist.cpp (1222) Bad parameters.\n";
    EXPECT_EQ(outcome(ZANOPathRelativeToABS(nullptr, &out, 1)), bad);
    EXPECT_EQ(outcome(ZANOPathRelativeToABS("/a", nullptr, 1)), bad);
    EXPECT_EQ(outcome(ZANOPathRelativeToABS("/a", &out, 0)), bad);
    EXPECT_EQ(outcome(ZANOPathRelativeToABS("/a", &out, -1)), bad);
    EXPECT_EQ(out, '#');
}

}  // namespace
