#include "playlist_draft.h"

#include <strings.h>
#include <unistd.h>
#include <vorelix/playlists/playlist.h>
#include <algorithm>
#include <cerrno>
#include <cstring>
#include <deque>
#include <filesystem>
#include <optional>
#include <string_view>

#include "failure.h"
#include "text.h"

namespace vorelix {

namespace {

namespace fs = std::filesystem;

/* The library's relative path loses a folder with whose whole name the next part of the playlist's
 * own path begins: /music/play/a.mp3 would stand in /music/playlists/x.m3u as ../a.mp3. The path
 * that is right for such an entry; relative paths are written as they are. */
std::optional<std::string> lostFolderPath(std::string_view playlist, std::string_view entry) {
    const auto [here, there] =
        std::mismatch(playlist.begin(), playlist.end(), entry.begin(), entry.end());
    const auto at = static_cast<size_t>(there - entry.begin());
    if (at < 2 || there == entry.end() || *there != '/' || entry[at - 1] == '/') {
        return std::nullopt;
    }
    std::string relative;
    for (auto up = std::count(here, playlist.end(), '/'); up > 0; --up) {
        relative += "../";
    }
    return relative.append(entry.substr(entry.rfind('/', at - 1) + 1));
}

bool isSamePath(const std::string &one, const std::string &other) {
    return one == other || (one.front() == '/' &&
                            fs::path(one).lexically_normal() == fs::path(other).lexically_normal());
}

/* As far as the form keeps it: the tags of what the media database does not know are in m3u. */
bool isKept(const ZANO_MEDIA_INFO &wanted, const ZANO_MEDIA_INFO &written, bool hasTags) {
    const auto areEqual = [](const char *one, const char *other) {
        return std::strcmp(one, other) == 0;
    };
    return isSamePath(wanted.path, written.path) &&
           (!hasTags || wanted.id != 0 || written.id != 0 ||
            (areEqual(wanted.title, written.title) && areEqual(wanted.artist, written.artist) &&
             areEqual(wanted.album, written.album) && areEqual(wanted.genre, written.genre)));
}

}  // namespace

std::string formOf(const std::string &path) {
    const std::string ending = fs::path(path).extension();
    for (const char *form : {"m3u", "pls", "wpl"}) {
        if (!ending.empty() && strcasecmp(ending.c_str() + 1, form) == 0) {
            return form;
        }
    }
    return {};
}

void Draft::write(const Entries &entries, mode_t modeOfNew) const {
    std::deque<ZANO_MEDIA_INFO> moved;
    Entries records = entries;
    for (ZANO_MEDIA_INFO *&record : records) {
        if (const auto moving = lostFolderPath(path(), record->path)) {
            moved.push_back(*record);
            setPath(moved.back(), *moving);
            record = &moved.back();
        }
    }
    writeRecords(std::move(records));
    expectEntries(entries);
    complete(modeOfNew);
}

SongList Draft::tryOut(const Entries &entries) const {
    writeRecords(entries);
    return readEntries(path());
}

void Draft::writeRecords(Entries records) const {
    records.push_back(nullptr);
    if (ZANOWriteMusicPlaylistWithMediaList(records.data(), path().c_str()) != 0) {
        throwWhenFull();
        throw Failure("could not write the draft " + printable(path()) +
                      "; see the library's log with --verbose");
    }
}

/* The library's writers do not tell of writes that failed; reading back does. */
void Draft::expectEntries(const Entries &entries) const {
    SongList list;
    try {
        list = readEntries(path());
    } catch (const Failure &) {
        throwWhenFull();
        throw;
    }
    const Entries written = entriesOf(list);
    const bool hasTags = formOf(path()) == "m3u";
    const auto [wanted, other] =
        std::mismatch(entries.begin(), entries.end(), written.begin(), written.end(),
                      [hasTags](const ZANO_MEDIA_INFO *one, const ZANO_MEDIA_INFO *another) {
                          return isKept(*one, *another, hasTags);
                      });
    if (wanted == entries.end() && other == written.end()) {
        return;
    }
    throwWhenFull();
    const std::string which =
        wanted != entries.end() ? "the path " + printable((*wanted)->path) : "one of the paths";
    throw Failure("could not write " + printable(file()) + ": " + which +
                  " cannot stand in a playlist of the form " + formOf(path()) +
                  "; leave it out. The file is as it was");
}

namespace {

/* The path that a rename may go to: links stay links. */
std::string fileBehind(const std::string &path) {
    std::error_code error;
    if (!fs::is_symlink(path, error)) {
        return path;
    }
    const fs::path target = fs::canonical(path, error);
    const fs::path folder = fs::path(path).parent_path();
    if (!error && target.parent_path() == fs::canonical(folder, error)) {
        return folder / target.filename();
    }
    throw Failure("could not change " + printable(path) +
                  ": it is a link to another folder, where its relative paths would lead "
                  "elsewhere; name the file itself");
}

void requireWritable(const std::string &path) {
    if (access(path.c_str(), W_OK) != 0) {
        throw Failure("could not change " + printable(path) + ": " + reasonOf(errno),
                      errno == ENOENT ? FailureKind::kNoFile : FailureKind::kOther);
    }
}

void requireForm(const std::string &path) {
    if (formOf(path).empty()) {
        throw Failure("could not change " + printable(path) +
                      ": only m3u, pls and wpl are written; take it over with: vorelix playlist "
                      "import");
    }
}

}  // namespace

bool editPlaylist(const std::string &path, Deadline deadline, const Change &change) {
    requireForm(path);
    const std::string file = fileBehind(path);
    Draft draft(file, deadline);
    return draft.replace(deadline, [&] {
        requireWritable(file);
        const SongList list = readEntries(file);
        const Entries old = entriesOf(list);
        const Entries entries = change(old);
        if (entries == old) {
            return false;
        }
        draft.write(entries, kSharedMode);
        return true;
    });
}

}  // namespace vorelix
