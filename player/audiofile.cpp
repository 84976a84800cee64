#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>
#include <vorelix/library/musiclib.h>
#include <vorelix/player/audiofile.h>

#include <algorithm>
#include <cerrno>
#include <climits>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <memory>
#include <new>
#include <utility>

#include "descriptor_internal.h"
#include "log_internal.h"
#include "media_rows_internal.h"

using vorelix::Descriptor;
using vorelix::LogMessage;
using vorelix::shown;

namespace {

constexpr const char *kUnit = "audiofile";
constexpr const char *kNotOpened = "%s:%d Failed to open %s.";
constexpr const char *kNotLocked = "%s:%d Failed to lock file.";
constexpr const char *kNotUnlocked = "%s:%d Failed to unlock file.";
constexpr const char *kNotWritten = "%s:%d Failed to write the playlist to file.(%s)";
constexpr LogMessage<const char *> kLoadNotOpened{kUnit, kNotOpened, 51};
constexpr LogMessage<> kLoadNotLocked{kUnit, kNotLocked, 56};
constexpr LogMessage<> kLoadNotUnlocked{kUnit, kNotUnlocked, 101};
constexpr LogMessage<const char *> kSaveNotOpened{kUnit, kNotOpened, 124};
constexpr LogMessage<> kSaveNotLocked{kUnit, kNotLocked, 129};
constexpr LogMessage<const char *> kInfoNotWritten{kUnit, kNotWritten, 134};
constexpr LogMessage<const char *> kSongNotWritten{kUnit, kNotWritten, 140};
constexpr LogMessage<> kSaveNotUnlocked{kUnit, kNotUnlocked, 146};
constexpr LogMessage<> kRandomBadParameters{kUnit, "%s:%d Bad parameters.", 168};
constexpr LogMessage<const char *> kNotCreated{kUnit, "%s:%d Failed to create playlist %s", 187};

constexpr mode_t kNewFileMode = 0644;
constexpr off_t kInfoSize = sizeof(PlayerInfo);
constexpr off_t kSongSize = sizeof(ZANO_MEDIA_INFO);
static_assert(sizeof(PlayerInfo) == 16 && sizeof(off_t) == 8);

struct FreeSong {
    void operator()(ZANO_MEDIA_INFO *song) const { std::free(song); }
};
using Song = std::unique_ptr<ZANO_MEDIA_INFO, FreeSong>;

/* Not cleared: whoever asks for one fills it whole. */
Song allocateSong() {
    Song song(static_cast<ZANO_MEDIA_INFO *>(std::malloc(sizeof(ZANO_MEDIA_INFO))));
    if (song == nullptr) {
        throw std::bad_alloc();
    }
    return song;
}

void append(PlaylistInfo &list, Song song) {
    list.songs.push_back(nullptr);
    list.songs.back() = song.release();
}

std::unique_ptr<PlaylistInfo> newList() {
    auto list = std::make_unique<PlaylistInfo>();
    if (list->playerInfo == nullptr) {
        throw std::bad_alloc();
    }
    return list;
}

bool lock(const Descriptor &file) {
    return flock(file.number(), LOCK_EX | LOCK_NB) == 0;
}

bool unlock(const Descriptor &file) {
    return flock(file.number(), LOCK_UN) == 0;
}

bool readWhole(const Descriptor &file, void *out, off_t size) {
    return read(file.number(), out, static_cast<std::size_t>(size)) == size;
}

/* False with the reason in errno. */
bool writeWhole(const Descriptor &file, const void *bytes, off_t size) {
    for (const char *next = static_cast<const char *>(bytes); size > 0;) {
        const ssize_t count = write(file.number(), next, static_cast<std::size_t>(size));
        if (count <= 0) {
            return false;
        }
        next += count;
        size -= count;
    }
    return true;
}

int songsIn(off_t fileSize) {
    return static_cast<int>(std::min<off_t>((fileSize - kInfoSize) / kSongSize, INT_MAX));
}

/* The position is that of the first song then. False at the end of the file. */
bool skipSongs(const Descriptor &file, int start, off_t fileSize) {
    // Intended and kept: a product of 32 bits without sign.
    const std::uint32_t bytes =
        static_cast<std::uint32_t>(start) * static_cast<std::uint32_t>(kSongSize);
    return lseek(file.number(), bytes, SEEK_CUR) != fileSize;
}

void readSongs(const Descriptor &file, int count, PlaylistInfo &list) {
    for (int taken = 0; taken < count; ++taken) {
        Song song = allocateSong();
        if (!readWhole(file, song.get(), kSongSize)) {
            return;
        }
        append(list, std::move(song));
    }
}

/* What reading came to. */
enum class Outcome { Read, Ended, Failed };

/* Ended: before the songs, with the lock still held. */
Outcome readList(const Descriptor &file, int start, int count, PlaylistInfo &list) {
    const off_t size = lseek(file.number(), 0, SEEK_END);
    lseek(file.number(), 0, SEEK_SET);
    PlayerInfo info{};
    if (size <= 0 || !readWhole(file, &info, kInfoSize)) {
        return Outcome::Ended;
    }
    list.setPlayerInfo(&info);
    list.playerInfo->total = songsIn(size);
    if (!skipSongs(file, start, size)) {
        return Outcome::Ended;
    }
    // Intended and kept: from a later start on, it is the end of the file that ends the reading.
    readSongs(file, count != 0 ? count : list.playerInfo->total, list);
    return Outcome::Read;
}

Outcome load(const char *path, int start, int count, PlaylistInfo &list) {
    struct stat status {};
    if (path == nullptr || stat(path, &status) != 0) {
        return Outcome::Ended;
    }
    const Descriptor file(open(path, O_RDONLY | O_CREAT, kNewFileMode));
    if (file.number() == -1) {
        kLoadNotOpened(path);
        return Outcome::Ended;
    }
    if (!lock(file)) {
        kLoadNotLocked();
        return Outcome::Failed;
    }
    const Outcome outcome = readList(file, start, count, list);
    if (outcome == Outcome::Read && !unlock(file)) {
        kLoadNotUnlocked();
        return Outcome::Failed;
    }
    return outcome;
}

bool writeList(const Descriptor &file, const PlaylistInfo &list) {
    if (!writeWhole(file, list.playerInfo, kInfoSize)) {
        kInfoNotWritten(std::strerror(errno));
        return false;
    }
    for (const ZANO_MEDIA_INFO *song : list.songs) {
        if (!writeWhole(file, song, kSongSize)) {
            kSongNotWritten(std::strerror(errno));
            return false;
        }
    }
    return true;
}

bool save(const char *path, const PlaylistInfo &list) {
    const Descriptor file(open(path, O_WRONLY | O_CREAT | O_TRUNC, kNewFileMode));
    if (file.number() == -1) {
        kSaveNotOpened(path);
        return false;
    }
    if (!lock(file)) {
        kSaveNotLocked();
        return false;
    }
    if (!writeList(file, list)) {
        return false;
    }
    if (!unlock(file)) {
        kSaveNotUnlocked();
        return false;
    }
    return true;
}

void takeRandomSongs(int count, PlaylistInfo &list) {
    ZANO_PLAYLIST_REC *head = nullptr;
    // Intended and kept: a library that cannot be read counts as an empty one.
    [[maybe_unused]] const int result = ZANOMusicListAll(&head, 5, "", "random", 1, 0, count);
    const vorelix::RecordList records(head);
    for (const ZANO_PLAYLIST_REC *node = head; node != nullptr; node = node->next) {
        Song song = allocateSong();
        *song = node->info;
        append(list, std::move(song));
    }
}

bool saveRandomSongs(const char *path, int count) {
    try {
        const std::unique_ptr<PlaylistInfo> list = newList();
        takeRandomSongs(count, *list);
        return AudioFile::PlaylistFileSave(path, list.get()) == 0;
    } catch (const std::exception &) {
        return false;
    }
}

}  // namespace

