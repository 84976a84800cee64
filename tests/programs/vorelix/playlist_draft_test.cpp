#include "playlist_draft.h"

#include <gtest/gtest.h>
#include <unistd.h>
#include <zanoplatform/media_database.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>

#include "failure.h"
#include "system_paths_internal.h"

namespace vorelix {
namespace {

namespace fs = std::filesystem;

std::string contentsOf(const fs::path &path) {
    std::ostringstream text;
    text << std::ifstream(path, std::ios::binary).rdbuf();
    return text.str();
}

/* A playlist of two files that no database knows. */
class Drafts : public testing::Test {
  protected:
    Drafts() {
        std::string name = fs::temp_directory_path() / "vorelix-test-XXXXXX";
        folder_ = mkdtemp(name.data());
        fs::create_directories(fs::path(ZANO_PATH_CONF).parent_path());
        std::ofstream(ZANO_PATH_CONF) << "mediadb=\"sqlite:" << folder_.string() << ".db\"\n";
        EXPECT_EQ(MediaInfoDBSave(MEDIA_TABLE_PLAYLISTS, std::make_unique<ZANO_MEDIA_INFO>().get()),
                  0);
        file_ = folder_ / "p.m3u";
        std::ofstream(file_) << kOld;
    }
    ~Drafts() override {
        fs::remove(ZANO_PATH_CONF);
        fs::remove_all(folder_);
        for (const char *ending : {".db", ".db-wal", ".db-shm"}) {
            fs::remove(folder_.string() + ending);
        }
    }

    static Entries reversed(const Entries &entries) { return {entries.rbegin(), entries.rend()}; }

    size_t filesOfFolder() const {
        return static_cast<size_t>(
            std::distance(fs::directory_iterator(folder_), fs::directory_iterator()));
    }

    static constexpr const char *kOld = "#EXTM3U\r\na.mp3\r\nb.mp3\r\n";
    static constexpr const char *kReversed = "#EXTM3U\r\nb.mp3\r\na.mp3\r\n";
    fs::path folder_;
    fs::path file_;
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
    EXPECT_EQ(contentsOf(file_), "#EXTM3U\r\nc.mp3\r\nb.mp3\r\na.mp3\r\n");
    EXPECT_THROW(editPlaylist(file_, deadlineOf(0),
                              [&](const Entries &entries) {
                                  std::ofstream(file_, std::ios::app) << "d.mp3\r\n";
                                  return reversed(entries);
                              }),
                 Failure);
    EXPECT_EQ(contentsOf(file_), "#EXTM3U\r\nc.mp3\r\nb.mp3\r\na.mp3\r\nd.mp3\r\n");
    EXPECT_EQ(filesOfFolder(), 1U);
}

TEST_F(Drafts, WhatKilledEditsLeave) {
    const fs::path draft = folder_ / ".p.vorelix.m3u";
    for (const bool isLink : {true, false}) {
        std::ofstream(file_) << kOld;
        if (isLink) {
            fs::create_hard_link(file_, draft);  // where there is no rename to a new name only
        } else {
            std::ofstream(draft) << "#EXTM3U\r\nlost.mp3\r\n";
        }
        EXPECT_THROW(editPlaylist(file_, deadlineOf(60),
                                  [](const Entries &entries) {
                                      setPath(*entries.front(), "/no line\nof a playlist");
                                      return reversed(entries);
                                  }),
                     Failure);
        EXPECT_EQ(contentsOf(file_), kOld);
        EXPECT_EQ(filesOfFolder(), 1U);
    }
    EXPECT_TRUE(editPlaylist(file_, deadlineOf(60), reversed));
    EXPECT_EQ(contentsOf(file_), kReversed);
}

TEST_F(Drafts, NamesAsLongAsTheyMayBe) {
    const fs::path file = folder_ / (std::string(251, 'n') + ".m3u");
    fs::rename(file_, file);
    EXPECT_TRUE(editPlaylist(file, deadlineOf(60), reversed));
    EXPECT_EQ(contentsOf(file), kReversed);
}

}  // namespace
}  // namespace vorelix
