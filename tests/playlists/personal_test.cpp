#include <dlfcn.h>
#include <glob.h>
#include <vorelix/playlists/playlist.h>

#include <cstdlib>
#include <cstring>
#include <string>
#include <tuple>
#include <utility>
#include <vector>

#include "support/failing_allocator.h"
#include "support/files.h"
#include "support/platform_stand_in.h"

namespace {

using stand_in::Playlists;
using stand_in::takeTrace;

/* What glob() is asked for, and what it answers when a test says so. */
struct Glob {
    std::string asked;
    int failure = 0;
    std::vector<std::string> matches;
};
Glob theGlob;

class Personal : public stand_in::Test {
  protected:
    Personal() {
        theGlob = {};
        std::filesystem::create_directories(folder + "/playlists");
    }

    std::string path(const std::string &name) const { return folder + "/playlists/" + name; }
    void make(const std::vector<std::string> &names) const {
        for (const std::string &name : names) {
            files::write(path(name), "#EXTM3U\r\n");
        }
    }
    std::string line(int id, const std::string &title) const {
        return std::to_string(id) + " " + title + " " + title + " " + path(title + ".m3u") + "\n";
    }

  private:
    files::Folder temporary_;

  protected:
    const std::string folder = temporary_.path("user");
};

TEST_F(Personal, PagesOfMatchesByName) {
    make({"b.m3u", "a.m3u", "c.M3U", ".m3u", "d.pls", "e.wpl", "x.y.m3u"});
    const std::tuple<int, int, std::string> cases[] = {
        {0, 0, line(1, "a") + line(2, "b") + line(3, "x.y")},
        {0, -1, line(1, "a") + line(2, "b") + line(3, "x.y")},
        {1, 1, line(1, "b")},
        {1, 0, line(1, "b") + line(2, "x.y")},
        {2, 9, line(1, "x.y")},
        {3, 1, ""},
        {1, 2147483647, line(1, "b") + line(2, "x.y")},
        {-5, 2, line(1, "a") + line(2, "b")},
    };
    for (const auto &[offset, limit, expected] : cases) {
        Playlists list;
        const int count =
            ZANOPersonalPlaylistListAll(folder.c_str(), list.address(), offset, limit);
        EXPECT_EQ(count, static_cast<int>(ZANOPlaylistCount(list.head())));
        EXPECT_EQ(list.text(), expected) << offset << " " << limit;
    }
    EXPECT_EQ(ZANOPersonalPlaylistTotalGet(folder.c_str()), 3);
    EXPECT_EQ(theGlob.asked, folder + "/playlists/*.m3u 0");
    EXPECT_EQ(takeTrace(), "");
}

TEST_F(Personal, WithoutMatchesTheListIsLeftAlone) {
    ZANO_PLAYLIST nodes[2] = {};
    nodes[0].next = &nodes[1];
    for (const std::string &directory : {folder, path(""), std::string(5000, 'd')}) {
        ZANO_PLAYLIST *list = nodes;
        EXPECT_EQ(ZANOPersonalPlaylistListAll(directory.c_str(), &list, 0, 0), 0) << directory;
        EXPECT_EQ(list, nodes);
        EXPECT_EQ(ZANOPersonalPlaylistTotalGet(directory.c_str()), 0) << directory;
    }
    EXPECT_EQ(theGlob.asked, std::string(4095, 'd') + " 0");
    // Behind the last match it is reversed.
    make({"a.m3u"});
    ZANO_PLAYLIST *list = nodes;
    EXPECT_EQ(ZANOPersonalPlaylistListAll(folder.c_str(), &list, 1, 0), 0);
    EXPECT_EQ(list, &nodes[1]);
    EXPECT_EQ(nodes[1].next, nodes);
}

TEST_F(Personal, FailuresLeaveWhatWasTaken) {
    make({"a.m3u", "b.m3u", ".m3u"});
    const std::string taken = line(2, "b") + line(1, "a");
    const std::pair<std::string, std::string> cases[] = {
        {path("gone.m3u"), ""},
        {".", "3 playlist.cpp:1349 . is not a valid path\n"},
        {folder, "3 playlist.cpp:1354 " + folder.substr(folder.rfind('/') + 1) +
                     " is not a valid filename\n"},
        {path("a.m3u"), "3 playlist.cpp:1360 failed to calloc memory\n"},
    };
    for (const auto &[match, trace] : cases) {
        theGlob.matches = {path("a.m3u"), path("b.m3u"), match, path("a.m3u")};
        failing_allocator::failOnSize(sizeof(ZANO_PLAYLIST), 2);
        Playlists list;
        EXPECT_EQ(ZANOPersonalPlaylistListAll(folder.c_str(), list.address(), 0, 0), -1);
        EXPECT_EQ(list.text(), taken) << match;
        EXPECT_EQ(takeTrace(), trace);
    }
    failing_allocator::failOnSize(0);
    theGlob.matches = {path(".m3u")};
    Playlists untitled;
    EXPECT_EQ(ZANOPersonalPlaylistListAll(folder.c_str(), untitled.address(), 0, 0), 1);
    EXPECT_EQ(untitled.text(), line(1, ""));
}

TEST_F(Personal, OneThatCannotBeExamined) {
    make({"a.m3u", "b.m3u", "z.m3u"});
    std::filesystem::create_symlink("nowhere", path("c.m3u"));
    EXPECT_EQ(ZANOPersonalPlaylistTotalGet(folder.c_str()), -1);
    Playlists page;
    EXPECT_EQ(ZANOPersonalPlaylistListAll(folder.c_str(), page.address(), 0, 2), 2);
    Playlists all;
    EXPECT_EQ(ZANOPersonalPlaylistListAll(folder.c_str(), all.address(), 1, 0), -1);
    EXPECT_EQ(all.text(), line(1, "b"));
    EXPECT_EQ(takeTrace(), "");
}

TEST_F(Personal, NoMemoryForMatchesAndNullArguments) {
    make({"a.m3u"});
    theGlob.failure = GLOB_NOSPACE;
    ZANO_PLAYLIST *list = nullptr;
    EXPECT_EQ(ZANOPersonalPlaylistListAll(folder.c_str(), &list, 0, 0), -1);
    EXPECT_EQ(ZANOPersonalPlaylistTotalGet(folder.c_str()), -1);
    theGlob.failure = 0;
    EXPECT_EQ(ZANOPersonalPlaylistListAll(nullptr, &list, 0, 0), -1);
    EXPECT_EQ(ZANOPersonalPlaylistListAll(folder.c_str(), nullptr, 0, 0), -1);
    EXPECT_EQ(ZANOPersonalPlaylistTotalGet(nullptr), -1);
    EXPECT_EQ(list, nullptr);
    EXPECT_EQ(takeTrace(), "");
}

}  // namespace

/* In place of the C library's, which this calls but for the matches that a test gives; they are
 * made so that globfree() can free them. */
extern "C" int glob(const char *pattern, int flags, int (*onError)(const char *, int),
                    glob_t *found) noexcept {
    theGlob.asked = std::string(pattern) + " " + std::to_string(flags);
    if (theGlob.failure != 0) {
        return theGlob.failure;
    }
    if (theGlob.matches.empty()) {
        using Function = decltype(glob);
        return reinterpret_cast<Function *>(dlsym(RTLD_NEXT, "glob64"))(pattern, flags, onError,
                                                                        found);
    }
    found->gl_pathc = theGlob.matches.size();
    found->gl_offs = 0;
    found->gl_pathv = static_cast<char **>(std::calloc(theGlob.matches.size() + 1, sizeof(char *)));
    for (std::size_t index = 0; index < theGlob.matches.size(); ++index) {
        found->gl_pathv[index] = strdup(theGlob.matches[index].c_str());
    }
    return 0;
}
