#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>
#include <vorelix/player/audiofile.h>

#include <cstdint>
#include <memory>
#include <string>
#include <tuple>
#include <vector>

#include "support/failing_allocator.h"
#include "support/files.h"
#include "support/platform_stand_in.h"

namespace {

namespace fs = std::filesystem;
using stand_in::outcome;
using stand_in::takeTrace;

/* Its bytes, as they come on this machine. */
std::string header(int first, int second, int third, int fourth) {
    const int words[] = {first, second, third, fourth};
    return {reinterpret_cast<const char *>(words), sizeof words};
}

std::string song(int id) {
    return stand_in::bytes(stand_in::row(id, "song " + std::to_string(id)));
}

std::string songs(int count) {
    std::string bytes;
    for (int id = 1; id <= count; ++id) {
        bytes += song(id);
    }
    return bytes;
}

/* "first second third total: id id", or "null". */
std::string text(const PlaylistInfo *list) {
    if (list == nullptr) {
        return "null";
    }
    const PlayerInfo &info = *list->playerInfo;
    std::string text = std::to_string(info.state[0]) + " " + std::to_string(info.state[1]) + " " +
                       std::to_string(info.state[2]) + " " + std::to_string(info.total) + ":";
    for (const ZANO_MEDIA_INFO *each : list->songs) {
        text += " " + std::to_string(each->id);
    }
    return text;
}

std::string loaded(const std::string &path, int start = 0, int count = 0) {
    return text(
        std::unique_ptr<PlaylistInfo>(AudioFile::PlaylistFileLoad(path.c_str(), start, count))
            .get());
}

int save(const std::string &path, PlaylistInfo &list) {
    return AudioFile::PlaylistFileSave(path.c_str(), &list);
}

void fill(PlaylistInfo &list, int count) {
    for (int id = 1; id <= count; ++id) {
        auto *const record = static_cast<ZANO_MEDIA_INFO *>(std::malloc(sizeof(ZANO_MEDIA_INFO)));
        *record = stand_in::row(id, "song " + std::to_string(id));
        list.songs.push_back(record);
    }
}

/* Holds the lock of a file as another process would, for the lock is that of an open file. */
class Locker {
  public:
    explicit Locker(const std::string &path) : file_(open(path.c_str(), O_RDONLY)) {
        EXPECT_EQ(flock(file_, LOCK_EX | LOCK_NB), 0);
    }
    ~Locker() { close(file_); }
    Locker(const Locker &) = delete;
    Locker &operator=(const Locker &) = delete;

