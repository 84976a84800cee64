/* playlist create, import and export. */
#include <unistd.h>
#include <cstring>
#include <deque>
#include <filesystem>
#include <string_view>

#include "commands.h"
#include "failure.h"
#include "json.h"
#include "playlist_answers.h"
#include "playlist_catalogue.h"
#include "playlist_draft.h"
#include "playlist_input.h"
#include "text.h"

namespace vorelix {

namespace {

Draft draftOf(const std::string &path, const PlaylistRequest &request) {
    if (!request.force && access(path.c_str(), F_OK) == 0) {
        throw Failure("could not write " + printable(path) +
                      ": there is a file of that name; --force replaces it");
    }
    return {path, deadlineOf(request.waitSeconds)};
}

/* The entries of a file as they are best taken over to another folder.
 *
 * What stands at no file where it comes from, stands where it did. But lists of other systems are
 * read by what they name below the playlist's own folder and the one above: such entries are taken
 * as they read from the new place, and so are those that name a file from there. */
class Import {
  public:
    explicit Import(const std::string &file)
        : folder_(std::filesystem::path(file).parent_path().string() + "/"),
          list_(readEntries(file)),
          entries_(entriesOf(list_)) {}

    const Entries &entries() const { return entries_; }

    void adaptTo(const Draft &draft) {
        std::deque<ZANO_MEDIA_INFO> own;
        Entries trial = entries_;
        for (ZANO_MEDIA_INFO *&entry : trial) {
            if (!isFound(*entry) && std::string_view(entry->path).starts_with(folder_)) {
                own.push_back(*entry);
                entry = &own.back();
                setPath(*entry, entry->path + folder_.size());
            }
        }
        if (!own.empty()) {
            adapted_ = draft.tryOut(trial);
            take(trial, entriesOf(adapted_));
        }
    }

  private:
    static bool isFound(const ZANO_MEDIA_INFO &entry) {
        return entry.id != 0 || entry.path[0] != '/' || access(entry.path, F_OK) == 0;
    }

    void take(const Entries &trial, const Entries &read) {
        if (read.size() != entries_.size()) {
            return;  // a path that cannot be kept: write() names it
        }
        for (size_t i = 0; i < read.size(); ++i) {
            const bool isOfOtherSystem = std::strchr(trial[i]->path, '\\') != nullptr;
            if (trial[i] != entries_[i] && (isOfOtherSystem || isFound(*read[i]))) {
                entries_[i] = read[i];
            }
        }
    }

    std::string folder_;
    SongList list_;
    SongList adapted_;
    Entries entries_;
};

Json::Value documentOfNew(const Playlist &playlist, size_t total) {
    Json::Value answer(Json::objectValue);
    answer["playlist"] = playlistObject(playlist);
    answer["total"] = Json::UInt64{total};
    return answer;
}

/* "made 'Road' (playlist 5) with 3 entries" */
std::string textOfNew(const char *what, const Playlist &playlist, size_t total) {
    return std::string(what) + " " + shownName(playlist) + " with " + entryCount(total);
}

}  // namespace

Outcome playlistCreateCommand(const Request &request, const Terminal &) {
    const PlaylistRequest &wanted = request.playlist;
    const SongList list = newEntries(wantedEntries(wanted.songs, wanted.paths));
    const Entries entries = entriesOf(list);
    Playlist playlist = newPlaylist(wanted.name, wanted.form, wanted.directory);
    Draft draft = draftOf(playlist.path, wanted);
    draft.write(entries, kSharedMode);
    putPlaylist(playlist, draft, wanted.force, wanted.directory);
    if (request.json) {
        return {documentOf(documentOfNew(playlist, entries.size())), ""};
    }
    return {textOfNew("made", playlist, entries.size()) + ": " + printable(playlist.path) + "\n",
            ""};
}

Outcome playlistImportCommand(const Request &request, const Terminal &) {
    const PlaylistRequest &wanted = request.playlist;
    const std::string file = absolutePath(wanted.file);
    Import import(file);
    const std::string title =
        wanted.name.empty() ? std::filesystem::path(file).stem().string() : wanted.name;
    Playlist playlist = newPlaylist(title, wanted.form, wanted.directory);
    if (playlist.path == file) {  // it is where it belongs
        enterPlaylist(playlist, wanted.directory);
    } else {
        Draft draft = draftOf(playlist.path, wanted);
        import.adaptTo(draft);
        draft.write(import.entries(), kSharedMode);
        putPlaylist(playlist, draft, wanted.force, wanted.directory);
    }
    const Entries &entries = import.entries();
    const int known = knownAmong(entries);
    if (request.json) {
        Json::Value answer = documentOfNew(playlist, entries.size());
        answer["known"] = known;
        return {documentOf(answer), ""};
    }
    return {textOfNew("imported", playlist, entries.size()) + ", " + std::to_string(known) +
                " of them in the media database: " + printable(playlist.path) + "\n",
            ""};
}

Outcome playlistExportCommand(const Request &request, const Terminal &) {
    const PlaylistRequest &wanted = request.playlist;
    const Playlist playlist = findPlaylist(wanted.name, wanted.directory);
    const std::string file = absolutePath(wanted.file);
    Draft draft = draftOf(file, wanted);
    const SongList list = readEntries(playlist.path);
    draft.write(entriesOf(list), modeOfNewFile(kSharedMode));
    if (wanted.force) {
        draft.putInPlace();
    } else {
        draft.putAsNew();
    }
    const size_t total = entriesOf(list).size();
    if (request.json) {
        Json::Value answer = documentOfNew(playlist, total);
        answer["file"] = validUtf8(file);
        return {documentOf(answer), ""};
    }
    return {textOfNew("exported", playlist, total) + ": " + printable(file) + "\n", ""};
}

}  // namespace vorelix
