#include "playlist_catalogue.h"

#include <unistd.h>
#include <vorelix/library/musiclib.h>
#include <vorelix/playlists/playlist.h>
#include <zanoplatform/error.h>
#include <zanoplatform/media_database.h>
#include <algorithm>
#include <array>
#include <cerrno>
#include <charconv>
#include <climits>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <memory>

#include "failure.h"
#include "system_paths_internal.h"
#include "text.h"

namespace vorelix {

namespace {

namespace fs = std::filesystem;

constexpr const char *kFolder = "playlists";

struct FreePlaylists {
    void operator()(ZANO_PLAYLIST *list) const { ZANOPlayListFree(list); }
};
using PlaylistNodes = std::unique_ptr<ZANO_PLAYLIST, FreePlaylists>;

PlaylistListing sharedPlaylists(const std::string &condition, const Span &span) {
    ZANO_PLAYLIST_REC *rows = nullptr;
    const int total = ZANOMusicBrowse(MEDIA_TABLE_PLAYLISTS, &rows, nullptr,
                                      condition.empty() ? nullptr : condition.c_str(), nullptr,
                                      "lower(title), lower(album), path", span.offset, span.limit);
    if (total < 0) {
        throwDatabaseFailure("list playlists");
    }
    const SongList list(rows);
    PlaylistListing listing{{}, total};
    for (const auto *row = list.get(); row != nullptr; row = row->next) {
        listing.playlists.push_back(
            {row->info.id, row->info.title, row->info.album, row->info.path});
    }
    return listing;
}

/* A directory's name is no pattern. */
std::string withoutWildcards(const std::string &directory) {
    std::string literal;
    for (const char c : directory) {
        literal.append(std::strchr("*?[\\", c) != nullptr ? "\\" : "").push_back(c);
    }
    return literal;
}

PlaylistListing personalPlaylists(const std::string &directory, const Span &span) {
    const std::string absolute = absolutePath(directory);
    std::error_code error;
    if (!fs::is_directory(absolute, error)) {
        throw Failure("there is no folder " + printable(absolute) +
                      "; --dir names the one whose folder playlists has your own playlists");
    }
    const std::string literal = withoutWildcards(absolute);
    ZANO_PLAYLIST *nodes = nullptr;
    const int count = ZANOPersonalPlaylistListAll(literal.c_str(), &nodes, span.offset, span.limit);
    const PlaylistNodes list(nodes);
    const int total = ZANOPersonalPlaylistTotalGet(literal.c_str());
    if (count < 0 || total < 0) {
        throw Failure("could not list the playlists in " + printable(absolute) + "/" + kFolder +
                      ": one of them cannot be looked at; is it a link to a file that is gone?");
    }
    PlaylistListing listing{{}, total};
    for (const auto *node = list.get(); node != nullptr; node = node->next) {
        listing.playlists.push_back({span.offset + node->id, node->title, node->album, node->path});
    }
    return listing;
}

constexpr Span kAll{0, 0};

/* The number that a whole text is, or 0. */
int idOf(const std::string &text) {
    int id = 0;
    const char *end = text.data() + text.size();
    const auto [rest, error] = std::from_chars(text.data(), end, id);
    return error == std::errc() && rest == end && id > 0 ? id : 0;
}

std::string listCommandFor(const std::string &directory) {
    return directory.empty() ? "vorelix playlist list"
                             : "vorelix playlist list --dir " + printable(shellQuoted(directory));
}

[[noreturn]] void throwUnknown(const std::string &name, const std::string &directory) {
    throw Failure("there is no playlist '" + printable(name) + "'; " + listCommandFor(directory) +
                  " shows those that there are");
}

Playlist theOneOf(const std::vector<Playlist> &found, const std::string &name,
                  const std::string &directory) {
    if (found.empty()) {
        throwUnknown(name, directory);
    }
    if (found.size() > 1) {
        std::string which;
        for (const Playlist &each : found) {
            which += "\n    " + std::to_string(each.id) + "  " + printable(each.path);
        }
        throw Failure("several playlists can be meant by '" + printable(name) +
                      "'; name one by its path, or by its id:" + which);
    }
    return found.front();
}

Playlist playlistNamed(const std::string &name, const std::string &directory) {
    const int id = idOf(name);
    std::vector<Playlist> found;
    if (directory.empty()) {
        std::string condition = "title ilike '" + literalPattern(name) + "'";
        condition += id != 0 ? " or id = " + std::to_string(id) : "";
        found = sharedPlaylists(condition, kAll).playlists;
    } else {
        found = personalPlaylists(directory, kAll).playlists;
    }
    std::vector<Playlist> exact;
    std::copy_if(found.begin(), found.end(), std::back_inserter(exact), [&](const Playlist &each) {
        return each.title == name || (id != 0 && each.id == id);
    });
    return theOneOf(exact.empty() && directory.empty() ? found : exact, name, directory);
}

/* The row of a file, or null. */
std::vector<Playlist> rowsOf(const std::string &path) {
    std::array<char, 16> id{};
    if (ZANOPlaylistIDGet(path.c_str(), id.data(), id.size()) != 0) {
        if (KLIBCErrGet() != KLIB_ERR_NONE) {
            throwDatabaseFailure("look up a playlist");
        }
        return {};
    }
    return sharedPlaylists(std::string("id = ") + id.data(), kAll).playlists;
}

Playlist playlistAt(const std::string &path, const std::string &directory) {
    if (!directory.empty()) {
        std::vector<Playlist> found = personalPlaylists(directory, kAll).playlists;
        std::erase_if(found, [&](const Playlist &each) { return each.path != path; });
        return theOneOf(found, path, directory);
    }
    const std::vector<Playlist> rows = rowsOf(path);
    if (!rows.empty()) {
        return rows.front();
    }
    if (access(path.c_str(), F_OK) != 0) {
        throwUnknown(path, directory);
    }
    return {0, fs::path(path).stem(), "", path};
}

constexpr size_t kMostTitleBytes = NAME_MAX - 4;  // with the ending

void requireTitle(const std::string &title) {
    if (!isTitle(title)) {
        throw Failure("could not name a playlist '" + printable(title) + "': a name has 1 to " +
                      std::to_string(kMostTitleBytes) +
                      " bytes of printable UTF-8, no / and no dot in front");
    }
}

std::string folderOfNew(const std::string &directory) {
    if (!directory.empty()) {
        return absolutePath(directory) + "/" + kFolder;
    }
    std::array<char, PATH_MAX> root{};
    if (readlink(ZANO_PATH_MUSIC_LINK, root.data(), root.size() - 1) == -1) {
        throw Failure(std::string("could not find the music: the link " ZANO_PATH_MUSIC_LINK
                                  " cannot be read: ") +
                      std::strerror(errno) + "; make it, or keep your own playlist with --dir");
    }
    return std::string(root.data()) + "/" + kFolder;
}

ZANO_MEDIA_INFO rowOf(const Playlist &playlist) {
    ZANO_MEDIA_INFO row{};
    std::snprintf(row.path, sizeof row.path, "%s", playlist.path.c_str());
    std::snprintf(row.title, sizeof row.title, "%s", playlist.title.c_str());
    std::snprintf(row.album, sizeof row.album, "%s", playlist.folder.c_str());
    return row;
}

void deleteShared(const Playlist &playlist) {
    ZANO_PLAYLIST node{};
    std::snprintf(node.path, sizeof node.path, "%s", playlist.path.c_str());
    ZANOPlayListUnlink(&node);
    // The library does not tell how it went.
    if (access(playlist.path.c_str(), F_OK) == 0) {
        throw Failure("could not delete " + printable(playlist.path) +
                      "; it is in no list any more: delete the file");
    }
    if (!rowsOf(playlist.path).empty()) {
        throw Failure("deleted " + printable(playlist.path) +
                      ", but the media database still lists it; try again");
    }
}

}  // namespace

PlaylistListing listPlaylists(const std::string &directory, const Span &span) {
    return directory.empty() ? sharedPlaylists("", span) : personalPlaylists(directory, span);
}

Playlist findPlaylist(const std::string &name, const std::string &directory) {
    return name.find('/') == std::string::npos ? playlistNamed(name, directory)
                                               : playlistAt(absolutePath(name), directory);
}

std::optional<Playlist> playlistById(int id) {
    const auto rows = sharedPlaylists("id = " + std::to_string(id), kAll).playlists;
    return rows.empty() ? std::nullopt : std::optional(rows.front());
}

bool isTitle(const std::string &title) {
    return !title.empty() && title.front() != '.' && title.size() <= kMostTitleBytes &&
           title.find('/') == std::string::npos && printable(title) == title;
}

Playlist newPlaylist(const std::string &title, const std::string &form,
                     const std::string &directory) {
    requireTitle(title);
    const std::string folder = folderOfNew(directory);
    std::error_code error;
    fs::create_directory(folder, error);
    if (error) {
        throw Failure("could not make the folder " + printable(folder) + ": " + error.message());
    }
    return {0, title, directory.empty() ? kFolder : title, folder + "/" + title + "." + form};
}

void enterPlaylist(Playlist &playlist, const std::string &directory) {
    if (!directory.empty()) {
        playlist.id = findPlaylist(playlist.path, directory).id;
        return;
    }
    const ZANO_MEDIA_INFO row = rowOf(playlist);
    if (ZANOPlaylistDBSave(&row) != 0) {
        throwDatabaseFailure("enter the playlist " + printable(playlist.path));
    }
    const std::vector<Playlist> rows = rowsOf(playlist.path);
    playlist.id = rows.empty() ? 0 : rows.front().id;
}

void putPlaylist(Playlist &playlist, Draft &draft, bool replaces, const std::string &directory) {
    const bool isNew = access(playlist.path.c_str(), F_OK) != 0;
    if (replaces) {
        draft.putInPlace();
    } else {
        draft.putAsNew();
    }
    try {
        enterPlaylist(playlist, directory);
    } catch (const Failure &) {
        if (isNew) {
            unlink(playlist.path.c_str());
        }
        throw;
    }
}

void deletePlaylist(const Playlist &playlist, const std::string &directory, Deadline deadline) {
    if (playlist.id == 0) {
        throw Failure("could not delete " + printable(playlist.path) +
                      ": it is no shared playlist; your own are deleted with --dir");
    }
    std::unique_ptr<Draft> lock;
    if (access(playlist.path.c_str(), F_OK) == 0) {
        lock = std::make_unique<Draft>(playlist.path, deadline);
    }
    if (directory.empty()) {
        deleteShared(playlist);
    } else if (unlink(playlist.path.c_str()) != 0) {
        throw Failure("could not delete " + printable(playlist.path) + ": " + std::strerror(errno));
    }
}

}  // namespace vorelix
