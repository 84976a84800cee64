#include "playlist_answers.h"

#include "json.h"
#include "numbers.h"
#include "table.h"
#include "text.h"

namespace vorelix {

std::string shownName(const Playlist &playlist) {
    const std::string id =
        playlist.id != 0 ? " (playlist " + std::to_string(playlist.id) + ")" : "";
    return "'" + printable(playlist.title) + "'" + id;
}

std::string entryCount(size_t count) {
    return std::to_string(count) + (count == 1 ? " entry" : " entries");
}

std::string entryTable(const std::vector<Placed> &entries, const Terminal &terminal) {
    Table table({{.header = "No.", .right = true},
                 {.header = "ID", .right = true, .rank = 4},
                 {.header = "Title", .cut = true},
                 {.header = "Artist", .cut = true, .rank = 1},
                 {.header = "Album", .cut = true, .rank = 2},
                 {.header = "Time", .right = true, .rank = 3}});
    for (const auto &[position, entry] : entries) {
        table.addRow({std::to_string(position), numberText(entry->id),
                      *entry->title != '\0' ? entry->title : entry->path, entry->artist,
                      entry->album, durationText(entry->duration)});
    }
    return table.render(terminal);
}

Json::Value playlistObject(const Playlist &playlist) {
    Json::Value object(Json::objectValue);
    object["id"] = playlist.id;
    object["title"] = validUtf8(playlist.title);
    object["folder"] = validUtf8(playlist.folder);
    const std::string path = validUtf8(playlist.path);
    object["path"] = path;
    if (path != playlist.path) {
        object["pathBytes"] = base64(playlist.path);
    }
    return object;
}

Json::Value entryArray(const std::vector<Placed> &entries) {
    Json::Value array(Json::arrayValue);
    for (const auto &[position, entry] : entries) {
        Json::Value object = songObject(*entry);
        object["position"] = Json::UInt64{position};
        array.append(object);
    }
    return array;
}

}  // namespace vorelix
