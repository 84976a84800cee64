/* Edits of real files, through the platform's own parser and media database. */
#include <gtest/gtest.h>
#include <unistd.h>
#include <vorelix/vorelix.h>
#include <zanoplatform/media_database.h>

#include <array>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>

#include "system_paths_internal.h"

namespace {

class EditFiles : public testing::Test {
  protected:
    EditFiles() : folder(mkdtemp((testing::TempDir() + "edit_files_XXXXXX").data())) {
        std::filesystem::create_directories(folder + "/playlists");
        std::filesystem::create_directories(std::filesystem::path(ZANO_PATH_CONF).parent_path());
        std::ofstream(ZANO_PATH_CONF) << "mediadb=\"sqlite:" << folder << "/media.db\"\n";
    }
    ~EditFiles() override {
        std::filesystem::remove(ZANO_PATH_CONF);
        std::filesystem::remove_all(folder);
    }

    std::string path(const std::string &name) const { return folder + "/playlists/" + name; }
    static std::string contents(const std::string &path) {
        std::ifstream file(path, std::ios::binary);
        return {std::istreambuf_iterator<char>(file), {}};
    }

    std::string folder;
};

ZANO_PLAYLIST_REC record(const std::string &path, const char *title) {
    ZANO_PLAYLIST_REC made{};
    path.copy(made.info.path, sizeof made.info.path - 1);
    std::string(title).copy(made.info.title, sizeof made.info.title - 1);
    made.info.year = 1999;
    made.info.duration = 61.5;
    return made;
}

/* Appended, inserted, removed and pruned. By id first: the row makes the media database, without
 * which no playlist can be read. */
TEST_F(EditFiles, ByIdAndByPath) {
    const struct {
        const char *name;
        std::string appended;
        std::string inserted;
        std::string removed;
        std::string pruned;
    } cases[] = {
        {"l.m3u", "#EXTM3U\r\n#EXTINF:61,A\r\n#EXTINFYEAR:1999\r\na.mp3\r\n",
         "#EXTM3U\r\n#EXTINF:61,W\r\n#EXTINFYEAR:1999\r\nhttp://w\r\n"
         "#EXTINF:61,A\r\n#EXTINFYEAR:1999\r\na.mp3\r\n",
         // The removal does not read year and duration.
         "#EXTM3U\r\n#EXTINF:0,W\r\nhttp://w\r\n#EXTINF:0,A\r\na.mp3\r\n",
         "#EXTM3U\r\n#EXTINF:0,W\r\nhttp://w\r\n"},
        {"l.pls", "[playlist]\r\nFile1=a.mp3\r\nNumberOfEntries=1\r\nVersion=2\r\n",
         "[playlist]\r\nFile1=http://w\r\nFile2=a.mp3\r\nNumberOfEntries=2\r\nVersion=2\r\n",
         "[playlist]\r\nFile1=http://w\r\nFile2=a.mp3\r\nNumberOfEntries=2\r\nVersion=2\r\n",
         "[playlist]\r\nFile1=http://w\r\nNumberOfEntries=1\r\nVersion=2\r\n"},
    };
    for (const bool byId : {true, false}) {
        for (const auto &each : cases) {
            const std::string file = path(each.name);
            ASSERT_EQ(ZANOWriteMusicPlaylist(nullptr, file.c_str()), 0);
            std::array<char, 16> id{};
            if (byId) {
                ZANO_MEDIA_INFO row{};
                file.copy(row.path, sizeof row.path - 1);
                ASSERT_EQ(ZANOPlaylistDBSave(&row), 0);
                ASSERT_EQ(ZANOPlaylistIDGet(file.c_str(), id.data(), id.size()), 0);
            }
            ZANO_PLAYLIST_REC song = record(path("a.mp3"), "A");
            ZANO_PLAYLIST_REC address = record("http://w", "W");
            EXPECT_EQ(byId ? ZANOPlaylistAppendSongs(id.data(), &song, 1)
                           : ZANOPersonalPlaylistAppendSongs(file.c_str(), &song, 1),
                      0);
            EXPECT_EQ(contents(file), each.appended);
            EXPECT_EQ(byId ? ZANOPlaylistUpdateSongs(id.data(), &address, 0, 0)
                           : ZANOPersonalPlaylistUpdateSongs(file.c_str(), &address, 0, 0),
                      0);
            EXPECT_EQ(contents(file), each.inserted);
            EXPECT_EQ(byId ? ZANOPlaylistRemoveSongs(id.data(), "2")
                           : ZANOPersonalPlaylistRemoveSongs(file.c_str(), "2"),
                      0);
            EXPECT_EQ(contents(file), each.removed);
            EXPECT_EQ(byId ? ZANOPlaylistRemoveMissing(id.data())
                           : ZANOPersonalPlaylistRemoveMissing(file.c_str()),
                      0);
            EXPECT_EQ(contents(file), each.pruned);
        }
    }
}

}  // namespace
