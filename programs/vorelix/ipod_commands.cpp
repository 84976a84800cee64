/* ipod tracks, track, playlists and songs. */
#include <unistd.h>
#include <vorelix/ipod/ipod.h>
#include <vorelix/playlists/playlist.h>

#include <algorithm>
#include <cerrno>
#include <memory>

#include "commands.h"
#include "failure.h"
#include "file_draft.h"
#include "json.h"
#include "numbers.h"
#include "paging.h"
#include "playlist_answers.h"
#include "playlist_entries.h"
#include "system_paths_internal.h"
#include "table.h"
#include "text.h"

namespace vorelix {

namespace {

constexpr const char *kTrackList = ZANO_PATH_IPOD_FOLDER "tracks.m3u";
constexpr const char *kSeeLog = "; see the library's log with --verbose";

/* The library looks at the configuration first, and tells on standard output when it cannot. */
void requireFile(const char *path, const char *otherwise) {
    if (access(path, R_OK) != 0) {
        throw Failure("could not read " + printable(path) + ": " + reasonOf(errno) + "; " +
                      otherwise);
    }
}

void requireTracks() {
    requireFile(ZANO_PATH_AUDIO_CONF, "make it: vorelix config restore");
    requireFile(kTrackList, "it is written when an iPod is attached: zanoipod");
}

/* One of the two list readers keeps the ends of the lines. */
template <size_t Size>
void dropLineEnd(char (&text)[Size]) {
    std::string_view kept(text);
    kept = kept.substr(0, kept.find_last_not_of("\r\n") + 1);
    text[kept.size()] = '\0';
}

std::vector<Placed> placed(const SongList &list, const Span &span) {
    std::vector<Placed> tracks;
    for (ZANO_MEDIA_INFO *track : entriesOf(list)) {
        dropLineEnd(track->title);
        dropLineEnd(track->artist);
        dropLineEnd(track->album);
        dropLineEnd(track->genre);
        tracks.push_back({static_cast<size_t>(span.offset) + tracks.size() + 1, track});
    }
    return tracks;
}

std::string tableOf(const std::vector<Placed> &tracks, const Terminal &terminal) {
    Table table({{.header = "No.", .right = true},
                 {.header = "Title", .cut = true},
                 {.header = "Artist", .cut = true, .rank = 1},
                 {.header = "Album", .cut = true, .rank = 2},
                 {.header = "Genre", .cut = true, .rank = 4},
                 {.header = "Time", .right = true, .rank = 3}});
    for (const auto &[position, track] : tracks) {
        table.addRow({std::to_string(position), track->title, track->artist, track->album,
                      track->genre, durationText(track->duration)});
    }
    return table.render(terminal);
}

Outcome answerOf(const SongList &list, int total, const Request &request, const Terminal &terminal,
                 Json::Value document) {
    const std::vector<Placed> tracks = placed(list, request.span);
    if (request.json) {
        document["tracks"] = entryArray(tracks);
        return {documentOf(withSpan(document, request.span, total)), ""};
    }
    if (total == 0) {
        return {"no tracks\n", ""};
    }
    const std::string table = tracks.empty() ? "" : tableOf(tracks, terminal) + "\n";
    return {table + pageLine("tracks", request, static_cast<int>(tracks.size()), total) + "\n", ""};
}

struct FreePlaylists {
    void operator()(ZANO_PLAYLIST *list) const { ZANOPlayListFree(list); }
};

struct IPodPlaylist {
    std::string title;
    std::string path;
};

std::vector<IPodPlaylist> allPlaylists() {
    ZANO_PLAYLIST *list = nullptr;
    if (ZANOIPodPlaylistGetAll(&list) != 0) {
        requireFile(ZANO_PATH_IPOD_FOLDER, "it is made when an iPod is attached: zanoipod");
        throw Failure(std::string("could not list the playlists of the iPod") + kSeeLog);
    }
    const std::unique_ptr<ZANO_PLAYLIST, FreePlaylists> owner(list);
    std::vector<IPodPlaylist> playlists;
    for (; list != nullptr; list = list->next) {
        playlists.push_back({list->title, list->path});
    }
    return playlists;
}

IPodPlaylist findPlaylist(const std::string &name) {
    std::vector<IPodPlaylist> found;
    for (const IPodPlaylist &each : allPlaylists()) {
        if (each.title == name || each.path == name) {
            found.push_back(each);
        }
    }
    if (found.size() > 1) {
        throw Failure("the iPod has several playlists " + printable(name) +
                      "; name one by its path: vorelix ipod playlists");
    }
    if (found.empty()) {
        throw Failure("the iPod has no playlist " + printable(name) +
                      "; vorelix ipod playlists shows those that there are");
    }
    return found.front();
}

Json::Value playlistObject(const IPodPlaylist &playlist) {
    Json::Value object(Json::objectValue);
    object["title"] = validUtf8(playlist.title);
    object["path"] = validUtf8(playlist.path);
    return object;
}

}  // namespace

Outcome ipodTracksCommand(const Request &request, const Terminal &terminal) {
    requireTracks();
    ZANO_PLAYLIST_REC *list = nullptr;
    int total = 0;
    if (ZANOIPodInfoGetAll(&list, request.span.offset, request.span.limit, &total) != 0) {
        throw Failure(std::string("could not read the tracks of the iPod") + kSeeLog);
    }
    return answerOf(SongList(list), total, request, terminal, Json::Value(Json::objectValue));
}

Outcome ipodTrackCommand(const Request &request, const Terminal &) {
    requireTracks();
    const auto info = std::make_unique<ZANO_MEDIA_INFO>();
    if (ZANOIPodInfoGet(info.get(), request.state.number) != 0) {
        throw Failure(std::string("could not read the tracks of the iPod") + kSeeLog);
    }
    // Its title is never empty.
    if (info->title[0] == '\0') {
        throw Failure("the iPod has no track " + std::to_string(request.state.number) +
                      "; vorelix ipod tracks shows those that there are");
    }
    if (request.json) {
        Json::Value answer(Json::objectValue);
        answer["track"] = songObject(*info);
        return {documentOf(answer), ""};
    }
    const struct {
        const char *label;
        std::string text;
    } lines[] = {{"Title     ", info->title},
                 {"Artist    ", info->artist},
                 {"Album     ", info->album},
                 {"Genre     ", info->genre},
                 {"Time      ", durationText(info->duration)},
                 {"Bit rate  ", bitrateText(info->bitrate)},
                 {"Frequency ", frequencyText(info->frequency)}};
    std::string details;
    for (const auto &line : lines) {
        details += line.label + (line.text.empty() ? "-" : printable(line.text)) + "\n";
    }
    return {details, ""};
}

Outcome ipodPlaylistsCommand(const Request &request, const Terminal &terminal) {
    const std::vector<IPodPlaylist> playlists = allPlaylists();
    if (request.json) {
        Json::Value answer(Json::objectValue);
        Json::Value &rows = answer["playlists"] = Json::Value(Json::arrayValue);
        for (const IPodPlaylist &each : playlists) {
            rows.append(playlistObject(each));
        }
        answer["total"] = Json::UInt64{playlists.size()};
        return {documentOf(answer), ""};
    }
    if (playlists.empty()) {
        return {"no playlists\n", ""};
    }
    Table table({{.header = "Title", .cut = true}, {.header = "Path", .cut = true, .rank = 1}});
    for (const IPodPlaylist &each : playlists) {
        table.addRow({each.title, each.path});
    }
    return {table.render(terminal), ""};
}

Outcome ipodSongsCommand(const Request &request, const Terminal &terminal) {
    const IPodPlaylist playlist = findPlaylist(request.state.name);
    requireFile(playlist.path.c_str(), "let others read it");
    ZANO_PLAYLIST_REC *list = nullptr;
    const int total =
        ZANOIPodListSongsAll(playlist.path.c_str(), &list, request.span.offset, request.span.limit);
    if (total < 0) {
        throw Failure("could not read " + printable(playlist.path) + kSeeLog);
    }
    Json::Value document(Json::objectValue);
    document["playlist"] = playlistObject(playlist);
    return answerOf(SongList(list), total, request, terminal, std::move(document));
}

}  // namespace vorelix
