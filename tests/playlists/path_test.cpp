#include <vorelix/playlists/playlist.h>

#include <array>
#include <string>

#include "support/platform_stand_in.h"

namespace {

class PathSteps : public stand_in::Test {};

TEST_F(PathSteps, OnlyTheFirstIsTakenOut) {
    const std::string longest(5000, 'a');
    const std::pair<std::string, std::string> cases[] = {
        {"/a/b/../c", "/a/c"},
        {"/music/pl/../song.mp3", "/music/song.mp3"},
        {"/a/b", "/a/b"},
        {"../x", "../x"},
        {"a/../x", "a/x"},
        {"/a/b/../../c", "/a/../c"},
        {"/../c", "/c"},
        {"/a/b/..c", "/ac"},
        {"", ""},
        {longest, longest},
        {"/a/../" + longest, "/" + longest.substr(0, 4089)},
    };
    for (const auto &[path, expected] : cases) {
        std::array<char, 8192> out{};
        EXPECT_EQ(ZANOPathRelativeToABS(path.c_str(), out.data(), out.size()), 0) << path;
        EXPECT_EQ(out.data(), expected) << path;
    }
}

TEST_F(PathSteps, CutToTheBuffer) {
    for (const char *path : {"/a/b/../cdef", "/a/cdef"}) {
        std::array<char, 5> out{};
        EXPECT_EQ(ZANOPathRelativeToABS(path, out.data(), 4), 0);
        EXPECT_STREQ(out.data(), "/a/");
    }
}

TEST_F(PathSteps, BadParameters) {
    char out = '#';
    EXPECT_EQ(ZANOPathRelativeToABS(nullptr, &out, 1), -1);
    EXPECT_EQ(ZANOPathRelativeToABS("/a", nullptr, 1), -1);
    EXPECT_EQ(ZANOPathRelativeToABS("/a", &out, 0), -1);
    EXPECT_EQ(ZANOPathRelativeToABS("/a", &out, -1), -1);
    EXPECT_EQ(out, '#');
    const std::string line = "3 playlist.cpp (1222) Bad parameters.\n";
    EXPECT_EQ(stand_in::takeTrace(), line + line + line + line);
}

}  // namespace
