#include "index_test.h"
#include "mediadb/sqlite/engine.h"
#include "system_paths_internal.h"

namespace zano::index {
namespace {

class DeleteTest : public IndexTest {
  protected:
    void SetUp() override {
        for (const char *name : {"a/1.mp3", "a/2.mp3", "a/3.mp3"}) {
            add(name);
        }
        ASSERT_EQ(run({music()}).status, 0);
        ZANO_MEDIA_INFO list = {};
        list_.copy(list.path, list_.size());
        this->engine()->savePlaylist(list);
    }

    std::size_t playlists() const {
        const auto engine = this->engine();
        return static_cast<std::size_t>(engine->count({mediadb::Table::Playlists, {}, {}}));
    }

    const std::string list_ = "/lists/a.m3u";
};

TEST_F(DeleteTest, RemovesTheRowsOfAFile) {
    const auto ended = run({"-d", music() + "/a/1.mp3", "--delete", list_, "-d", "/nowhere"});
    EXPECT_EQ(ended.status, 0) << ended.err;
    EXPECT_EQ(ended.out, music() + "/a/1.mp3: removed\n" + list_ + ": removed\n" +
                             "/nowhere: there was nothing to remove\n");
    EXPECT_EQ(paths(), (Lines{"a/2.mp3", "a/3.mp3"}));
    EXPECT_EQ(playlists(), 0U);
    // as a user may write it, and when the file is gone
    fs::create_directory_symlink(music(), path("link"));
    fs::remove(music() + "/a/2.mp3");
    EXPECT_EQ(run({"-d", path("link/a/./2.mp3")}).status, 0);
    EXPECT_EQ(paths(), Lines{"a/3.mp3"});
}

TEST_F(DeleteTest, AsTheLibraryStartsIt) {
    const files::Places places{ZANO_PATH_CONF};
    files::write(ZANO_PATH_CONF, "mediadb=\"" + location() + "\"\n");
    for (const auto &path : {music() + "/a/1.mp3", list_, std::string("/nowhere")}) {
        const auto ended = Process({ZANOINDEX_PROGRAM, {"-d", path}}).wait();
        EXPECT_EQ(ended.status, 0) << path;
        EXPECT_EQ(ended.out + ended.err, "") << "its output is somebody's answer";
    }
    EXPECT_EQ(paths(), (Lines{"a/2.mp3", "a/3.mp3"}));
    EXPECT_EQ(playlists(), 0U);

    files::write(ZANO_PATH_CONF, "mediadb=\"sqlite:" + music() + "\"\n");
    const auto ended = Process({ZANOINDEX_PROGRAM, {"-d", "/nowhere"}}).wait();
    EXPECT_EQ(ended.status, 1) << "a failure is told";
    EXPECT_TRUE(contains(ended.err, music()));
}

}  // namespace
}  // namespace zano::index
