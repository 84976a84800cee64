#include "playlist_actions.h"

#include <vorelix/library/musiclib.h>
#include <vorelix/playlists/playlist.h>
#include <zanoplatform/error.h>
#include <algorithm>
#include <memory>
#include <set>

#include "failure.h"
#include "music_folder.h"
#include "playlist_catalogue.h"
#include "song_answers.h"
#include "span.h"

namespace webapi {

namespace {

using vorelix::Entries;
using vorelix::Playlist;

constexpr int kWaitSeconds = 5;

struct FreePlaylists {
    void operator()(ZANO_PLAYLIST *list) const { ZANOPlayListFree(list); }
};
using PlaylistNodes = std::unique_ptr<ZANO_PLAYLIST, FreePlaylists>;

vorelix::Deadline deadline() {
    return vorelix::deadlineOf(kWaitSeconds);
}

/* One that the listing has. */
Playlist wantedPlaylist(const Parameters &parameters) {
    const auto playlist = vorelix::playlistById(parameters.number("id", {1}));
    if (!playlist || !MusicFolder().lists(playlist->path)) {
        throw Refusal(kNotFound, "id");
    }
    return *playlist;
}

/* The path of its file, which has to be in the music folder once links are followed. */
std::string fileOf(const Playlist &playlist) {
    static_cast<void>(MusicFolder().resolved(playlist.path));
    return playlist.path;
}

/* Songs by their ids, in this order, as often as they are named. */
vorelix::SongList wantedSongs(const Parameters &parameters) {
    std::vector<vorelix::Wanted> wanted;
    for (const int id : parameters.numbers("songs", {1})) {
        wanted.push_back({id, ""});
    }
    return vorelix::newEntries(wanted);
}

Json::Value totalAnswer(std::size_t total) {
    Json::Value answer;
    answer["total"] = Json::UInt64{total};
    return answer;
}

template <typename Change>
Json::Value changed(const Playlist &playlist, Change change) {
    if (vorelix::formOf(playlist.path).empty()) {
        throw Refusal(kConflict, "form");
    }
    std::size_t total = 0;
    vorelix::editPlaylist(fileOf(playlist), deadline(), [&](const Entries &old) {
        Entries entries = change(old);
        total = entries.size();
        return entries;
    });
    return totalAnswer(total);
}

/* An edit by positions, which mean other entries when somebody else has changed the playlist. */
template <typename Change>
Json::Value changedAsSeen(const Parameters &parameters, Change change) {
    const auto seen = static_cast<std::size_t>(parameters.number("total", {}));
    return changed(wantedPlaylist(parameters), [&](const Entries &old) {
        if (old.size() != seen) {
            throw Refusal(kConflict, "total");
        }
        return change(old);
    });
}

}  // namespace

Json::Value PlaylistsAction::answer() {
    const vorelix::Span span = spanOf(parameters());
    Json::Value answer;
    int total = -1;
    if (ZANOPageTotalRowCount(0, 0, nullptr, &total) != 0 || total < 0) {
        vorelix::throwDatabaseFailure("count playlists");
    }
    ZANO_PLAYLIST *nodes = nullptr;
    const int status = ZANOPlaylistListAll(&nodes, span.offset, span.limit, 0);
    const PlaylistNodes list(nodes);
    // The library does not tell an empty list from a database without an answer.
    if (status != 0 || KLIBCErrGet() != KLIB_ERR_NONE) {
        vorelix::throwDatabaseFailure("list playlists");
    }
    Json::Value &rows = answer["playlists"] = Json::Value(Json::arrayValue);
    for (const auto *node = list.get(); node != nullptr; node = node->next) {
        Json::Value row;
        row["id"] = node->id;
        row["title"] = node->title;
        rows.append(row);
    }
    answer["total"] = total;
    return answer;
}

Json::Value PlaylistAction::answer() {
    const auto span = spanOf(parameters());
    const Playlist playlist = wantedPlaylist(parameters());
    const vorelix::SongList list = vorelix::readEntries(fileOf(playlist));
    const Entries entries = vorelix::entriesOf(list);
    Json::Value answer = totalAnswer(entries.size());
    answer["title"] = playlist.title;
    Json::Value &rows = answer["entries"] = Json::Value(Json::arrayValue);
    const std::size_t first = std::min<std::size_t>(span.offset, entries.size());
    const std::size_t last = std::min<std::size_t>(first + span.limit, entries.size());
    for (std::size_t i = first; i < last; ++i) {
        rows.append(entryObject(*entries[i]));
    }
    return answer;
}

Json::Value PlaylistCreateAction::answer() {
    const std::string title = parameters().text("title");
    if (!vorelix::isTitle(title)) {
        throw Refusal(kBadRequest, "title");
    }
    const vorelix::SongList songs = wantedSongs(parameters());
    Playlist playlist = vorelix::newPlaylist(title, "m3u", "");
    vorelix::Draft draft(playlist.path, deadline());
    draft.write(vorelix::entriesOf(songs), vorelix::kSharedMode);
    vorelix::putPlaylist(playlist, draft, false, "");
    Json::Value answer;
    answer["id"] = playlist.id;
    return answer;
}

Json::Value PlaylistAppendAction::answer() {
    const vorelix::SongList songs = wantedSongs(parameters());
    const Entries more = vorelix::entriesOf(songs);
    if (more.empty()) {
        throw Refusal(kBadRequest, "songs");
    }
    return changed(wantedPlaylist(parameters()), [&](Entries entries) {
        entries.insert(entries.end(), more.begin(), more.end());
        return entries;
    });
}

Json::Value PlaylistRemoveAction::answer() {
    const std::vector<int> positions = parameters().numbers("positions", {});
    if (positions.empty()) {
        throw Refusal(kBadRequest, "positions");
    }
    const std::set<std::size_t> chosen(positions.begin(), positions.end());
    return changedAsSeen(parameters(), [&](const Entries &old) {
        if (*chosen.rbegin() >= old.size()) {
            throw Refusal(kBadRequest, "positions");
        }
        Entries kept;
        for (std::size_t i = 0; i < old.size(); ++i) {
            if (!chosen.contains(i)) {
                kept.push_back(old[i]);
            }
        }
        return kept;
    });
}

Json::Value PlaylistMoveAction::answer() {
    const int from = parameters().number("from", {});
    const int to = parameters().number("to", {});
    return changedAsSeen(parameters(), [&](Entries entries) {
        const auto last = static_cast<std::ptrdiff_t>(entries.size()) - 1;
        if (from > last || to > last) {
            throw Refusal(kBadRequest, from > last ? "from" : "to");
        }
        ZANO_MEDIA_INFO *moved = entries[static_cast<std::size_t>(from)];
        entries.erase(entries.begin() + from);
        entries.insert(entries.begin() + to, moved);
        return entries;
    });
}

Json::Value PlaylistDeleteAction::answer() {
    vorelix::deletePlaylist(wantedPlaylist(parameters()), "", deadline());
    return {};
}

}  // namespace webapi
