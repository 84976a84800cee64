/* playlist append, insert, remove, move and prune. */
#include <unistd.h>
#include <vorelix/misc/misc.h>
#include <algorithm>
#include <cerrno>
#include <set>

#include "commands.h"
#include "json.h"
#include "playlist_answers.h"
#include "playlist_catalogue.h"
#include "playlist_draft.h"
#include "playlist_input.h"

namespace vorelix {

namespace {

/* What came of a change. */
struct Changed {
    Playlist playlist;
    bool isChanged = false;
    size_t total = 0;
};

/* Calls change(old entries), which gives the new ones. */
template <typename MakeEntries>
Changed changed(const PlaylistRequest &request, MakeEntries change) {
    Changed outcome{findPlaylist(request.name, request.directory)};
    const auto counted = [&](const Entries &old) {
        Entries entries = change(old);
        outcome.total = entries.size();
        return entries;
    };
    outcome.isChanged =
        editPlaylist(outcome.playlist.path, deadlineOf(request.waitSeconds), counted);
    return outcome;
}

Json::Value documentOfChange(const Changed &outcome) {
    Json::Value answer(Json::objectValue);
    answer["playlist"] = playlistObject(outcome.playlist);
    answer["changed"] = outcome.isChanged;
    answer["total"] = Json::UInt64{outcome.total};
    return answer;
}

/* "appended 3 entries to 'Road' (playlist 5), which has 12 now" */
Outcome answerOf(const Request &request, const Changed &outcome, const std::string &what) {
    if (request.json) {
        return {documentOf(documentOfChange(outcome)), ""};
    }
    const std::string name = shownName(outcome.playlist);
    const std::string total = std::to_string(outcome.total);
    return {outcome.isChanged ? what + " " + name + ", which has " + total + " now\n"
                              : name + " is unchanged: it has " + total + "\n",
            ""};
}

Entries spliced(Entries entries, size_t at, const Entries &more) {
    entries.insert(entries.begin() + static_cast<std::ptrdiff_t>(at), more.begin(), more.end());
    return entries;
}

/* The entries that are wanted away, and those that stay. */
struct Division {
    std::vector<Placed> removed;
    Entries kept;
};

template <typename IsRemoved>
Division divided(const Entries &entries, IsRemoved isRemoved) {
    Division division;
    for (size_t i = 0; i < entries.size(); ++i) {
        if (isRemoved(i)) {
            division.removed.push_back({i + 1, entries[i]});
        } else {
            division.kept.push_back(entries[i]);
        }
    }
    return division;
}

/* What was removed, as it was when the file was read last. */
class Removal {
  public:
    Entries take(Division division, const Request &request, const Terminal &terminal) {
        count_ = division.removed.size();
        document_ = entryArray(division.removed);
        table_ = request.json || count_ == 0 ? "" : entryTable(division.removed, terminal) + "\n";
        return std::move(division.kept);
    }

    Outcome answer(const Request &request, const Changed &outcome) const {
        if (request.json) {
            Json::Value answer = documentOfChange(outcome);
            answer["removed"] = document_;
            return {documentOf(answer), ""};
        }
        Outcome answer = answerOf(request, outcome, "removed " + entryCount(count_) + " from");
        answer.text = table_ + answer.text;
        return answer;
    }

  private:
    size_t count_ = 0;
    Json::Value document_;
    std::string table_;
};

/* Neither known, nor on a volume that may just not be there, nor on the disk. The library's own
 * test would take every file that is not indexed, and https addresses, for missing. */
bool isGone(const ZANO_MEDIA_INFO &entry) {
    return entry.id == 0 && entry.path[0] == '/' && ZANOAudioIsUSBVolume(entry.path) != 1 &&
           access(entry.path, F_OK) != 0 && (errno == ENOENT || errno == ENOTDIR);
}

}  // namespace

Outcome playlistAppendCommand(const Request &request, const Terminal &) {
    const SongList list = newEntries(wantedEntries(request.playlist.songs, request.playlist.paths));
    const Entries more = entriesOf(list);
    const Changed outcome = changed(
        request.playlist, [&](const Entries &old) { return spliced(old, old.size(), more); });
    return answerOf(request, outcome, "appended " + entryCount(more.size()) + " to");
}

Outcome playlistInsertCommand(const Request &request, const Terminal &) {
    const SongList list = newEntries(wantedEntries(request.playlist.songs, request.playlist.paths));
    const Entries more = entriesOf(list);
    const Changed outcome = changed(request.playlist, [&](const Entries &old) {
        return spliced(old, destinationOf(request.playlist.place, old.size() + 1), more);
    });
    return answerOf(request, outcome, "inserted " + entryCount(more.size()) + " into");
}

Outcome playlistRemoveCommand(const Request &request, const Terminal &terminal) {
    Removal removal;
    const Changed outcome = changed(request.playlist, [&](const Entries &old) {
        const std::vector<size_t> indexes = indexesOf(request.playlist.positions, old.size());
        const std::set<size_t> chosen(indexes.begin(), indexes.end());
        return removal.take(divided(old, [&](size_t i) { return chosen.contains(i); }), request,
                            terminal);
    });
    return removal.answer(request, outcome);
}

Outcome playlistMoveCommand(const Request &request, const Terminal &) {
    size_t count = 0;
    const Changed outcome = changed(request.playlist, [&](const Entries &old) {
        Entries moved;
        std::set<size_t> chosen;
        for (const size_t index : indexesOf(request.playlist.positions, old.size())) {
            if (chosen.insert(index).second) {
                moved.push_back(old[index]);
            }
        }
        count = moved.size();
        const Entries kept = divided(old, [&](size_t i) { return chosen.contains(i); }).kept;
        return spliced(kept, destinationOf(request.playlist.place, kept.size() + 1), moved);
    });
    return answerOf(request, outcome, "moved " + entryCount(count) + " in");
}

Outcome playlistPruneCommand(const Request &request, const Terminal &terminal) {
    Removal removal;
    const Changed outcome = changed(request.playlist, [&](const Entries &old) {
        return removal.take(divided(old, [&](size_t i) { return isGone(*old[i]); }), request,
                            terminal);
    });
    return removal.answer(request, outcome);
}

}  // namespace vorelix
