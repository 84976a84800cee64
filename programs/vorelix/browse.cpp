#include <vorelix/playlists/playlist.h>

#include "commands.h"
#include "json.h"
#include "paging.h"
#include "table.h"
#include "text.h"

namespace vorelix {

namespace {

std::string documentOfValues(const Request &request, const Listing &listing) {
    Json::Value answer(Json::objectValue);
    answer["column"] = request.column;
    Json::Value &values = answer["values"] = Json::Value(Json::arrayValue);
    for (const auto *row = listing.songs.get(); row != nullptr; row = row->next) {
        values.append(validUtf8(row->info.title));
    }
    return documentOf(withSpan(answer, request.span, listing.total));
}

std::string tableOfValues(const std::string &header, const ZANO_PLAYLIST_REC *list,
                          const Terminal &terminal) {
    Table table({{.header = header, .cut = true}});
    for (; list != nullptr; list = list->next) {
        table.addRow({*list->info.title != '\0' ? list->info.title : "(unknown)"});
    }
    return table.render(terminal);
}

}  // namespace

Outcome browseCommand(const Request &request, const Terminal &terminal) {
    Filter filter = request.filter;
    filter.in = request.column;
    const Listing listing = listValues(request.column, filter, request.order, request.span);
    if (request.json) {
        return {documentOfValues(request, listing), ""};
    }
    const std::string noun = request.column + "s";
    if (listing.total == 0) {
        return {filter.keyword.empty()
                    ? "no " + noun + " yet; index a folder: zanoindex FOLDER\n"
                    : "no " + noun + " with '" + printable(filter.keyword) + "'\n",
                ""};
    }
    std::string header = request.column;
    header.front() = static_cast<char>(std::toupper(header.front()));
    const auto shown = static_cast<int>(ZANOPlaylistRecCount(listing.songs.get()));
    const std::string table =
        shown > 0 ? tableOfValues(header, listing.songs.get(), terminal) + "\n" : "";
    return {table + pageLine(noun, request, shown, listing.total) + "\n", ""};
}

}  // namespace vorelix