  private:
    int file_;
};

class Queue : public stand_in::Test {
  protected:
    const files::Folder folder_;
    const std::string path_ = folder_.path("queue");
};

TEST_F(Queue, IsTheBytesOfItsRecords) {
    PlaylistInfo list;
    EXPECT_EQ(save(path_, list), 0);
    EXPECT_EQ(files::read(path_), header(0, 1, 0, 0));
    PlayerInfo info{{7, -1, 3}, 99};
    list.setPlayerInfo(&info);
    list.setPlayerInfo(nullptr);
    fill(list, 2);
    EXPECT_EQ(save(path_, list), 0);
    EXPECT_TRUE(files::read(path_) == header(7, -1, 3, 99) + songs(2));
    EXPECT_EQ(loaded(path_), "7 -1 3 2: 1 2");

    const std::unique_ptr<PlaylistInfo> again(AudioFile::PlaylistFileLoad(path_.c_str(), 1, 1));
    ASSERT_EQ(again->songs.size(), 1U);
    EXPECT_TRUE(stand_in::bytes(*again->songs[0]) == song(2));
    EXPECT_EQ(takeTrace(), "");
}

TEST_F(Queue, IsLoadedByTheSizeOfItsFile) {
    const std::string three = header(4, 5, 6, 1000) + songs(3);
    const std::tuple<std::string, int, int, const char *> cases[] = {
        {"", 0, 0, "0 1 0 0:"},
        {header(4, 5, 6, 7).substr(0, 15), 0, 0, "0 1 0 0:"},
        {header(4, 5, 6, 7), 0, 0, "4 5 6 0:"},
        {header(4, 5, 6, 7), 0, 5, "4 5 6 0:"},
        {(header(4, 5, 6, 7) + songs(1)).substr(0, 16 + 7335), 0, 0, "4 5 6 0:"},
        {three, 0, 0, "4 5 6 3: 1 2 3"},
        {three + std::string(100, 'x'), 0, 9, "4 5 6 3: 1 2 3"},
        {three + std::string(100, 'x'), 3, 0, "4 5 6 3:"},
        {three, 1, 0, "4 5 6 3: 2 3"},
        {three, 1, 1, "4 5 6 3: 2"},
        {three, 3, 0, "4 5 6 3:"},
        {three, 5, 0, "4 5 6 3:"},
        {three, 0, INT32_MIN, "4 5 6 3:"},
        {three, -1, 0, "4 5 6 3:"},
        // 2^29 times 7336 is 0 in 32 bits.
        {three, 536870912 + 1, 0, "4 5 6 3: 2 3"},
    };
    for (const auto &[file, start, count, list] : cases) {
        files::write(path_, file);
        EXPECT_EQ(loaded(path_, start, count), list) << file.size() << " bytes from " << start;
        EXPECT_TRUE(files::read(path_) == file);
    }
    EXPECT_EQ(loaded(folder_.path("missing")), "0 1 0 0:");
    EXPECT_FALSE(fs::exists(folder_.path("missing")));
    const std::unique_ptr<PlaylistInfo> none(AudioFile::PlaylistFileLoad(nullptr, 0, 0));
    EXPECT_EQ(text(none.get()), "0 1 0 0:");
    EXPECT_EQ(takeTrace(), "");
    EXPECT_EQ(loaded(folder_.path(".")), "0 1 0 0:");
    EXPECT_EQ(takeTrace(), "3 audiofile:51 Failed to open " + folder_.path(".") + ".\n");
}

TEST_F(Queue, LockedByAnotherIsNotLoadedAndDeletedWhenSaved) {
    files::write(path_, header(0, 1, 0, 0) + songs(1));
    {
        const Locker locker(path_);
        EXPECT_EQ(loaded(path_), "null");
        EXPECT_EQ(takeTrace(), "3 audiofile:56 Failed to lock file.\n");
        EXPECT_EQ(files::read(path_).size(), 16U + 7336U);
    }
    EXPECT_EQ(loaded(path_), "0 1 0 1: 1");
    const Locker locker(path_);
    PlaylistInfo list;
    EXPECT_EQ(outcome(save(path_, list)), "-1 3 audiofile:129 Failed to lock file.\n");
    EXPECT_FALSE(fs::exists(path_));
}

TEST_F(Queue, ThatCannotBeUnlockedIsAFailure) {
    files::write(path_, header(0, 1, 0, 0) + songs(1));
    stand_in::script().unlockFails = true;
    EXPECT_EQ(loaded(path_, 1), "0 1 0 1:") << "nothing is unlocked at the end of the file";
    EXPECT_EQ(takeTrace(), "");
    EXPECT_EQ(loaded(path_), "null");
    EXPECT_EQ(takeTrace(), "3 audiofile:101 Failed to unlock file.\n");
    PlaylistInfo list;
    EXPECT_EQ(outcome(save(path_, list)), "-1 3 audiofile:146 Failed to unlock file.\n");
    EXPECT_FALSE(fs::exists(path_));
}

TEST_F(Queue, IsDeletedByAFailedSave) {
    PlaylistInfo list;
    fill(list, 3);
    for (const auto &[size, line] : {std::pair{15, "134"}, {16 + 7336 + 100, "140"}}) {
        files::write(path_, "before");
        {
            const files::FullDisk disk(static_cast<rlim_t>(size));
            EXPECT_EQ(save(path_, list), -1);
        }
        EXPECT_EQ(takeTrace(), std::string("3 audiofile:") + line +
                                   " Failed to write the playlist to file.(File too large)\n");
        EXPECT_FALSE(fs::exists(path_));
    }
    fs::create_symlink("/dev/full", path_);
    EXPECT_EQ(
        outcome(save(path_, list)),
        "-1 3 audiofile:134 Failed to write the playlist to file.(No space left on device)\n");
    EXPECT_FALSE(fs::exists(fs::symlink_status(path_)));

    EXPECT_EQ(outcome(save(folder_.path("none/queue"), list)),
              "-1 3 audiofile:124 Failed to open " + folder_.path("none/queue") + ".\n");
    EXPECT_EQ(outcome(AudioFile::PlaylistFileSave(nullptr, &list)),
              "-1 3 audiofile:124 Failed to open (null).\n");
    files::write(path_, "before");
    EXPECT_EQ(AudioFile::PlaylistFileSave(path_.c_str(), nullptr), -1);
    EXPECT_EQ(files::read(path_), "before");
    EXPECT_EQ(takeTrace(), "");
}

TEST_F(Queue, OfRandomSongsIsWhatTheDatabaseGives) {
    for (const int count : {2, 0, -3}) {
        fs::remove(path_);
        fs::create_symlink("/dev/full", path_);
        stand_in::script().rows = {stand_in::row(2, "song 2"), stand_in::row(1, "song 1")};
        EXPECT_EQ(AudioFile::PlaylistRandomCreate(path_.c_str(), count), 1);
        EXPECT_EQ(takeTrace(), "open(0, \"*\", null, null, \"RANDOM()\", 0, " +
                                   std::to_string(count) + ", 0)\nclose\n");
        EXPECT_TRUE(files::read(path_) == header(0, 1, 0, 0) + song(2) + song(1));
    }
    for (const bool openFails : {false, true}) {
        stand_in::script().rows.clear();
        stand_in::script().openFails = openFails;
        files::write(path_, "before");
        EXPECT_EQ(AudioFile::PlaylistRandomCreate(path_.c_str(), 5), 1);
        EXPECT_EQ(files::read(path_), header(0, 1, 0, 0));
    }
    takeTrace();
    EXPECT_EQ(outcome(AudioFile::PlaylistRandomCreate(nullptr, 5)),
              "0 3 audiofile:168 Bad parameters.\n");
    stand_in::script().unlockFails = true;
    EXPECT_EQ(AudioFile::PlaylistRandomCreate(path_.c_str(), 5), 0);
    EXPECT_TRUE(takeTrace().ends_with(
        "3 audiofile:146 Failed to unlock file.\n3 audiofile:187 Failed to create playlist " +
        path_ + "\n"));
    EXPECT_FALSE(fs::exists(path_));
}

TEST_F(Queue, IsNotHalfMadeWhenMemoryRunsOut) {
    files::write(path_, header(0, 1, 0, 0) + songs(3));
    for (const std::size_t size : {sizeof(PlayerInfo), sizeof(ZANO_MEDIA_INFO)}) {
        failing_allocator::failOnSize(size, size == sizeof(PlayerInfo) ? 0 : 1);
        EXPECT_EQ(loaded(path_), "null");
        EXPECT_TRUE(failing_allocator::hasFailed());
    }
    stand_in::script().rows = {stand_in::row(2, "a"), stand_in::row(1, "b")};
    failing_allocator::failOnSize(sizeof(ZANO_MEDIA_INFO), 1);
    EXPECT_EQ(AudioFile::PlaylistRandomCreate(path_.c_str(), 5), 0);
    EXPECT_TRUE(failing_allocator::hasFailed());
    EXPECT_TRUE(takeTrace().ends_with("3 audiofile:187 Failed to create playlist " + path_ + "\n"));
    EXPECT_FALSE(fs::exists(path_));
}

}  // namespace