PlaylistInfo::PlaylistInfo()
    : playerInfo(static_cast<PlayerInfo *>(std::calloc(1, sizeof(PlayerInfo)))) {
    if (playerInfo != nullptr) {
        playerInfo->state[1] = 1;
    }
}

PlaylistInfo::~PlaylistInfo() {
    std::free(playerInfo);
    for (ZANO_MEDIA_INFO *song : songs) {
        std::free(song);
    }
}

void PlaylistInfo::setPlayerInfo(PlayerInfo *info) {
    if (info != nullptr && playerInfo != nullptr) {
        *playerInfo = *info;
    }
}

PlaylistInfo *AudioFile::PlaylistFileLoad(char const *path, int start, int count) {
    try {
        std::unique_ptr<PlaylistInfo> list = newList();
        return load(path, start, count, *list) != Outcome::Failed ? list.release() : nullptr;
    } catch (const std::exception &) {
        return nullptr;
    }
}

int AudioFile::PlaylistFileSave(char const *path, PlaylistInfo *list) {
    if (list == nullptr) {
        return -1;
    }
    if (path == nullptr) {
        kSaveNotOpened(shown(path));
        return -1;
    }
    if (!save(path, *list)) {
        // Intended and kept: no partial queue stays, and neither does the one before.
        unlink(path);
        return -1;
    }
    return 0;
}

int AudioFile::PlaylistRandomCreate(char const *path, int count) {
    if (path == nullptr) {
        kRandomBadParameters();
        return 0;
    }
    unlink(path);
    if (!saveRandomSongs(path, count)) {
        kNotCreated(path);
        return 0;
    }
    return 1;
}
