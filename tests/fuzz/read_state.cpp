// This file defines what a fortified build would turn into other calls.
#undef _FORTIFY_SOURCE

#include <sys/mman.h>
#include <syslog.h>
#include <unistd.h>
#include <vorelix/vorelix.h>
#include <zanoplatform/media_database.h>

#include <algorithm>
#include <climits>
#include <cstring>
#include <filesystem>
#include <memory>
#include <optional>
#include <string>

#include "config/line_internal.h"
#include "readers.h"
#include "system_paths_internal.h"

// Failures are what inputs are for; nobody's log is filled with them.
extern "C" {
#define EXPORTED __attribute__((visibility("default")))
EXPORTED void syslog(int, const char *, ...) {}
EXPORTED void fortifiedSyslog(int, int, const char *, ...) __asm__("__syslog_chk");
void fortifiedSyslog(int, int, const char *, ...) {}
}

namespace vorelix::fuzz {
namespace {

/* A file in memory, to which a fixed path of the device may lead. */
class MemoryFile {
  public:
    explicit MemoryFile(const char *fixed = nullptr) : descriptor_(memfd_create("input", 0)) {
        require(descriptor_ != -1);
        if (fixed != nullptr) {
            std::filesystem::create_directories(std::filesystem::path(fixed).parent_path());
            std::filesystem::remove(fixed);
            std::filesystem::create_symlink(path(), fixed);
        }
    }
    ~MemoryFile() { close(descriptor_); }
    MemoryFile(const MemoryFile &) = delete;
    MemoryFile &operator=(const MemoryFile &) = delete;

    std::string path() const { return "/proc/self/fd/" + std::to_string(descriptor_); }

    void write(const std::uint8_t *bytes, std::size_t size) const {
        require(ftruncate(descriptor_, 0) == 0);
        require(pwrite(descriptor_, bytes, size, 0) == static_cast<ssize_t>(size));
    }

    std::string text() const {
        std::string text(static_cast<std::size_t>(lseek(descriptor_, 0, SEEK_END)), '\0');
        require(pread(descriptor_, text.data(), text.size(), 0) ==
                static_cast<ssize_t>(text.size()));
        return text;
    }

