#include "songs.h"

#include <vorelix/library/musiclib.h>
#include <vorelix/playlists/playlist.h>
#include <zanoplatform/media_database.h>
#include <algorithm>
#include <iterator>

#include "failure.h"

namespace vorelix {

namespace {

constexpr const char *kAnyColumn = "any";
constexpr const char *kSearchable[] = {"title", "artist", "album", "genre"};

struct SortKey {
    const char *name;
    const char *term;
};

constexpr const char *kRandomOrder = "RANDOM()";
constexpr SortKey kSortKeys[] = {
    {"title", "lower(title)"}, {"artist", "lower(artist)"},
    {"album", "lower(album)"}, {"genre", "lower(genre)"},
    {"year", "year"},          {"duration", "duration"},
    {"path", "path"},          {"added", "id"},
    {"random", kRandomOrder},
};

std::string conditionOf(const Filter &filter) {
    if (filter.keyword.empty()) {
        return {};
    }
    const std::string like = " ilike '%" + literalPattern(filter.keyword) + "%'";
    std::string condition;
    for (const char *column : kSearchable) {
        if (filter.in == kAnyColumn || filter.in == column) {
            condition += (condition.empty() ? "(" : " or ") + (column + like);
        }
    }
    return condition + ")";
}

std::string orderOf(const Order &order) {
    const auto *key = std::find_if(std::begin(kSortKeys), std::end(kSortKeys),
                                   [&](const SortKey &row) { return row.name == order.by; });
    if (key->term == kRandomOrder) {
        return kRandomOrder;
    }
    char text[1024] = "";
    GenerateOrderString((std::string(key->term) + (order.descending ? " desc" : "")).c_str(), text,
                        sizeof(text));
    return text;
}

const char *orNull(const std::string &text) {
    return text.empty() ? nullptr : text.c_str();
}

/* Column names of a query; null where the library's own default is meant. */
struct Columns {
    const char *select = nullptr;
    const char *distinct = nullptr;
    const char *orderBy = nullptr;
};

Listing browse(const Columns &columns, const Filter &filter, const Span &span, const char *what) {
    ZANO_PLAYLIST_REC *list = nullptr;
    const std::string condition = conditionOf(filter);
    const int total = ZANOMusicBrowse(MEDIA_TABLE_SONGS, &list, columns.select, orNull(condition),
                                      columns.distinct, columns.orderBy, span.offset, span.limit);
    if (total < 0) {
        throwDatabaseFailure(what);
    }
    return {SongList(list), total};
}

}  // namespace

std::string literalPattern(const std::string &text) {
    std::string pattern;
    for (const char c : text) {
        if (c == '\\' || c == '%' || c == '_') {
            pattern += '\\';
        }
        pattern.append(c == '\'' ? 2 : 1, c);
    }
    return pattern;
}

void FreeRecords::operator()(ZANO_PLAYLIST_REC *list) const {
    ZANOPlaylistRecFree(list);
}

std::vector<std::string> searchableNames() {
    std::vector<std::string> names(std::begin(kSearchable), std::end(kSearchable));
    names.emplace_back(kAnyColumn);
    return names;
}

std::vector<std::string> sortNames() {
    std::vector<std::string> names;
    for (const SortKey &key : kSortKeys) {
        names.emplace_back(key.name);
    }
    return names;
}

Listing listSongs(const Filter &filter, const Order &order, const Span &span) {
    const std::string orderBy = orderOf(order);
    return browse({.orderBy = orderBy.c_str()}, filter, span, "list songs");
}

int countSongs(const Filter &filter) {
    return browse({.select = "id"}, filter, {.limit = 1}, "count songs").total;
}

Listing listValues(const std::string &column, const Filter &filter, const Order &order,
                   const Span &span) {
    const std::string select = " " + column + " as title ";
    const std::string orderBy = "lower(" + column + ")" + (order.descending ? " desc" : "");
    return browse({select.c_str(), column.c_str(), orderBy.c_str()}, filter, span, "list values");
}

SongList songsById(const std::vector<int> &ids) {
    std::string text;
    for (const int id : ids) {
        text.append(text.empty() ? "" : ",").append(std::to_string(id));
    }
    ZANO_PLAYLIST_REC *list = nullptr;
    if (ZANOMusicListGetByID(&list, text.c_str()) != 0) {
        throwDatabaseFailure("look up songs");
    }
    return SongList(list);
}

}  // namespace vorelix
