#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>
#include <vorelix/playlists/playlist.h>

#include <climits>
#include <cmath>
#include <cstddef>
#include <functional>
#include <string>
#include <tuple>
#include <utility>
#include <vector>

#include "support/files.h"
#include "support/platform_stand_in.h"

namespace {

using stand_in::outcome;
using stand_in::script;
using stand_in::takeTrace;

ZANO_MEDIA_INFO entry(int id, const std::string &path) {
    ZANO_MEDIA_INFO info{};
    info.id = id;
    path.copy(info.path, sizeof info.path - 1);
    return info;
}

unsigned modeOf(const std::string &path) {
    struct stat status {};
    EXPECT_EQ(stat(path.c_str(), &status), 0) << path;
    return status.st_mode & 07777U;
}

/* Every case runs through both writers. */
class Writer : public stand_in::Test, protected files::Folder {
  protected:
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
    static std::string written(const std::vector<ZANO_MEDIA_INFO> &entries,
                               const std::string &file) {
        files::write(file, std::string(20000, 'x'));
        EXPECT_EQ(writeList(entries, file), 0) << file;
        std::string byList = files::read(file);
        EXPECT_EQ(writeArray(entries, file), 0) << file;
        EXPECT_EQ(files::read(file), byList);
        EXPECT_EQ(modeOf(file), 0777U);
        return byList;
    }
};

const std::string kWplStart =
    "<?wpl version=\"1.0\"?>\r\n<smil>\r\n<head></head>\r\n<body>\r\n<seq>\r\n";
const std::string kWplEnd = "</seq>\r\n</body>\r\n</smil>\n\n";

TEST_F(Writer, TheThreeForms) {
    const std::vector<ZANO_MEDIA_INFO> entries{
        entry(3, path("a&\"<'.mp3")), entry(0, "HTTP://host/x?a=b"), entry(0, "/usb/b.mp3")};
    EXPECT_EQ(written(entries, path("l.WpL")),
              kWplStart +
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
    EXPECT_EQ(written({}, path("l.wpl")), kWplStart + kWplEnd);
    EXPECT_EQ(written({}, path("l.m3u")), "#EXTM3U\r\n");
    std::filesystem::create_directory(path("a.b"));
    EXPECT_EQ(written({}, path("a.b/l.pls")), "[playlist]\r\nNumberOfEntries=0\r\nVersion=2\r\n");
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
    full.title[0] = 'T';
    full.artist[0] = 'A';
    full.album[0] = 'L';
    full.genre[0] = 'G';
    ZANO_MEDIA_INFO track = full;
    track.id = -7;
    ZANO_MEDIA_INFO untitled = entry(0, "http://b");
    untitled.duration = 5;
    untitled.year = 1999;
    untitled.artist[0] = 'A';
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
    std::vector<ZANO_MEDIA_INFO> songs;
    std::string expected = "#EXTM3U\r\n";
    for (const auto &[duration, seconds] : cases) {
        songs.push_back(entry(0, "http://a"));
        songs.back().duration = duration;
        songs.back().title[0] = 'T';
        expected += "#EXTINF:" + std::to_string(seconds) + ",T\r\nhttp://a\r\n";
    }
    EXPECT_EQ(written(songs, path("l.m3u")), expected);
}

TEST_F(Writer, PathsFromThePlaylistsFolder) {
    std::filesystem::create_directories(path("p/q"));
    const std::pair<std::string, std::string> cases[] = {
        {path("p/q/s.mp3"), "s.mp3"},   {path("p/q/d/s.mp3"), "d/s.mp3"},
        {path("s.mp3"), "../../s.mp3"}, {path("p/qq/s.mp3"), "../qq/s.mp3"},
        {path("p/q/a/x.mp3"), "x.mp3"},  // they part at a '/' of the entry
        {path("p/q/ab.m3u"), "ab.m3u"}, {path("p/q/ab.m3u.mp3"), "ab.m3u.mp3"},
        {path("p/q/a"), "a"},           {"http:/a", "http:/a"},
    };
    for (const auto &[song, shown] : cases) {
        EXPECT_EQ(written({entry(1, song)}, path("p/q/ab.m3u")), "#EXTM3U\r\n" + shown + "\r\n");
    }
    const std::string line = "3 playlist.cpp (662) Given path is not a absolute path.\n";
    EXPECT_EQ(takeTrace(), line + line);
}

TEST_F(Writer, RelativePathsHave4095Bytes) {
    constexpr int kLevels = 1000;
    const std::string folder = std::filesystem::path(path("l.m3u")).parent_path();
    const std::string list = folder + std::string(kLevels, '/') + "l.m3u";
    std::string up;
    for (int level = 0; level < kLevels; ++level) {
        up += "../";
    }
    // Beside the folder, with its name in front.
    const std::size_t parent = folder.rfind('/') + 1;
    std::string song = folder;
    song.resize(parent + 4095 - up.size(), 'x');
    EXPECT_EQ(written({entry(1, song)}, list), "#EXTM3U\r\n" + up + song.substr(parent) + "\r\n");
    EXPECT_EQ(takeTrace(), "");
    song += 'x';
    EXPECT_EQ(written({entry(1, song)}, list), "#EXTM3U\r\n" + song + "\r\n");
    const std::string line =
        "3 playlist.cpp (688) Path buffer is too small (" + list + ")(" + song + ")(4096)\n";
    EXPECT_EQ(takeTrace(), line + line);
}

/* Only of a record whose path has no NUL: what follows the path in it is shown as well. */
TEST_F(Writer, LinesAreCutTo4127Bytes) {
    ZANO_MEDIA_INFO endless = entry(1, "http://");
    const std::string more(5000, 'x');
    more.copy(reinterpret_cast<char *>(&endless) + offsetof(ZANO_MEDIA_INFO, path) + 7, 5000);
    for (const auto &[name, start, end] :
         {std::tuple{"l.m3u", std::string("#EXTM3U\r\n"), std::string()},
          std::tuple{"l.wpl", kWplStart + "<media src=\"", kWplEnd}}) {
        const std::string line = start.substr(start.rfind('\n') + 1) + "http://";
        EXPECT_EQ(written({endless}, path(name)),
                  start + "http://" + more.substr(0, 4127 - line.size()) + end);
    }
}

TEST_F(Writer, FilesThatCannotBeOpenedLockedOrUnlocked) {
    const std::string closed = path("folder.m3u");
    std::filesystem::create_directory(closed);
    const std::string file = path("l.m3u");
    const std::string unit = "-1 3 playlist.cpp";
    for (const auto &[write, opened, locked, unlocked] :
         {std::tuple{&writeList, "(732)", " (737)", " (816)"},
          std::tuple{&writeArray, "(861)", " (866)", " (946)"}}) {
        ASSERT_EQ(chmod(closed.c_str(), 0700), 0);
        EXPECT_EQ(outcome(write({}, closed)), unit + opened + ": Failed to open " + closed + ".\n");
        EXPECT_EQ(modeOf(closed), 0777U);

        script().unlockFails = true;
        EXPECT_EQ(outcome(write({}, file)), unit + unlocked + " Failed to unlock file.\n");
        script().unlockFails = false;
        EXPECT_EQ(files::read(file), "#EXTM3U\r\n");

        // The file is closed all the same, or it would still be locked here.
        const int other = open(file.c_str(), O_RDWR);
        ASSERT_EQ(flock(other, LOCK_EX | LOCK_NB), 0);
        EXPECT_EQ(outcome(write({}, file)), unit + locked + " Failed to lock file.\n");
        close(other);
        EXPECT_EQ(files::read(file), "");
    }
}

TEST_F(Writer, BadArgumentsCloseDescriptorZero) {
    const std::string file = path("l.m3u");
    files::write(file, "kept");
    ASSERT_EQ(chmod(file.c_str(), 0600), 0);
    const std::string bare = path("bare");
    ASSERT_EQ(bare.find('.'), std::string::npos);
    const std::string listLine = "3 playlist.cpp (721) Bad parameter.\n";
    const std::string arrayLine = "3 playlist.cpp (850) Bad parameter.\n";
    const std::pair<std::function<int()>, std::string> cases[] = {
        {[] { return ZANOWriteMusicPlaylist(nullptr, nullptr); }, listLine},
        {[] { return writeList({}, ""); }, listLine},
        {[] { return writeArray({}, ""); }, arrayLine},
        {[&] { return ZANOWriteMusicPlaylistWithMediaList(nullptr, file.c_str()); }, arrayLine},
        {[&] { return writeList({}, bare); }, ""},
        {[&] { return writeArray({}, bare); }, ""},
    };
    for (const auto &[call, trace] : cases) {
        const int kept = dup(STDIN_FILENO);
        ASSERT_NE(kept, -1);
        EXPECT_EQ(outcome(call()), "-1 " + trace);
        EXPECT_EQ(fcntl(STDIN_FILENO, F_GETFD), -1) << trace;
        EXPECT_EQ(dup2(kept, STDIN_FILENO), STDIN_FILENO);
        close(kept);
    }
    EXPECT_FALSE(std::filesystem::exists(bare));
    EXPECT_EQ(files::read(file), "kept");
    EXPECT_EQ(modeOf(file), 0777U);  // on every way out
}

}  // namespace
