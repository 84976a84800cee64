#include <fcntl.h>
#include <strings.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>
#include <vorelix/misc/misc.h>
#include <vorelix/playlists/playlist.h>

#include <algorithm>
#include <array>
#include <climits>
#include <cmath>
#include <cstddef>
#include <cstring>
#include <string>
#include <string_view>

#include "bounded_text_internal.h"
#include "log_internal.h"
#include "playlists_internal.h"

using vorelix::isEmpty;
using vorelix::LogMessage;
using namespace vorelix::playlist;

namespace {

constexpr LogMessage<> kRelativeBadParameter{kUnit, "%s:%d Bad parameter", 651};
constexpr LogMessage<> kRelativeNotAbsolute{kUnit, "%s (%d) Given path is not a absolute path.",
                                            662};
constexpr LogMessage<const char *, const char *, int> kRelativeTooSmall{
    kUnit, "%s (%d) Path buffer is too small (%s)(%s)(%d)", 688};

/* The failures of one of the two writers. */
struct WriterMessages {
    LogMessage<> badParameter;
    LogMessage<const char *> notOpened;
    LogMessage<> notLocked;
    LogMessage<> notUnlocked;
};
constexpr const char *kBadParameter = "%s (%d) Bad parameter.";
constexpr const char *kNotOpened = "%s(%d): Failed to open %s.";
constexpr const char *kNotLocked = "%s (%d) Failed to lock file.";
constexpr const char *kNotUnlocked = "%s (%d) Failed to unlock file.";
constexpr WriterMessages kListWriter{{kUnit, kBadParameter, 721},
                                     {kUnit, kNotOpened, 732},
                                     {kUnit, kNotLocked, 737},
                                     {kUnit, kNotUnlocked, 816}};
constexpr WriterMessages kArrayWriter{{kUnit, kBadParameter, 850},
                                      {kUnit, kNotOpened, 861},
                                      {kUnit, kNotLocked, 866},
                                      {kUnit, kNotUnlocked, 946}};

/* What is to be written, from a list or from an array that a null pointer ends. */
class Entries {
  public:
    explicit Entries(const ZANO_PLAYLIST_REC *list) : node_(list) {}
    explicit Entries(ZANO_MEDIA_INFO *const *records) : record_(records) {}

    /* Null at the end. */
    const ZANO_MEDIA_INFO *next() {
        if (record_ != nullptr && *record_ != nullptr) {
            return *record_++;
        }
        const ZANO_PLAYLIST_REC *const node = node_;
        node_ = node != nullptr ? node->next : nullptr;
        return node != nullptr ? &node->info : nullptr;
    }

  private:
    const ZANO_PLAYLIST_REC *node_ = nullptr;
    ZANO_MEDIA_INFO *const *record_ = nullptr;
};

/* The file of a playlist, open and locked in turn. When it goes, its descriptor is closed and the
 * mode of its path made 0777, so that every service of the device may edit it. */
class PlaylistFile {
  public:
    explicit PlaylistFile(const char *path) : path_(path) {}
    ~PlaylistFile() {
        if (descriptor_ != -1) {
            close(descriptor_);
        }
        if (path_ != nullptr) {
            // Also of a file that could not be opened or locked: intended and kept.
            chmod(path_, 0777);
        }
    }
    PlaylistFile(const PlaylistFile &) = delete;
    PlaylistFile &operator=(const PlaylistFile &) = delete;

    bool openEmpty() {
        // The mode is that of a file whose writer was killed before the destructor.
        descriptor_ = open(path_, O_WRONLY | O_CREAT | O_TRUNC, 0666);
        return descriptor_ != -1;
    }
    bool lock() const { return flock(descriptor_, LOCK_EX | LOCK_NB) == 0; }
    bool unlock() const { return flock(descriptor_, LOCK_UN) == 0; }

    /* Intended and kept: nobody asks how much was written. */
    void put(std::string_view text) const {
        [[maybe_unused]] const ssize_t written = write(descriptor_, text.data(), text.size());
    }

    /* One line of texts and numbers, cut to the line buffer with its end. */
    template <typename... Pieces>
    void putLine(Pieces... pieces) const {
        vorelix::BoundedText<4128> line;
        line.append(shownAs(pieces)...);
        put(line.text());
    }

  private:
    static const char *shownAs(const char *text) { return text; }
    // Eleven characters at most, which std::string holds without the heap.
    static std::string shownAs(int number) { return std::to_string(number); }

    const char *path_;
    // Intended and kept: a call that fails before it opens anything closes descriptor 0.
    int descriptor_ = 0;
};

/* The first place where two texts differ, from their second byte on; their length when they are
 * equal. */
std::size_t firstDifference(const char *one, const char *other) {
    std::size_t at = 1;
    while (one[at] == other[at] && one[at] != '\0') {
        ++at;
    }
    return at;
}

/* What stays of the entry below the folder that it shares with the playlist. */
std::string_view remainderOf(std::string_view entry, std::size_t difference) {
    // Intended and kept: when they part at a '/' of the entry, its folder up to there is lost.
    if (difference < entry.size() && entry[difference] == '/') {
        return entry.substr(difference + 1);
    }
    return entry.substr(entry.rfind('/', difference - 1) + 1);
}

/* Writes the entry's path from the folder of the playlist into out. -1, with out untouched, when
 * the path is to be written as it is. */
int ZANOPathABSToRelative(const char *playlist, const char *entry, char *out, std::size_t size) {
    if (playlist == nullptr || entry == nullptr || out == nullptr) {
        kRelativeBadParameter();
        return -1;
    }
    if (isWebAddress(entry) || ZANOAudioIsUSBVolume(entry) == 1) {
        return -1;
    }
    if (*playlist != '/' || *entry != '/') {
        kRelativeNotAbsolute();
        return -1;
    }
    constexpr std::string_view kUp = "../";
    const std::size_t difference = firstDifference(entry, playlist);
    const std::string_view remainder = remainderOf(entry, difference);
    const std::string_view below = std::string_view(playlist).substr(difference);
    const auto levels = static_cast<std::size_t>(std::count(below.begin(), below.end(), '/'));
    if (size <= kUp.size() * levels + remainder.size()) {
        kRelativeTooSmall(playlist, entry, static_cast<int>(size));
        return -1;
    }
    std::fill_n(out, size, '\0');
    for (std::size_t level = 0; level < levels; ++level) {
        out = std::copy(kUp.begin(), kUp.end(), out);
    }
    std::copy(remainder.begin(), remainder.end(), out);
    return 0;
}

/* The path of an entry as the playlist shows it. */
class ShownPath {
  public:
    ShownPath(const char *playlist, const ZANO_MEDIA_INFO &entry)
        : text_(ZANOPathABSToRelative(playlist, entry.path, relative_.data(), relative_.size()) == 0
                    ? relative_.data()
                    : entry.path) {}
    ShownPath(const ShownPath &) = delete;
    ShownPath &operator=(const ShownPath &) = delete;
    const char *text() const { return text_; }

