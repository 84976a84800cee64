#include <unistd.h>
#include <vorelix/config/config.h>
#include <vorelix/ipod/ipod.h>

#include <climits>
#include <sstream>
#include <string>
#include <tuple>

#include "support/failing_allocator.h"
#include "support/files.h"
#include "support/platform_stand_in.h"
#include "system_paths_internal.h"

namespace {

namespace fs = std::filesystem;
using stand_in::outcome;
using stand_in::takeTrace;

const std::string kFolder = ZANO_PATH_IPOD_FOLDER;
const std::string kTracks = kFolder + "tracks.m3u";
const std::string kThree = "#title: One\n/1.mp3\n#title: Two\n/2.mp3\n#title: Three\n/3.mp3\n";

/* Line ends can be seen. */
std::string shown(const std::string &text) {
    std::string out;
    for (const char c : text) {
        out += c == '\n' ? "\\n" : c == '\r' ? "\\r" : std::string(1, c);
    }
    return out;
}

/* "title,artist,album,genre,duration,bitrate,frequency,path" */
std::string text(const ZANO_MEDIA_INFO &info) {
    std::ostringstream text;
    for (const char *field : {info.title, info.artist, info.album, info.genre}) {
        text << shown(field) << ",";
    }
    text << static_cast<int>(info.duration) << "," << info.bitrate << "," << info.frequency << ",";
    return text.str() + shown(info.path);
}

std::string text(const stand_in::List &list) {
    std::string all;
    for (const ZANO_PLAYLIST_REC *node = list.head(); node != nullptr; node = node->next) {
        all += (all.empty() ? "" : "; ") + text(node->info);
    }
    return all;
}

/* "result: tracks" */
std::string listed(const std::string &path, int offset = 0, int limit = 0) {
    stand_in::List list;
    const int result = ZANOIPodListSongsAll(path.c_str(), list.address(), offset, limit);
    return std::to_string(result) + ": " + text(list);
}

/* "result of total: tracks" */
std::string listedByDefault(int offset, int limit) {
    stand_in::List list;
    int total = -7;
    const int result = ZANOIPodInfoGetAll(list.address(), offset, limit, &total);
    return std::to_string(result) + " of " + std::to_string(total) + ": " + text(list);
}

/* "result: track", where the track is filled with x before. */
std::string got(int index) {
    ZANO_MEDIA_INFO info{};
    for (char *field : {info.title, info.artist, info.album, info.genre, info.path}) {
        field[0] = 'x';
    }
    const int result = ZANOIPodInfoGet(&info, index);
    return std::to_string(result) + ": " + text(info);
}

class IPod : public stand_in::Test {
  protected:
    IPod() {
        fs::create_directories(kFolder);
        EXPECT_EQ(ZANOSonmiraRestoreConf(), 1);
    }
    static void write(const std::string &tracks) { files::write(kTracks, tracks); }

