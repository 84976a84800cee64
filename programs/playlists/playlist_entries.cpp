#include "playlist_entries.h"

#include <vorelix/playlists/playlist.h>
#include <zanoplatform/error.h>
#include <zanoplatform/playlist_parser.h>
#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <iterator>
#include <map>
#include <new>

#include "failure.h"
#include "text.h"

namespace vorelix {

namespace {

struct Cause {
    int code;
    const char *text;
};

constexpr Cause kCauses[] = {
    {KLIB_ERR_PLAYLIST_MISSING,
     "there is no such file; a playlist whose file is gone leaves the list with: vorelix playlist "
     "delete"},
    {KLIB_ERR_PLAYLIST_UNREADABLE, "the file cannot be read"},
    {KLIB_ERR_PLAYLIST_NOT_ONE, "it is not a playlist; m3u, m3u8, pls and wpl are read"},
    {KLIB_ERR_PLAYLIST_TOO_LARGE, "it is too large"},
};

[[noreturn]] void throwParserFailure(const std::string &path) {
    const int code = KLIBCErrGet();
    const std::string reason = printable(KLIBCErrTextGet());
    const std::string what = "read the playlist " + printable(path);
    for (const Cause &cause : kCauses) {
        if (cause.code == code) {
            std::string text = "could not " + what + ": ";
            throw Failure(
                text.append(cause.text).append("\nreason: ").append(reason),
                code == KLIB_ERR_PLAYLIST_MISSING ? FailureKind::kNoFile : FailureKind::kOther);
        }
    }
    throwDatabaseFailure(what);
}

/* Tags of a playlist become lines of a playlist again. */
template <size_t Size>
void keepInOneLine(char (&text)[Size]) {
    std::replace_if(
        std::begin(text), std::end(text), [](char c) { return c == '\n' || c == '\r'; }, ' ');
}

/* The songs of these ids; Failure names those that there are not. */
class Songs {
  public:
    explicit Songs(const std::vector<Wanted> &wanted) {
        std::vector<int> ids;
        for (const Wanted &each : wanted) {
            if (each.id != 0 && byId_.try_emplace(each.id).second) {
                ids.push_back(each.id);
            }
        }
        if (ids.empty()) {
            return;
        }
        list_ = songsById(ids);
        for (auto *node = list_.get(); node != nullptr; node = node->next) {
            byId_[node->info.id] = &node->info;
        }
        requireAll(ids);
    }

    const ZANO_MEDIA_INFO &at(int id) const { return *byId_.at(id); }

  private:
    void requireAll(const std::vector<int> &ids) const {
        std::string unknown;
        for (const int id : ids) {
            if (byId_.at(id) == nullptr) {
                unknown.append(unknown.empty() ? "" : ", ").append(std::to_string(id));
            }
        }
        if (!unknown.empty()) {
            throw Failure("no song has the id " + unknown +
                              ", so nothing was added; the listings show the ids that exist",
                          FailureKind::kNoSong);
        }
    }

    SongList list_;
    std::map<int, const ZANO_MEDIA_INFO *> byId_;
};

void push(SongList &list, const ZANO_MEDIA_INFO &info) {
    auto *node = static_cast<ZANO_PLAYLIST_REC *>(std::malloc(sizeof(ZANO_PLAYLIST_REC)));
    if (node == nullptr) {
        throw std::bad_alloc();
    }
    node->info = info;
    node->next = list.release();
    list.reset(node);
}

}  // namespace

SongList readEntries(const std::string &path) {
    int total = 0;
    SongList list(ParsePlayListByFieldGivenPath(path.c_str(), &total, 0, 0, "*", 1));
    if (list == nullptr && KLIBCErrGet() != KLIB_ERR_NONE) {
        throwParserFailure(path);
    }
    for (auto *node = list.get(); node != nullptr; node = node->next) {
        keepInOneLine(node->info.title);
        keepInOneLine(node->info.artist);
        keepInOneLine(node->info.album);
        keepInOneLine(node->info.genre);
    }
    return list;
}

Entries entriesOf(const SongList &list) {
    Entries entries;
    for (auto *node = list.get(); node != nullptr; node = node->next) {
        entries.push_back(&node->info);
    }
    return entries;
}

void setPath(ZANO_MEDIA_INFO &entry, const std::string &path) {
    std::snprintf(entry.path, sizeof entry.path, "%s", path.c_str());
}

int knownAmong(const Entries &entries) {
    return static_cast<int>(std::count_if(entries.begin(), entries.end(),
                                          [](const auto *entry) { return entry->id != 0; }));
}

SongList newEntries(const std::vector<Wanted> &wanted) {
    const Songs songs(wanted);
    SongList list;
    for (const Wanted &each : wanted) {
        ZANO_MEDIA_INFO entry{};
        if (each.id == 0) {
            setPath(entry, each.path);
        }
        push(list, each.id == 0 ? entry : songs.at(each.id));
    }
    return SongList(PlaylistRecReverse(list.release()));
}

std::string absolutePath(const std::string &path) {
    const auto normal = std::filesystem::absolute(path).lexically_normal();
    return normal.has_filename() || !normal.has_relative_path() ? normal : normal.parent_path();
}

}  // namespace vorelix