  private:
    int descriptor_;
};

template <std::size_t Size>
void requireText(const char (&text)[Size]) {
    require(strnlen(text, Size) < Size);
}

struct FreeList {
    void operator()(ZANO_PLAYLIST_REC *list) const { ZANOPlaylistRecFree(list); }
};

/* A page of the track list, by either reader: how many tracks the list has, and none beyond the
 * page. */
void checkTracks(ZANO_PLAYLIST_REC *list, int count, int limit) {
    const std::unique_ptr<ZANO_PLAYLIST_REC, FreeList> owner(list);
    const unsigned taken = ZANOPlaylistRecCount(list);
    require(count >= 0 && taken <= static_cast<unsigned>(count));
    require(limit <= 0 || taken <= static_cast<unsigned>(limit));
    for (; list != nullptr; list = list->next) {
        requireText(list->info.title);
        requireText(list->info.artist);
        requireText(list->info.path);
        require(list->info.bitrate == 0 && list->info.id == 0);
    }
}

std::string bytesOf(const PlaylistInfo &list) {
    std::string bytes(reinterpret_cast<const char *>(list.playerInfo), sizeof(PlayerInfo));
    for (const ZANO_MEDIA_INFO *song : list.songs) {
        bytes.append(reinterpret_cast<const char *>(song), sizeof(ZANO_MEDIA_INFO));
    }
    return bytes;
}

}  // namespace

void readAsQueue(const std::uint8_t *bytes, std::size_t size) {
    static const MemoryFile kInput;
    static const MemoryFile kSaved;
    kInput.write(bytes, size);
    constexpr std::size_t kHeader = sizeof(PlayerInfo);
    const std::size_t total = size < kHeader ? 0 : (size - kHeader) / sizeof(ZANO_MEDIA_INFO);
    for (const auto &[start, count] : {std::pair{0, 0}, {1, 1}, {2, INT_MAX}, {-1, 3}, {0, -1}}) {
        const std::unique_ptr<PlaylistInfo> list(
            AudioFile::PlaylistFileLoad(kInput.path().c_str(), start, count));
        require(list != nullptr && list->playerInfo->total == static_cast<int>(total));
        require(list->songs.size() <= total);
        if (start == 0 && count == 0) {
            require(list->songs.size() == total);
        }
        require(AudioFile::PlaylistFileSave(kSaved.path().c_str(), list.get()) == 0);
        require(kSaved.text() == bytesOf(*list));
    }
}

void readAsTrackList(const std::uint8_t *bytes, std::size_t size) {
    static const MemoryFile kInput(ZANO_PATH_IPOD_FOLDER "tracks.m3u");
    static const bool kIsReady = [] {
        std::filesystem::remove(ZANO_PATH_AUDIO_CONF);
        return ZANOSonmiraRestoreConf() == 1;
    }();
    require(kIsReady);
    kInput.write(bytes, size);
    for (const auto &[offset, limit] : {std::pair{0, 0}, {1, 1}, {-3, INT_MAX}, {0, -1}}) {
        ZANO_PLAYLIST_REC *list = nullptr;
        const int count = ZANOIPodListSongsAll(kInput.path().c_str(), &list, offset, limit);
        checkTracks(list, count, limit);
        ZANO_PLAYLIST_REC *page = nullptr;
        int total = -1;
        require(ZANOIPodInfoGetAll(&page, offset, limit, &total) == 0 && total == count);
        checkTracks(page, total, limit);
    }
    for (const int index : {1, 2, INT_MAX}) {
        ZANO_MEDIA_INFO info{};
        require(ZANOIPodInfoGet(&info, index) == 0);
        requireText(info.title);
        requireText(info.genre);
    }
}

void readAsConfiguration(const std::uint8_t *bytes, std::size_t size) {
    static const MemoryFile kInput(ZANO_PATH_AUDIO_CONF);
    kInput.write(bytes, size);
    ZANO_AUDIO_CONF conf{};
    require(ZANOAudioConfGetALL(&conf) == 1);
    require(conf.currentSource == 0 && conf.szDefaultIPodPlaylist[0] == '\0');

    std::string line(reinterpret_cast<const char *>(bytes), size);
    const char *const end = line.data() + line.size();
    if (const auto read = config::splitLine(line.data())) {
        require(read->key >= line.data() && read->value >= read->key && read->value <= end);
        require(std::strpbrk(read->key, "=") == nullptr);
        require(read->value + std::strlen(read->value) <= end);
    }
}

void readAsUsers(const std::uint8_t *bytes, std::size_t size) {
    static const MemoryFile kInput;
    kInput.write(bytes, size);
    AudioUsers users;
    if (!users.Read(kInput.path())) {
        require(users.enumUsers().empty());
        return;
    }
    for (const unsigned int uid : users.enumUsers()) {
        require(users.GetUser(uid) <= AudioUsers::kEveryPermission);
        users.SetUser(uid, AudioUsers::kUsb);
        users.Remove(uid);
        require(users.GetUser(uid) == AudioUsers::kStreaming);
    }
    users.GetUser(0);
}

void readAsCustomKeys(const std::uint8_t *bytes, std::size_t size) {
    static const MemoryFile kInput(ZANO_PATH_CUSTOM_KEYS);
    const std::string before(reinterpret_cast<const char *>(bytes), size);
    for (const int key : {0, 1, 4}) {
        kInput.write(bytes, size);
        std::string texts[3];
        const int result = ZANOAudioCustomGet(key, texts[0], texts[1], texts[2]);
        require(result == 0 || result == -1);
        if (ZANOAudioCustomSet(key, "type", "value", "title") == 0) {
            require(ZANOAudioCustomGet(key, texts[0], texts[1], texts[2]) == 0);
            require(texts[0] == "type" && texts[1] == "value" && texts[2] == "title");
        } else {
            require(kInput.text() == before);
        }
    }
}

}  // namespace vorelix::fuzz