  private:
    std::array<char, 4096> relative_;
    const char *text_;
};

void writeWpl(const PlaylistFile &file, const char *path, Entries entries) {
    file.put("<?wpl version=\"1.0\"?>\r\n<smil>\r\n<head></head>\r\n<body>\r\n<seq>\r\n");
    while (const ZANO_MEDIA_INFO *const entry = entries.next()) {
        // Intended and kept: not escaped for XML.
        file.putLine("<media src=\"", ShownPath(path, *entry).text(), "\"/>\r\n");
    }
    // Intended and kept: two bare line feeds at the end.
    file.put("</seq>\r\n</body>\r\n</smil>\n\n");
}

/* Whole seconds, of which those beyond 32 bits are the last ones. */
int secondsOf(float duration) {
    constexpr float kBeyond = 2147483648.0F;
    if (std::isnan(duration) || duration <= -kBeyond) {
        return INT_MIN;
    }
    return duration >= kBeyond ? INT_MAX : static_cast<int>(duration);
}

/* The tags of an entry that the library has no row for. */
void writeTags(const PlaylistFile &file, const ZANO_MEDIA_INFO &entry) {
    if (!isEmpty(entry.title)) {
        file.putLine("#EXTINF:", secondsOf(entry.duration), ",", entry.title, "\r\n");
    }
    if (!isEmpty(entry.artist)) {
        file.putLine("#EXTINFARTIST:", entry.artist, "\r\n");
    }
    if (!isEmpty(entry.album)) {
        file.putLine("#EXTINFALBUM:", entry.album, "\r\n");
    }
    if (!isEmpty(entry.genre)) {
        file.putLine("#EXTINFGENRE:", entry.genre, "\r\n");
    }
    if (entry.year != 0) {
        file.putLine("#EXTINFYEAR:", entry.year, "\r\n");
    }
    if (entry.disc != 0) {
        file.putLine("#EXTINFDISC:", entry.disc, "\r\n");
    }
    if (entry.track != 0) {
        file.putLine("#EXTINFTRACK:", entry.track, "\r\n");
    }
}

void writeM3u(const PlaylistFile &file, const char *path, Entries entries) {
    file.put("#EXTM3U\r\n");
    while (const ZANO_MEDIA_INFO *const entry = entries.next()) {
        if (entry->id == 0) {
            writeTags(file, *entry);
        }
        file.putLine(ShownPath(path, *entry).text(), "\r\n");
    }
}

void writePls(const PlaylistFile &file, const char *path, Entries entries) {
    file.put("[playlist]\r\n");
    int count = 0;
    while (const ZANO_MEDIA_INFO *const entry = entries.next()) {
        file.putLine("File", ++count, "=", ShownPath(path, *entry).text(), "\r\n");
    }
    file.putLine("NumberOfEntries=", count, "\r\nVersion=2\r\n");
}

struct Format {
    const char *extension;
    void (*write)(const PlaylistFile &file, const char *path, Entries entries);
};
constexpr std::array<Format, 3> kFormats{{{"wpl", writeWpl}, {"m3u", writeM3u}, {"pls", writePls}}};

int writePlaylist(const char *path, bool isMissing, Entries entries,
                  const WriterMessages &messages) {
    PlaylistFile file(path);
    if (isMissing || isEmpty(path)) {
        messages.badParameter();
        return -1;
    }
    const char *const dot = std::strrchr(path, '.');
    if (dot == nullptr) {
        return -1;
    }
    if (!file.openEmpty()) {
        messages.notOpened(path);
        return -1;
    }
    if (!file.lock()) {
        messages.notLocked();
        return -1;
    }
    // Intended and kept: a file with another extension is emptied, and that is a success.
    const auto *const format = std::find_if(
        kFormats.begin(), kFormats.end(),
        [dot](const Format &each) { return strcasecmp(dot + 1, each.extension) == 0; });
    if (format != kFormats.end()) {
        format->write(file, path, entries);
    }
    if (!file.unlock()) {
        messages.notUnlocked();
        return -1;
    }
    return 0;
}

}  // namespace

int ZANOWriteMusicPlaylist(const ZANO_PLAYLIST_REC *list, const char *path) {
    return writePlaylist(path, false, Entries(list), kListWriter);
}

int ZANOWriteMusicPlaylistWithMediaList(ZANO_MEDIA_INFO **records, const char *path) {
    return writePlaylist(path, records == nullptr, Entries(records), kArrayWriter);
}
