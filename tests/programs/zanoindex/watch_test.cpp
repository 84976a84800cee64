#include <csignal>

#include "index_test.h"

namespace zano::index {
namespace {

class WatchTest : public IndexTest {
  protected:
    void start() {
        process_ = std::make_unique<Process>(
            program::Start{ZANOINDEX_PROGRAM, argumentsOf({"--json", "--watch", music()})});
        EXPECT_FALSE(parsed(process_->readLine())["stopped"].asBool());
    }

    /* Reads summaries until so many songs in all were added, updated and removed. */
    void await(unsigned added, unsigned updated, unsigned removed) {
        Json::Value sum;
        const auto isReached = [&] {
            return sum["added"].asUInt() >= added && sum["updated"].asUInt() >= updated &&
                   sum["removed"].asUInt() >= removed;
        };
        while (!isReached() && !HasFailure()) {
            const auto summary = parsed(process_->readLine());
            for (const char *name : {"added", "updated", "removed"}) {
                sum[name] = sum[name].asUInt() + summary[name].asUInt();
            }
        }
    }

    std::unique_ptr<Process> process_;
};

TEST_F(WatchTest, FollowsFilesAndFolders) {
    add("a/1.mp3");
    add("b/2.mp3");
    start();

    add("a/new.ogg", "ogg");
    await(1, 0, 0);
    EXPECT_EQ(paths(), (Lines{"a/1.mp3", "a/new.ogg", "b/2.mp3"}));

    // a folder in a new folder, and a file that is put there once both are watched
    add("c/d/3.mp3");
    await(1, 0, 0);
    add("c/d/4.mp3");
    await(1, 0, 0);
    EXPECT_EQ(paths().size(), 5U);

    add("a/1.mp3", "flac");
    await(0, 1, 0);

    fs::rename(music() + "/c", music() + "/renamed");
    await(2, 0, 2);
    add("renamed/d/5.mp3");
    await(1, 0, 0);

    // an album moved in from elsewhere, and links
    fs::create_directories(path("elsewhere/album"));
    fs::copy_file(sample("opus"), path("elsewhere/album/6.opus"));
    fs::rename(path("elsewhere/album"), music() + "/album");
    fs::create_hard_link(music() + "/b/2.mp3", music() + "/b/hard.mp3");
    fs::create_symlink(music() + "/b/2.mp3", music() + "/b/soft.mp3");
    await(3, 0, 0);

    // a playlist comes and goes
    files::write(music() + "/b/list.m3u", "2.mp3\n");
    EXPECT_EQ(parsed(process_->readLine())["playlistsAdded"], 1);
    fs::remove(music() + "/b/list.m3u");
    EXPECT_EQ(parsed(process_->readLine())["playlistsRemoved"], 1);

    // moved out, and deleted
    fs::rename(music() + "/album", path("elsewhere/album"));
    fs::remove_all(music() + "/renamed");
    await(0, 0, 4);
    EXPECT_EQ(paths(), (Lines{"a/1.mp3", "a/new.ogg", "b/2.mp3", "b/hard.mp3", "b/soft.mp3"}));
    EXPECT_EQ(process_->stop(SIGINT).status, 0);
}

TEST_F(WatchTest, NamesWhatItCannotRead) {
    add("a.mp3");
    start();
    files::write(music() + "/b.mp3", "no music");
    const auto summary = parsed(process_->readLine());
    EXPECT_EQ(summary["failed"].size(), 1U);
    const auto ended = process_->stop(SIGTERM);
    EXPECT_EQ(ended.status, 0);
    EXPECT_TRUE(contains(ended.err, "/b.mp3: not an audio file"));
}

TEST_F(WatchTest, EndsWhenNothingIsLeft) {
    add("a.mp3");
    start();
    fs::rename(music(), path("moved"));
    const auto ended = process_->wait();
    EXPECT_EQ(ended.status, 1);
    EXPECT_TRUE(contains(ended.err, "no folder is left to watch"));
    EXPECT_EQ(paths().size(), 1U) << "a folder that is gone keeps its songs";
}

}  // namespace
}  // namespace zano::index
