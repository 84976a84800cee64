#include "playlist_draft.h"

#include <gtest/gtest.h>
#include <zanoplatform/media_database.h>

#include <fstream>

#include "failure.h"
#include "support/files.h"
#include "system_paths_internal.h"

namespace vorelix {
namespace {

namespace fs = std::filesystem;

/* A playlist of two files that no database knows. */
class Drafts : public testing::Test, protected files::Folder {
  protected:
    Drafts() {
        files::write(ZANO_PATH_CONF, "mediadb=\"sqlite:" + path("media.db") + "\"\n");
        EXPECT_EQ(MediaInfoDBSave(MEDIA_TABLE_PLAYLISTS, std::make_unique<ZANO_MEDIA_INFO>().get()),
                  0);
        fs::create_directory(folder_);
        files::write(file_, kOld);
    }

    const files::Places places_{ZANO_PATH_CONF};
    static Entries reversed(const Entries &entries) { return {entries.rbegin(), entries.rend()}; }

    static constexpr const char *kOld = "#EXTM3U\r\na.mp3\r\nb.mp3\r\n";
    static constexpr const char *kReversed = "#EXTM3U\r\nb.mp3\r\na.mp3\r\n";
    const fs::path folder_ = path("lists");
    const fs::path file_ = folder_ / "p.m3u";
};

/* The library's edits do not know of the draft. */
TEST_F(Drafts, AnotherProgramsEditMeanwhileIsKept) {
    int calls = 0;
    EXPECT_TRUE(editPlaylist(file_, deadlineOf(60), [&](const Entries &entries) {
        if (++calls == 1) {
            std::ofstream(file_, std::ios::app) << "c.mp3\r\n";
        }
        return reversed(entries);
    }));
    EXPECT_EQ(calls, 2);
    EXPECT_EQ(files::read(file_), "#EXTM3U\r\nc.mp3\r\nb.mp3\r\na.mp3\r\n");
    EXPECT_THROW(editPlaylist(file_, deadlineOf(0),
                              [&](const Entries &entries) {
                                  std::ofstream(file_, std::ios::app) << "d.mp3\r\n";
                                  return reversed(entries);
                              }),
                 Failure);
    EXPECT_EQ(files::read(file_), "#EXTM3U\r\nc.mp3\r\nb.mp3\r\na.mp3\r\nd.mp3\r\n");
    EXPECT_EQ(files::countIn(folder_), 1);
}

TEST_F(Drafts, WhatKilledEditsLeave) {
    const fs::path draft = folder_ / ".p.vorelix.m3u";
    for (const bool isLink : {true, false}) {
        files::write(file_, kOld);
        if (isLink) {
            fs::create_hard_link(file_, draft);  // where there is no rename to a new name only
        } else {
            files::write(draft, "#EXTM3U\r\nlost.mp3\r\n");
        }
        EXPECT_THROW(editPlaylist(file_, deadlineOf(60),
                                  [](const Entries &entries) {
                                      setPath(*entries.front(), "/no line\nof a playlist");
                                      return reversed(entries);
                                  }),
                     Failure);
        EXPECT_EQ(files::read(file_), kOld);
        EXPECT_EQ(files::countIn(folder_), 1);
    }
    EXPECT_TRUE(editPlaylist(file_, deadlineOf(60), reversed));
    EXPECT_EQ(files::read(file_), kReversed);
}

TEST_F(Drafts, NamesAsLongAsTheyMayBe) {
    const fs::path file = folder_ / (std::string(251, 'n') + ".m3u");
    fs::rename(file_, file);
    EXPECT_TRUE(editPlaylist(file, deadlineOf(60), reversed));
    EXPECT_EQ(files::read(file), kReversed);
}

}  // namespace
}  // namespace vorelix
