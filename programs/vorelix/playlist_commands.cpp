/* playlist list, show and delete. */
#include <algorithm>

#include "commands.h"
#include "json.h"
#include "paging.h"
#include "playlist_answers.h"
#include "playlist_catalogue.h"
#include "table.h"
#include "text.h"

namespace vorelix {

namespace {

std::string tableOf(const std::vector<Playlist> &playlists, const Terminal &terminal) {
    Table table({{.header = "ID", .right = true},
                 {.header = "Title", .cut = true},
                 {.header = "Path", .cut = true, .rank = 1}});
    for (const Playlist &each : playlists) {
        table.addRow({std::to_string(each.id), each.title, each.path});
    }
    return table.render(terminal);
}

std::string documentOfPlaylists(const PlaylistListing &listing, const Span &span) {
    Json::Value answer(Json::objectValue);
    Json::Value &rows = answer["playlists"] = Json::Value(Json::arrayValue);
    for (const Playlist &each : listing.playlists) {
        rows.append(playlistObject(each));
    }
    return documentOf(withSpan(answer, span, listing.total));
}

std::vector<Placed> pageOf(const Entries &entries, const Span &span) {
    std::vector<Placed> page;
    const size_t first = std::min(static_cast<size_t>(span.offset), entries.size());
    const size_t last = std::min(first + static_cast<size_t>(span.limit), entries.size());
    for (size_t i = first; i < last; ++i) {
        page.push_back({i + 1, entries[i]});
    }
    return page;
}

std::string documentOfEntries(const Playlist &playlist, const Entries &entries, const Span &span) {
    Json::Value answer(Json::objectValue);
    answer["playlist"] = playlistObject(playlist);
    answer["entries"] = entryArray(pageOf(entries, span));
    answer["known"] = knownAmong(entries);
    return documentOf(withSpan(answer, span, static_cast<int>(entries.size())));
}

std::string textOfEntries(const Entries &entries, const Request &request,
                          const Terminal &terminal) {
    if (entries.empty()) {
        return "no entries yet; add songs by their ids: vorelix playlist append\n";
    }
    const std::vector<Placed> page = pageOf(entries, request.span);
    const auto total = static_cast<int>(entries.size());
    const int unknown = total - knownAmong(entries);
    std::string text = page.empty() ? "" : entryTable(page, terminal) + "\n";
    text += pageLine("entries", request, static_cast<int>(page.size()), total) + "\n";
    return unknown == 0 ? text
                        : text + std::to_string(unknown) +
                              " of them not in the media database: they have no ID\n";
}

}  // namespace

Outcome playlistListCommand(const Request &request, const Terminal &terminal) {
    const PlaylistListing listing = listPlaylists(request.playlist.directory, request.span);
    if (request.json) {
        return {documentOfPlaylists(listing, request.span), ""};
    }
    if (listing.total == 0) {
        return {"no playlists yet; make one: vorelix playlist create NAME ID...\n", ""};
    }
    const auto shown = static_cast<int>(listing.playlists.size());
    const std::string table = shown > 0 ? tableOf(listing.playlists, terminal) + "\n" : "";
    return {table + pageLine("playlists", request, shown, listing.total) + "\n", ""};
}

Outcome playlistShowCommand(const Request &request, const Terminal &terminal) {
    const Playlist playlist = findPlaylist(request.playlist.name, request.playlist.directory);
    const SongList list = readEntries(playlist.path);
    const Entries entries = entriesOf(list);
    if (request.json) {
        return {documentOfEntries(playlist, entries, request.span), ""};
    }
    return {shownName(playlist) + ": " + printable(playlist.path) + "\n\n" +
                textOfEntries(entries, request, terminal),
            ""};
}

Outcome playlistDeleteCommand(const Request &request, const Terminal &) {
    const Playlist playlist = findPlaylist(request.playlist.name, request.playlist.directory);
    deletePlaylist(playlist, request.playlist.directory, deadlineOf(request.playlist.waitSeconds));
    if (request.json) {
        Json::Value answer(Json::objectValue);
        answer["playlist"] = playlistObject(playlist);
        return {documentOf(answer), ""};
    }
    return {"deleted " + shownName(playlist) + ": " + printable(playlist.path) + "\n", ""};
}

}  // namespace vorelix