  private:
    const files::Places places_{ZANO_PATH_AUDIO_FOLDER};
};

TEST_F(IPod, TracksAreReadByTheThreeReaders) {
    const std::string all =
        "#title: Song\r\n#artist: Someone\n#ALBUM: Some: Album \n#genre: Rock\n#duration: 215\n"
        "#BITRATE: 128\n#frequency: 44100\n  /mnt/a b.mp3\t\r\n";
    const struct {
        std::string file;
        const char *list;   // of ZANOIPodListSongsAll
        const char *page;   // of ZANOIPodInfoGetAll
        const char *first;  // of ZANOIPodInfoGet
    } cases[] = {
        {all, "1: Song,Someone,Some: Album ,Rock,215,0,0,/mnt/a b.mp3",
         "0 of 1: Song\\r\\n,Someone\\n,Some: Album \\n,Rock\\n,215,0,0,/mnt/a b.mp3",
         "0: Song,Someone,Some: Album,Rock,215,128000,44100,x"},
        {"", "0: ", "0 of 0: ", "0: x,x,x,x,0,0,0,x"},
        // What stands before the first title, and lines that begin with a line end.
        {"#EXTM3U\n/a\n#artist: b\n\r\n\n\r#title: c\n#Titles of: d\n\n\r\n/e\n/f\n",
         "1: d,,,,0,0,0,/e", "0 of 1: d\\n,,,,0,0,0,/e", "0: d,x,x,x,0,0,0,x"},
        // No path, and no line end.
        {"#title: a\n#artist: b", "1: a,b,,,0,0,0,", "0 of 1: a\\n,b,,,0,0,0,",
         "0: a,b,x,x,0,0,0,x"},
        {"#title: a", "1: a,,,,0,0,0,", "0 of 1: a,,,,0,0,0,", "0: a,x,x,x,0,0,0,x"},
        // The frequency ends a track for one reader, the path for the others.
        {"#title: a\n/1\n#artist: b\n#frequency: 5\n#album: c\n", "1: a,,,,0,0,0,/1",
         "0 of 1: a\\n,,,,0,0,0,/1", "0: a,b,x,x,0,0,5,x"},
        {"#title: a\n#frequency: 5\n#album: c\n/1", "1: a,,c,,0,0,0,/1",
         "0 of 1: a\\n,,c\\n,,0,0,0,/1", "0: a,x,x,x,0,0,5,x"},
        {"#title: a\n#frequency:  \n#album: c\n", "1: a,,c,,0,0,0,", "0 of 1: a\\n,,c\\n,,0,0,0,",
         "0: a,x,x,x,0,0,0,x"},
        // Values that are empty, missing, or no numbers.
        {"#title: a\n#artist:\n#album: \n#genre\n#duration:5\n#bitrate: x\n \t\n", "1: a,,,,0,0,0,",
         "0 of 1: a\\n,,\\n,,0,0,0,", "0: a,x,x,x,0,0,0,x"},
        {"#title: a\n#bitrate: 9999999\n#duration: -12.9\n#frequency: 99999999999\n/1",
         "1: a,,,,-12,0,0,/1", "0 of 1: a\\n,,,,-12,0,0,/1",
         "0: a,x,x,x,-12,2147483647,2147483647,x"},
    };
    for (const auto &each : cases) {
        write(each.file);
        EXPECT_EQ(listed(kTracks), each.list) << each.file;
        EXPECT_EQ(listedByDefault(0, 10), each.page) << each.file;
        EXPECT_EQ(got(1), each.first) << each.file;
    }
    EXPECT_EQ(takeTrace(), "");
}

TEST_F(IPod, ASecondTitleIsLoggedAndSkipped) {
    write("#title: a\n#artist: b\n#TITLE: c\n#album: d\n/1\n#title: e\n/2");
    EXPECT_EQ(listed(kTracks), "2: a,b,d,,0,0,0,/1; e,,,,0,0,0,/2");
    EXPECT_EQ(takeTrace(), "3 ipod:338 Bad Format. Found another #title.\n");
    EXPECT_EQ(listedByDefault(1, 1), "0 of 2: e\\n,,,,0,0,0,/2");
    EXPECT_EQ(takeTrace(), "3 ipod 195 Bad Format. Found another #title.\n");
    EXPECT_EQ(got(1), "0: a,b,d,x,0,0,0,x");
    const std::string line = "3 ipod 74 Bad Format. Found another #title.\n";
    EXPECT_EQ(takeTrace(), line + line);
}

TEST_F(IPod, ListsAreCutToPages) {
    write(kThree);
    const struct {
        int offset;
        int limit;
        const char *listed;
        const char *page = "";
    } cases[] = {{0, 0, "0 One, 0 Two, 0 Three"},
                 {1, 1, "0 Two", "0 Two\n"},
                 {1, 0, "0 Two, 0 Three"},
                 {0, 2, "0 One, 0 Two", "0 One\n, 0 Two\n"},
                 {2, 9, "0 Three", "0 Three\n"},
                 {3, 1, ""},
                 {-5, 1, "0 One", "0 One\n"},
                 {0, INT_MIN, "0 One, 0 Two, 0 Three"},
                 {INT_MAX, INT_MAX, ""},
                 {INT_MIN, INT_MAX, "0 One, 0 Two, 0 Three", "0 One\n, 0 Two\n, 0 Three\n"}};
    for (const auto &[offset, limit, listed, paged] : cases) {
        SCOPED_TRACE(std::to_string(offset) + ", " + std::to_string(limit));
        stand_in::List list;
        EXPECT_EQ(ZANOIPodListSongsAll(kTracks.c_str(), list.address(), offset, limit), 3);
        EXPECT_EQ(list.text(), listed);
        stand_in::List page;
        int total = 0;
        EXPECT_EQ(ZANOIPodInfoGetAll(page.address(), offset, limit, &total), 0);
        EXPECT_EQ(total, 3);
        EXPECT_EQ(page.text(), paged);
    }
    stand_in::List page;
    EXPECT_EQ(ZANOIPodInfoGetAll(page.address(), 0, 1, nullptr), 0);
}

TEST_F(IPod, OneTrackIsFoundByItsNumber) {
    write("#title: a\n/1\n  #title:  b  \n#title: \n#title:\n#title: e\n#frequency: 1\n#title: f");
    const std::string none = "0: x,x,x,x,0,0,0,x";
    EXPECT_EQ(got(2), "0: b,x,x,x,0,0,1,x");
    EXPECT_EQ(got(3), "0: e,x,x,x,0,0,1,x") << "in the place of the empty ones";
    EXPECT_EQ(got(4), "0: e,x,x,x,0,0,1,x");
    EXPECT_EQ(got(5), "0: e,x,x,x,0,0,1,x") << "the empty ones are counted before it";
    EXPECT_EQ(got(6), "0: f,x,x,x,0,0,0,x");
    EXPECT_EQ(got(7), none);
    EXPECT_EQ(got(INT_MAX), none);
    takeTrace();
    const std::string line = "3 ipod (30) Bad parameters.\n";
    EXPECT_EQ(got(0), "-1" + none.substr(1));
    EXPECT_EQ(got(INT_MIN), "-1" + none.substr(1));
    EXPECT_EQ(ZANOIPodInfoGet(nullptr, 1), -1);
    EXPECT_EQ(takeTrace(), line + line + line);
}

TEST_F(IPod, LongLinesAreTakenInPieces) {
    const std::string title(300, 't');
    const std::string path = "/" + std::string(5000, 'p');
    write("#title: " + title + "\n#artist: " + std::string(254, 'a') + "\n" + path +
          "\n#title: next\n");
    const std::string fields =
        title.substr(0, 254) + "," + std::string(254, 'a') + ",,,0,0,0," + path.substr(0, 4095);
    EXPECT_EQ(listed(kTracks), "2: " + fields + "; next,,,,0,0,0,");
    EXPECT_EQ(listedByDefault(0, 9), "0 of 2: " + fields + "; next\\n,,,,0,0,0,");
    EXPECT_EQ(got(1), "0: " + title.substr(0, 254) + "," + std::string(254, 'a') + ",x,x,0,0,0,x");
}

TEST_F(IPod, TheDefaultListIsSetInTheConfiguration) {
    write(kThree);
    EXPECT_EQ(got(1).substr(0, 6), "0: One");
    EXPECT_NE(files::read(ZANO_PATH_AUDIO_CONF).find("AS_Default_IPod_PLS=\"" + kTracks + "\"\n"),
              std::string::npos);
    takeTrace();
    fs::remove_all(kFolder);
    EXPECT_EQ(got(1).substr(0, 3), "-1:");
    EXPECT_EQ(takeTrace(), "");
    EXPECT_EQ(listedByDefault(0, 5), "-1 of -7: ");
    EXPECT_EQ(takeTrace(), "3 ipod(176): Failed to open " + kFolder + ".\n");

    // What the library renames into place cannot be a folder's.
    fs::remove_all(ZANO_PATH_AUDIO_CONF);
    files::write(ZANO_PATH_AUDIO_CONF, std::string(1 << 20, '\n') + "\n");
    const auto notSet = [](int line) {
        return std::string(
                   "3 config(22): value of [AS_Default_IPod_PLS] is empty.\n"
                   "3 config(141): Failed to set value of key \"AS_Default_IPod_PLS\" "
                   "to " ZANO_PATH_AUDIO_CONF ".\n3 ipod (") +
               std::to_string(line) + ") Failed to set default IPod playlist.\n";
    };
    EXPECT_EQ(got(1).substr(0, 3), "-1:");
    EXPECT_EQ(takeTrace(), notSet(39));
    EXPECT_EQ(listedByDefault(0, 5), "-1 of -7: ");
    EXPECT_EQ(takeTrace(), notSet(169));

    fs::remove(ZANO_PATH_AUDIO_CONF);
    testing::internal::CaptureStdout();
    EXPECT_EQ(ZANOIPodInfoGet(nullptr, 1), -1);
    EXPECT_EQ(ZANOIPodInfoGetAll(nullptr, 0, 1, nullptr), -1);
    EXPECT_NE(testing::internal::GetCapturedStdout(), "");
    EXPECT_EQ(takeTrace(), "") << "the configuration comes before the arguments";
}

TEST_F(IPod, ListsThatFailAreEmpty) {
    EXPECT_EQ(outcome(ZANOIPodInfoGetAll(nullptr, 0, 1, nullptr)),
              "-1 3 ipod (160) Bad parameters.\n");
    stand_in::List list;
    EXPECT_EQ(ZANOIPodListSongsAll(nullptr, list.address(), 0, 0), 0);
    EXPECT_EQ(ZANOIPodListSongsAll(kTracks.c_str(), nullptr, 0, 0), 0);
    EXPECT_EQ(takeTrace(), "3 ipod:310 Bad parameters.\n3 ipod:310 Bad parameters.\n");
    EXPECT_EQ(listed(kTracks), "0: ");
    EXPECT_EQ(takeTrace(), "3 ipod:316 Failed to open " + kTracks + ".\n");
    // A folder can be opened but not read.
    fs::create_directory(kTracks);
    EXPECT_EQ(listed(kTracks), "0: ");
    EXPECT_EQ(listedByDefault(0, 5), "-1 of 0: ");
    EXPECT_EQ(got(1).substr(0, 3), "-1:");
    EXPECT_EQ(takeTrace(), "");
}

TEST_F(IPod, ListsAreReleasedWhenMemoryRunsOut) {
    write(kThree);
    for (const auto &[passes, expected] : {std::pair{0, "0: "}, {1, "-1: "}}) {
        failing_allocator::failOnSize(sizeof(ZANO_PLAYLIST_REC), passes);
        EXPECT_EQ(listed(kTracks), expected);
        EXPECT_TRUE(failing_allocator::hasFailed());
        EXPECT_EQ(takeTrace(), "3 ipod (392) Failed to alloc 7344\n");
        failing_allocator::failOnSize(sizeof(ZANO_PLAYLIST_REC), passes);
        EXPECT_EQ(listedByDefault(0, 5), "-1 of -7: ");
        EXPECT_EQ(takeTrace(), "3 ipod (248) Failed to alloc 7344\n");
    }
}

TEST_F(IPod, PlaylistsAreTheFilesWithADot) {
    const files::Folder here;
    const fs::path before = fs::current_path();
    fs::current_path(here.path(""));
    const std::string longName(255 - 4, 'n');
    for (const char *name :
         {"Road Trip.m3u", "B.c.m3u", "tracks.m3u", "Tracks.m3u", "nodot", ".hidden.m3u", "end."}) {
        files::write(kFolder + name, "");
    }
    files::write(kFolder + longName + ".m3u", "");
    fs::create_directory(kFolder + "folder.m3u");
    fs::create_symlink("nowhere", kFolder + "dangling.m3u");
    fs::create_symlink("nodot", kFolder + "link.m3u");
    stand_in::Playlists list;
    EXPECT_EQ(ZANOIPodPlaylistGetAll(list.address()), 0);
    const auto line = [](const std::string &title, const std::string &name) {
        return "0 " + title + "  " + kFolder + name + "\n";
    };
    EXPECT_EQ(list.text(), line("B.c", "B.c.m3u") + line("Road Trip", "Road Trip.m3u") +
                               line("Tracks", "Tracks.m3u") + line("end", "end.") +
                               line("link", "link.m3u") + line(longName, longName + ".m3u"));
    EXPECT_EQ(fs::current_path(), fs::canonical(here.path("")));

    fs::remove_all(kFolder);
    fs::create_directory(kFolder);
    stand_in::Playlists none;
    EXPECT_EQ(ZANOIPodPlaylistGetAll(none.address()), 0);
    EXPECT_EQ(none.head(), nullptr);
    EXPECT_EQ(fs::current_path(), fs::canonical(here.path("")));
    fs::current_path(before);
    EXPECT_EQ(takeTrace(), "");
}

TEST_F(IPod, PlaylistsThatCannotBeListed) {
    const fs::path before = fs::current_path();
    stand_in::Playlists list;
    EXPECT_EQ(outcome(ZANOIPodPlaylistGetAll(nullptr)), "-1 3 ipod (451) Bad parameter.\n");
    files::write(kFolder + "a.m3u", "");
    files::write(kFolder + "b.m3u", "");
    failing_allocator::failOnSize(sizeof(ZANO_PLAYLIST), 1);
    EXPECT_EQ(ZANOIPodPlaylistGetAll(list.address()), -1);
    EXPECT_EQ(list.head(), nullptr);
    EXPECT_EQ(takeTrace(), "3 ipod (481) Failed to alloc 7344\n");
    EXPECT_EQ(fs::current_path(), fs::canonical(kFolder)) << "as settled";

    fs::remove_all(kFolder);
    EXPECT_EQ(outcome(ZANOIPodPlaylistGetAll(list.address())),
              "-1 3 ipod (457) Failed to get current directory\n");
    fs::current_path(before);
    EXPECT_EQ(ZANOIPodPlaylistGetAll(list.address()), -1);
    files::write(kFolder.substr(0, kFolder.size() - 1), "a file");
    EXPECT_EQ(ZANOIPodPlaylistGetAll(list.address()), -1);
    EXPECT_EQ(fs::current_path(), before);
    EXPECT_EQ(takeTrace(), "");
}

}  // namespace
