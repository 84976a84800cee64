#include "ipod.h"

#include <gpod/itdb.h>

#include <map>
#include <memory>
#include <stdexcept>

namespace zano::ipod {
namespace {

struct FreeDatabase {
    void operator()(Itdb_iTunesDB *database) const { itdb_free(database); }
};
using Database = std::unique_ptr<Itdb_iTunesDB, FreeDatabase>;

struct FreeText {
    void operator()(gchar *text) const { g_free(text); }
};

std::string textOf(const gchar *text) {
    return text != nullptr ? text : "";
}

/* The items of a list of the library's own. */
template <typename Item>
std::vector<Item *> itemsOf(const GList *list) {
    std::vector<Item *> items;
    for (; list != nullptr; list = list->next) {
        items.push_back(static_cast<Item *>(list->data));
    }
    return items;
}

Database open(const std::string &folder) {
    GError *failure = nullptr;
    Database database(itdb_parse(folder.c_str(), &failure));
    const std::unique_ptr<GError, decltype(&g_error_free)> owner(failure, &g_error_free);
    if (database == nullptr) {
        throw std::runtime_error("could not read an iPod at " + folder +
                                 (failure != nullptr ? std::string(": ") + failure->message : "") +
                                 "; name the folder that has its iPod_Control");
    }
    return database;
}

Track trackOf(const Itdb_Track &item, const std::string &path) {
    constexpr int kMsOfSecond = 1000;
    Track track;
    track.title = textOf(item.title);
    track.artist = textOf(item.artist);
    track.album = textOf(item.album);
    track.genre = textOf(item.genre);
    track.seconds = (item.tracklen + kMsOfSecond / 2) / kMsOfSecond;
    track.kilobits = item.bitrate;
    track.hertz = item.samplerate;
    track.path = path;
    return track;
}

}  // namespace

Contents readIPod(const std::string &folder) {
    const Database database = open(folder);
    Contents contents;
    std::map<const Itdb_Track *, std::size_t> indexes;
    for (Itdb_Track *item : itemsOf<Itdb_Track>(database->tracks)) {
        const std::unique_ptr<gchar, FreeText> path(itdb_filename_on_ipod(item));
        if (path == nullptr) {
            contents.missing.push_back(textOf(item->title));
            continue;
        }
        indexes[item] = contents.tracks.size();
        contents.tracks.push_back(trackOf(*item, path.get()));
    }
    for (Itdb_Playlist *item : itemsOf<Itdb_Playlist>(database->playlists)) {
        if (itdb_playlist_is_mpl(item) != 0) {
            continue;
        }
        Playlist playlist{textOf(item->name), {}};
        for (const Itdb_Track *member : itemsOf<Itdb_Track>(item->members)) {
            const auto found = indexes.find(member);
            if (found != indexes.end()) {
                playlist.tracks.push_back(found->second);
            }
        }
        contents.playlists.push_back(std::move(playlist));
    }
    return contents;
}

}  // namespace zano::ipod
