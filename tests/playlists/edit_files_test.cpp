/* Edits of real files, through the platform's own parser and media database. */
#include <gtest/gtest.h>
#include <vorelix/vorelix.h>
#include <zanoplatform/media_database.h>

#include <string>

#include "families.h"
#include "platform/mediadb/cluster.h"
#include "support/files.h"
#include "system_paths_internal.h"

namespace {

class EditFiles : public testing::Test, protected files::Folder {
  protected:
    EditFiles() {
        files::write(ZANO_PATH_CONF,
                     "mediadb=\"" + zano::mediadb::locationForTest(path("media.db")) + "\"\n");
    }

  private:
    const files::Places places_{ZANO_PATH_CONF};
};

ZANO_PLAYLIST_REC record(const std::string &path, const char *title) {
    ZANO_PLAYLIST_REC made{};
    path.copy(made.info.path, sizeof made.info.path - 1);
    std::string(title).copy(made.info.title, sizeof made.info.title - 1);
    made.info.year = 1999;
    made.info.duration = 61.5;
    return made;
}

/* By id first: the row makes the media database, without which no playlist can be read. */
TEST_F(EditFiles, AppendedInsertedRemovedAndPruned) {
    for (const playlists::Family &family : playlists::kFamilies) {
        const std::string file = path(family.isShared ? "id.m3u" : "path.m3u");
        std::string list = file;
        ASSERT_EQ(ZANOWriteMusicPlaylist(nullptr, file.c_str()), 0);
        if (family.isShared) {
            ZANO_MEDIA_INFO row{};
            file.copy(row.path, sizeof row.path - 1);
            ASSERT_EQ(ZANOPlaylistDBSave(&row), 0);
            ASSERT_EQ(ZANOPlaylistIDGet(file.c_str(), list.data(), static_cast<int>(list.size())),
                      0);
        }
        ZANO_PLAYLIST_REC song = record(path("a.mp3"), "A");
        ZANO_PLAYLIST_REC address = record("http://w", "W");
        EXPECT_EQ(family.appendSongs(list.c_str(), &song, 1), 0);
        EXPECT_EQ(family.updateSongs(list.c_str(), &address, 0, 0), 0);
        EXPECT_EQ(files::read(file),
                  "#EXTM3U\r\n#EXTINF:61,W\r\n#EXTINFYEAR:1999\r\nhttp://w\r\n"
                  "#EXTINF:61,A\r\n#EXTINFYEAR:1999\r\na.mp3\r\n");
        EXPECT_EQ(family.removeSongs(list.c_str(), "2"), 0);
        // The removal does not read year and duration.
        EXPECT_EQ(files::read(file),
                  "#EXTM3U\r\n#EXTINF:0,W\r\nhttp://w\r\n#EXTINF:0,A\r\na.mp3\r\n");
        EXPECT_EQ(family.removeMissing(list.c_str()), 0);
        EXPECT_EQ(files::read(file), "#EXTM3U\r\n#EXTINF:0,W\r\nhttp://w\r\n");
    }
}

}  // namespace
