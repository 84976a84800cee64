#include <vorelix/misc/misc.h>
#include <vorelix/playlists/playlist.h>
#include <zanoplatform/playlist_parser.h>
#include <zanoplatform/strings.h>

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <limits>
#include <memory>
#include <utility>

#include "edit_internal.h"
#include "playlists_internal.h"

namespace vorelix::playlist {
namespace {

constexpr const char *kAllFields = "*";
// Intended and kept: a removal writes no other tags, for it reads none.
constexpr const char *kRemovalFields = "id, path, title, album";
constexpr int kSelectionCapacity = 1024;

/* The new sequence of a playlist: room for so many entries, and a null pointer behind them. */
class EntryArray {
  public:
    explicit EntryArray(std::int64_t size) : size_(size) {
        const std::uint64_t slots = static_cast<std::uint64_t>(size) + 1;
        if (slots <= std::numeric_limits<std::size_t>::max()) {
            entries_.reset(static_cast<ZANO_MEDIA_INFO **>(
                std::calloc(static_cast<std::size_t>(slots), sizeof(ZANO_MEDIA_INFO *))));
        }
    }

    bool isAllocated() const { return entries_ != nullptr; }
    ZANO_MEDIA_INFO **get() const { return entries_.get(); }

    /* The entries from a node on, at most so many, for as long as there is room. */
    void append(ZANO_PLAYLIST_REC *list,
                std::int64_t most = std::numeric_limits<std::int64_t>::max()) {
        for (; list != nullptr && most > 0 && used_ < size_; list = list->next, --most) {
            entries_.get()[used_++] = &list->info;
        }
    }

  private:
    struct FreeArray {
        void operator()(ZANO_MEDIA_INFO **entries) const { std::free(entries); }
    };

    std::unique_ptr<ZANO_MEDIA_INFO *, FreeArray> entries_;
    std::int64_t size_;
    std::int64_t used_ = 0;
};

/* The result of an edit whose file has been written, or not. */
int reported(int written, const Playlist &playlist, const LogMessage<const char *> &failure) {
    if (written != 0) {
        failure(playlist.path);
        return -1;
    }
    return 0;
}

int write(const EntryArray &entries, const Playlist &playlist,
          const LogMessage<const char *> &failure) {
    return reported(ZANOWriteMusicPlaylistWithMediaList(entries.get(), playlist.path), playlist,
                    failure);
}

/* The positions of a selection, sorted as texts; null when memory ran out. */
StringList splitSelection(const char *selection) {
    StringList positions(KLIBCSzListAlloc(kSelectionCapacity));
    if (positions == nullptr) {
        return nullptr;
    }
    KLIBCSzListSortItems(positions.get(), 1);
    PSZLIST split = positions.release();
    const int count = KLIBCStrSep(selection, ",", &split);
    positions.reset(split);
    // Only an empty text has no positions; any other was not split for want of memory.
    return count >= 0 || *selection == '\0' ? std::move(positions) : nullptr;
}

bool isSelected(PSZLIST positions, int position) {
    std::array<char, 32> text{};
    std::snprintf(text.data(), text.size(), "%d", position);
    return KLIBCSzListFind(positions, text.data()) != -1;
}

RecordList withoutSelected(RecordList list, PSZLIST positions) {
    ZANO_PLAYLIST_REC *head = list.release();
    ZANO_PLAYLIST_REC **link = &head;
    for (int position = 0; *link != nullptr; ++position) {
        if (isSelected(positions, position)) {
            const RecordList removed(*link);
            *link = removed->next;
            removed->next = nullptr;
        } else {
            link = &(*link)->next;
        }
    }
    return RecordList(head);
}

/* How many entries an update leaves room for. */
std::int64_t updatedSize(std::int64_t total, std::int64_t records, std::int64_t count) {
    // Intended and kept: so many records may push the old entries out.
    if (records > total) {
        return records;
    }
    return records > count ? total + records - count : total;
}

/* The node at a position, the first one for a position before it; null behind the end. */
ZANO_PLAYLIST_REC *nodeAt(ZANO_PLAYLIST_REC *list, std::int64_t position) {
    for (; list != nullptr && position > 0; --position) {
        list = list->next;
    }
    return list;
}

bool isThere(const ZANO_MEDIA_INFO &entry) {
    return entry.id != 0 || isWebAddress(entry.path) || ZANOAudioIsUSBVolume(entry.path) == 1;
}

}  // namespace

RecordList Playlist::read(const char *fields, int &total) const {
    total = 0;
    RecordList list(id != nullptr ? ParsePlayListByField(id, &total, 0, 0, fields, 1)
                                  : ParsePlayListByFieldGivenPath(path, &total, 0, 0, fields, 1));
    total = std::max(total, 0);
    return list;
}

int removeSongs(const Playlist &playlist, const char *selection,
                const EditMessages::Removal &messages) {
    const StringList positions = splitSelection(selection);
    if (positions == nullptr) {
        messages.noList();
        return -1;
    }
    if (positions->count == 0) {
        messages.nothingSelected();
        return 0;
    }
    int total = 0;
    RecordList entries = playlist.read(kRemovalFields, total);
    if (entries == nullptr) {
        messages.notParsed();
        return -1;
    }
    entries = withoutSelected(std::move(entries), positions.get());
    return reported(ZANOWriteMusicPlaylist(entries.get(), playlist.path), playlist,
                    messages.notWritten);
}

int updateSongs(const Playlist &playlist, ZANO_PLAYLIST_REC *records, int start, int count,
                const EditMessages::Update &messages) {
    int total = 0;
    const RecordList old = playlist.read(kAllFields, total);
    if (old == nullptr || total == 0) {
        messages.notParsed();
        return -1;
    }
    const std::int64_t size = updatedSize(total, ZANOPlaylistRecCount(records), count);
    EntryArray entries(size);
    if (!entries.isAllocated()) {
        messages.noArray();
        return -1;
    }
    if (start >= size) {
        messages.badStart(start, asInt(static_cast<std::size_t>(size)));
        return -1;
    }
    entries.append(old.get(), start);
    entries.append(records);
    const std::int64_t rest = std::int64_t{start} + count;
    if (rest < size) {
        entries.append(nodeAt(old.get(), rest));
    }
    return write(entries, playlist, messages.notWritten);
}

int appendSongs(const Playlist &playlist, ZANO_PLAYLIST_REC *records, int recordCount,
                const EditMessages::Append &messages) {
    int total = 0;
    // Intended and kept: what cannot be read counts as empty.
    const RecordList old = playlist.read(kAllFields, total);
    EntryArray entries(std::int64_t{total} + std::max(recordCount, 0));
    if (!entries.isAllocated()) {
        return -1;
    }
    entries.append(old.get());
    entries.append(records);
    return write(entries, playlist, messages.notWritten);
}

int removeMissing(const Playlist &playlist, const EditMessages::Missing &messages) {
    int total = 0;
    const RecordList old = playlist.read(kAllFields, total);
    if (old == nullptr) {
        messages.notParsed(playlist);
        return -1;
    }
    EntryArray entries(total);
    if (!entries.isAllocated()) {
        return -1;
    }
    for (ZANO_PLAYLIST_REC *node = old.get(); node != nullptr; node = node->next) {
        if (isThere(node->info)) {
            entries.append(node, 1);
        }
    }
    return write(entries, playlist, messages.notWritten);
}

}  // namespace vorelix::playlist
