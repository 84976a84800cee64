#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>
#include <vorelix/playlists/playlist.h>

#include <climits>
#include <cmath>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <iterator>
#include <string>
#include <string_view>
#include <tuple>
#include <utility>
#include <vector>

#include "support/platform_stand_in.h"

namespace {

using stand_in::script;
using stand_in::takeTrace;

ZANO_MEDIA_INFO entry(int id, const std::string &path) {
    ZANO_MEDIA_INFO info{};
    info.id = id;
    path.copy(info.path, sizeof info.path - 1);
    return info;
}

/* Every test has an empty folder of its own, and every case runs through both writers. */
class Writer : public stand_in::Test {
  protected:
    Writer() { folder = mkdtemp((testing::TempDir() + "writer_XXXXXX").data()); }
    ~Writer() override { std::filesystem::remove_all(folder); }

    std::string path(const std::string &name) const { return folder + "/" + name; }

    static std::string content(const std::string &path) {
        std::ifstream file(path, std::ios::binary);
        return {std::istreambuf_iterator<char>(file), {}};
    }

    static int writeList(const std::vector<ZANO_MEDIA_INFO> &entries, const std::string &path) {
        std::vector<ZANO_PLAYLIST_REC> nodes(entries.size());
        for (std::size_t index = 0; index < nodes.size(); ++index) {
            nodes[index].info = entries[index];
            nodes[index].next = index + 1 < nodes.size() ? &nodes[index + 1] : nullptr;
        }
        return ZANOWriteMusicPlaylist(nodes.empty() ? nullptr : nodes.data(), path.c_str());
    }

    static int writeArray(const std::vector<ZANO_MEDIA_INFO> &given, const std::string &path) {
        std::vector<ZANO_MEDIA_INFO> entries = given;
        std::vector<ZANO_MEDIA_INFO *> records;
        records.reserve(entries.size() + 1);
        for (ZANO_MEDIA_INFO &each : entries) {
            records.push_back(&each);
        }
        records.push_back(nullptr);
        return ZANOWriteMusicPlaylistWithMediaList(records.data(), path.c_str());
    }

    /* The bytes that both writers write alike, over a file that was longer. */
    std::string written(const std::vector<ZANO_MEDIA_INFO> &entries, const std::string &file) {
        std::ofstream(file) << std::string(20000, 'x');
        EXPECT_EQ(writeList(entries, file), 0) << file;
        std::string byList = content(file);
        EXPECT_EQ(writeArray(entries, file), 0) << file;
        EXPECT_EQ(content(file), byList);
        struct stat status {};
        EXPECT_EQ(stat(file.c_str(), &status), 0);
        EXPECT_EQ(status.st_mode & 07777U, 0777U);
        return byList;
    }

