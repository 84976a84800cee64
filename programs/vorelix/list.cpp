#include <vorelix/playlists/playlist.h>

#include "commands.h"
#include "json.h"
#include "numbers.h"
#include "paging.h"
#include "table.h"
#include "text.h"

namespace vorelix {

namespace {

constexpr const char *kRandom = "random";

/* The column that the songs are sorted by is the last to be left out for want of room. */
Table songTable(const std::string &sortedBy) {
    std::vector<Table::Column> columns = {
        {.header = "ID", .right = true},
        {.header = "Title", .cut = true},
        {.header = "Artist", .cut = true, .rank = 1},
        {.header = "Album", .cut = true, .rank = 2},
        {.header = "Genre", .cut = true, .rank = 5},
        {.header = "Year", .right = true, .rank = 4},
        {.header = "Time", .right = true, .rank = 3},
    };
    constexpr struct {
        const char *sort;
        size_t column;
    } kSorted[] = {{"artist", 2}, {"album", 3}, {"genre", 4}, {"year", 5}, {"duration", 6}};
    for (const auto &row : kSorted) {
        if (sortedBy == row.sort) {
            columns[row.column].rank = 0;
        }
    }
    return Table(std::move(columns));
}

std::string tableOf(const ZANO_PLAYLIST_REC *list, const Request &request,
                    const Terminal &terminal) {
    Table table = songTable(request.order.by);
    for (; list != nullptr; list = list->next) {
        const ZANO_MEDIA_INFO &song = list->info;
        table.addRow({std::to_string(song.id), song.title, song.artist, song.album, song.genre,
                      numberText(song.year), durationText(song.duration)});
    }
    return table.render(terminal);
}

std::string summaryOf(const Request &request, int shown, int total) {
    const std::string &keyword = request.filter.keyword;
    if (total == 0) {
        return keyword.empty() ? "no songs yet; index a folder: zanoindex FOLDER"
                               : "no songs with '" + printable(keyword) + "'";
    }
    if (request.order.by == kRandom) {  // a next page would be drawn from all songs again
        return std::to_string(shown) + " of " + std::to_string(total) + " songs, by chance";
    }
    return pageLine("songs", request, shown, total);
}

}  // namespace

Outcome listCommand(const Request &request, const Terminal &terminal) {
    const Listing listing = listSongs(request.filter, request.order, request.span);
    if (request.json) {
        Json::Value answer(Json::objectValue);
        answer["songs"] = songArray(listing.songs.get());
        return {documentOf(withSpan(answer, request.span, listing.total)), ""};
    }
    const auto shown = static_cast<int>(ZANOPlaylistRecCount(listing.songs.get()));
    const std::string table =
        shown > 0 ? tableOf(listing.songs.get(), request, terminal) + "\n" : "";
    return {table + summaryOf(request, shown, listing.total) + "\n", ""};
}

Outcome randomCommand(const Request &request, const Terminal &terminal) {
    Request listed = request;
    listed.order.by = kRandom;
    return listCommand(listed, terminal);
}

}  // namespace vorelix
