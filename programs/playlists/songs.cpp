#include "songs.h"

#include <vorelix/library/musiclib.h>
#include <vorelix/playlists/playlist.h>
#include <zanoplatform/media_database.h>
#include <zanoplatform/sql_escape.h>
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
    {"track", "track"},        {"path", "path"},
    {"added", "id"},           {"random", kRandomOrder},
};

std::string withQuotesDoubled(const std::string &text) {
    std::string escaped(2 * text.size() + 1, '\0');
    const int length =
        ZANODBEscapeString(escaped.data(), text.c_str(), static_cast<int>(text.size()));
    escaped.resize(static_cast<size_t>(std::max(length, 0)));
    return escaped;
}

std::string withBackslashesDoubled(const std::string &text) {
    std::string escaped(2 * text.size() + 1, '\0');
    const int length =
        ZANODBEscapeBackslash(escaped.data(), static_cast<int>(escaped.size()), text.c_str());
    escaped.resize(static_cast<size_t>(std::max(length, 0)));
    return escaped;
}

std::string conditionOfKeyword(const Filter &filter) {
    const std::string like = " ilike '%" + literalPattern(filter.keyword) + "%'";
    std::string condition;
    for (const char *column : kSearchable) {
        if (filter.in == kAnyColumn || filter.in == column) {
            condition += (condition.empty() ? "(" : " or ") + (column + like);
        }
    }
    return condition + ")";
}

/* The search index knows patterns only, and an empty one finds no song without the text. */
std::string conditionOf(const Exact &exact) {
    const std::string column = exact.column;
    const std::string equal = column + " = '" + withQuotesDoubled(exact.text) + "'";
    return exact.text.empty() ? equal
                              : column + " ilike '" + literalPattern(exact.text) + "' and " + equal;
}

std::string conditionOf(const Filter &filter) {
    std::vector<std::string> parts;
    if (!filter.folder.empty()) {
        parts.push_back("path like '" + literalPattern(filter.folder) + "/%'");
    }
    for (const Exact &exact : filter.exact) {
        parts.push_back(conditionOf(exact));
    }
    if (!filter.keyword.empty()) {
        parts.push_back(conditionOfKeyword(filter));
    }
    std::string condition;
    for (const std::string &part : parts) {
        condition.append(condition.empty() ? "" : " and ").append(part);
    }
    return condition;
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
    for (const char c : withBackslashesDoubled(text)) {
        pattern.append(c == '%' || c == '_' ? "\\" : "").push_back(c);
    }
    return withQuotesDoubled(pattern);
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