    std::string folder;
};

constexpr const char *kWplStart =
    "<?wpl version=\"1.0\"?>\r\n<smil>\r\n<head></head>\r\n<body>\r\n<seq>\r\n";
constexpr const char *kWplEnd = "</seq>\r\n</body>\r\n</smil>\n\n";

TEST_F(Writer, TheThreeForms) {
    const std::vector<ZANO_MEDIA_INFO> entries{
        entry(3, path("a&\"<'.mp3")), entry(0, "HTTP://host/x?a=b"), entry(0, "/usb/b.mp3")};
    EXPECT_EQ(written(entries, path("l.WpL")),
              std::string(kWplStart) +
                  "<media src=\"a&\"<'.mp3\"/>\r\n<media src=\"HTTP://host/x?a=b\"/>\r\n"
                  "<media src=\"/usb/b.mp3\"/>\r\n" +
                  kWplEnd);
    EXPECT_EQ(written(entries, path("LIST.M3U")),
              "#EXTM3U\r\na&\"<'.mp3\r\nHTTP://host/x?a=b\r\n/usb/b.mp3\r\n");
    EXPECT_EQ(written(entries, path("l.pls")),
              "[playlist]\r\nFile1=a&\"<'.mp3\r\nFile2=HTTP://host/x?a=b\r\nFile3=/usb/b.mp3\r\n"
              "NumberOfEntries=3\r\nVersion=2\r\n");
    EXPECT_EQ(takeTrace(), "");
}

TEST_F(Writer, WithoutEntriesAndOfUnknownExtension) {
    EXPECT_EQ(written({}, path("l.wpl")), std::string(kWplStart) + kWplEnd);
    EXPECT_EQ(written({}, path("l.m3u")), "#EXTM3U\r\n");
    EXPECT_EQ(written({}, path("l.pls")), "[playlist]\r\nNumberOfEntries=0\r\nVersion=2\r\n");
    std::filesystem::create_directory(path("a.b"));
    for (const char *name : {"l.txt", "l.m3u8", "l.", "a.b/list"}) {
        EXPECT_EQ(written({entry(1, "/a.mp3")}, path(name)), "") << name;
    }
    EXPECT_EQ(takeTrace(), "");
}

TEST_F(Writer, TagsOfEntriesThatAreNoTracks) {
    ZANO_MEDIA_INFO full = entry(0, "http://a");
    full.duration = 215.9F;
    full.year = -1;
    full.disc = 2;
    full.track = 3;
    std::string("T").copy(full.title, 1);
    std::string("A").copy(full.artist, 1);
    std::string("L").copy(full.album, 1);
    std::string("G").copy(full.genre, 1);
    ZANO_MEDIA_INFO track = full;
    track.id = -7;
    ZANO_MEDIA_INFO untitled = entry(0, "http://b");
    untitled.duration = 5;
    untitled.year = 1999;
    std::string("A").copy(untitled.artist, 1);
    EXPECT_EQ(written({full, track, untitled}, path("l.m3u")),
              "#EXTM3U\r\n#EXTINF:215,T\r\n#EXTINFARTIST:A\r\n#EXTINFALBUM:L\r\n#EXTINFGENRE:G\r\n"
              "#EXTINFYEAR:-1\r\n#EXTINFDISC:2\r\n#EXTINFTRACK:3\r\nhttp://a\r\nhttp://a\r\n"
              "#EXTINFARTIST:A\r\n#EXTINFYEAR:1999\r\nhttp://b\r\n");
}

TEST_F(Writer, DurationsBeyondAnInt) {
    const std::pair<float, int> cases[] = {{-1.9F, -1},
                                           {0.9F, 0},
                                           {3e9F, INT_MAX},
                                           {-3e9F, INT_MIN},
                                           {INFINITY, INT_MAX},
                                           {-INFINITY, INT_MIN},
                                           {std::nanf(""), INT_MIN},
                                           {2147483648.0F, INT_MAX}};
    for (const auto &[duration, seconds] : cases) {
        ZANO_MEDIA_INFO song = entry(0, "http://a");
        song.duration = duration;
        song.title[0] = 'T';
        EXPECT_EQ(written({song}, path("l.m3u")),
                  "#EXTM3U\r\n#EXTINF:" + std::to_string(seconds) + ",T\r\nhttp://a\r\n");
    }
}

TEST_F(Writer, PathsFromThePlaylistsFolder) {
    std::filesystem::create_directories(path("p/q"));
    const std::string list = path("p/q/ab.m3u");
    const std::pair<std::string, std::string> cases[] = {
        {path("p/q/s.mp3"), "s.mp3"},
        {path("p/q/d/s.mp3"), "d/s.mp3"},
        {path("p/s.mp3"), "../s.mp3"},
        {path("s.mp3"), "../../s.mp3"},
        {path("p/qq/s.mp3"), "../qq/s.mp3"},
        {path("p/q/a/x.mp3"), "x.mp3"},  // they part at a '/' of the entry
        {path("p/q/ab.m3u"), "ab.m3u"},
        {path("p/q/ab.m3u.mp3"), "ab.m3u.mp3"},
        {path("p/q/a"), "a"},
        {"http:/a", "http:/a"},
    };
    for (const auto &[song, shown] : cases) {
        EXPECT_EQ(written({entry(1, song)}, list), "#EXTM3U\r\n" + shown + "\r\n") << song;
    }
    const std::string line = "3 playlist.cpp (662) Given path is not a absolute path.\n";
    EXPECT_EQ(takeTrace(), line + line);
}

TEST_F(Writer, TooManyLevelsForTheBuffer) {
    const std::string list = folder + std::string(1362, '/') + "l.m3u";
    const std::string song = folder + "0/" + std::string(8, 'x');
    const std::size_t parent = folder.rfind('/') + 1;
    const std::string remainder = song.substr(parent);
    ASSERT_GE(remainder.size(), 4096U - std::string_view("../").size() * 1362);
    EXPECT_EQ(written({entry(1, song)}, list), "#EXTM3U\r\n" + song + "\r\n");
    const std::string line =
        "3 playlist.cpp (688) Path buffer is too small (" + list + ")(" + song + ")(4096)\n";
    EXPECT_EQ(takeTrace(), line + line);
    // The most that fits: 4 095 bytes and the NUL.
    const std::size_t levels = (4095 - remainder.size()) / 3;
    std::string up;
    for (std::size_t level = 0; level < levels; ++level) {
        up += "../";
    }
    const std::string longer = song + std::string(4095 - remainder.size() - 3 * levels, 'y');
    EXPECT_EQ(written({entry(1, longer)}, folder + std::string(levels, '/') + "l.m3u"),
              "#EXTM3U\r\n" + up + longer.substr(parent) + "\r\n");
    EXPECT_EQ(takeTrace(), "");
}

TEST_F(Writer, LongestPaths) {
    const std::string address = "http://" + std::string(4088, 'x');
    EXPECT_EQ(written({entry(1, address)}, path("l.wpl")),
              kWplStart + ("<media src=\"" + address + "\"/>\r\n") + kWplEnd);
}

TEST_F(Writer, FilesThatCannotBeOpenedOrUnlocked) {
    // The mode of a path is changed even when it cannot be opened, here as a folder.
    const std::string asFile = path("folder.m3u");
    const std::string file = path("l.m3u");
    for (const auto &[write, opened, unlocked] :
         {std::tuple{&writeList, "(732)", " (816)"}, std::tuple{&writeArray, "(861)", " (946)"}}) {
        std::filesystem::create_directory(asFile);
        ASSERT_EQ(chmod(asFile.c_str(), 0700), 0);
        EXPECT_EQ(write({}, asFile), -1);
        struct stat status {};
        EXPECT_EQ(stat(asFile.c_str(), &status), 0);
        EXPECT_EQ(status.st_mode & 07777U, 0777U);
        EXPECT_EQ(takeTrace(),
                  "3 playlist.cpp" + std::string(opened) + ": Failed to open " + asFile + ".\n");
        script().unlockFails = true;
        EXPECT_EQ(write({}, file), -1);
        script().unlockFails = false;
        EXPECT_EQ(content(file), "#EXTM3U\r\n");
        EXPECT_EQ(takeTrace(),
                  "3 playlist.cpp" + std::string(unlocked) + " Failed to unlock file.\n");
    }
}

TEST_F(Writer, AFileThatAnotherProcessLocksIsEmptied) {
    const std::string file = path("l.m3u");
    std::ofstream(file) << "kept";
    int ready[2];
    int done[2];
    ASSERT_EQ(pipe(ready), 0);
    ASSERT_EQ(pipe(done), 0);
    const pid_t other = fork();
    if (other == 0) {
        close(done[1]);
        const int descriptor = open(file.c_str(), O_RDWR);
        char byte = flock(descriptor, LOCK_EX) == 0 ? 'y' : 'n';
        static_cast<void>(!write(ready[1], &byte, 1));
        static_cast<void>(!read(done[0], &byte, 1));  // until the test has closed its end
        _exit(0);
    }
    char byte = 0;
    ASSERT_EQ(read(ready[0], &byte, 1), 1);
    ASSERT_EQ(byte, 'y');
    EXPECT_EQ(writeList({entry(1, "/a")}, file), -1);
    EXPECT_EQ(takeTrace(), "3 playlist.cpp (737) Failed to lock file.\n");
    EXPECT_EQ(writeArray({entry(1, "/a")}, file), -1);
    EXPECT_EQ(takeTrace(), "3 playlist.cpp (866) Failed to lock file.\n");
    EXPECT_EQ(content(file), "");
    for (const int end : {ready[0], ready[1], done[0], done[1]}) {
        close(end);
    }
    EXPECT_EQ(waitpid(other, nullptr, 0), other);
    EXPECT_EQ(writeList({}, file), 0);  // a descriptor left open would still hold a lock
}

TEST_F(Writer, BadArgumentsCloseDescriptorZero) {
    const std::string bare =
        folder.substr(0, folder.rfind('/')) + "/bare_" + folder.substr(folder.rfind('_') + 1);
    ASSERT_EQ(bare.find('.'), std::string::npos);
    const struct {
        std::function<int()> call;
        std::string trace;
    } cases[] = {
        {[] { return ZANOWriteMusicPlaylist(nullptr, nullptr); },
         "3 playlist.cpp (721) Bad parameter.\n"},
        {[] { return ZANOWriteMusicPlaylist(nullptr, ""); },
         "3 playlist.cpp (721) Bad parameter.\n"},
        {[] { return writeArray({}, ""); }, "3 playlist.cpp (850) Bad parameter.\n"},
        {[] { return ZANOWriteMusicPlaylistWithMediaList(nullptr, "/nowhere/l.m3u"); },
         "3 playlist.cpp (850) Bad parameter.\n"},
        {[&] { return writeList({}, bare); }, ""},
        {[&] { return writeArray({}, bare); }, ""},
    };
    for (const auto &each : cases) {
        const int kept = dup(STDIN_FILENO);
        ASSERT_NE(kept, -1);
        EXPECT_EQ(each.call(), -1) << each.trace;
        EXPECT_EQ(fcntl(STDIN_FILENO, F_GETFD), -1) << each.trace;
        EXPECT_EQ(dup2(kept, STDIN_FILENO), STDIN_FILENO);
        close(kept);
        EXPECT_EQ(takeTrace(), each.trace);
        EXPECT_NE(access(bare.c_str(), F_OK), 0);
    }
}

}  // namespace
