#include "columns.h"

#include <algorithm>
#include <array>

namespace zano::mediadb {
namespace {

/* In the order of the enumeration. */
constexpr std::array kColumns = {
    ColumnInfo{Column::Id, "id", "", false, true},
    ColumnInfo{Column::Path, "path", "", true, true},
    ColumnInfo{Column::Title, "title", "title_key", true, true},
    ColumnInfo{Column::Album, "album", "album_key", true, true},
    ColumnInfo{Column::Artist, "artist", "artist_key", true, false},
    ColumnInfo{Column::Genre, "genre", "genre_key", true, false},
    ColumnInfo{Column::Track, "track", "", false, false},
    ColumnInfo{Column::Disc, "disc", "", false, false},
    ColumnInfo{Column::Year, "year", "", false, false},
    ColumnInfo{Column::Duration, "duration", "", false, false},
    ColumnInfo{Column::Bitrate, "bitrate", "", false, false},
    ColumnInfo{Column::Frequency, "frequency", "", false, false},
    ColumnInfo{Column::AlbumArtist, "album_artist", "", true, false},
};

constexpr bool rowsFollowTheEnumeration() {
    for (size_t i = 0; i < kColumns.size(); ++i) {
        if (static_cast<size_t>(kColumns[i].column) != i) {
            return false;
        }
    }
    return true;
}
static_assert(rowsFollowTheEnumeration());

char lower(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

}  // namespace

const ColumnInfo &columnInfo(Column column) {
    return kColumns[static_cast<size_t>(column)];
}

std::optional<Column> findColumn(Table table, std::string_view name) {
    for (const ColumnInfo &info : kColumns) {
        if ((table == Table::Songs || info.inPlaylists) && equalsIgnoringCase(info.name, name)) {
            return info.column;
        }
    }
    return std::nullopt;
}

bool equalsIgnoringCase(std::string_view a, std::string_view b) {
    return std::equal(a.begin(), a.end(), b.begin(), b.end(),
                      [](char x, char y) { return lower(x) == lower(y); });
}

}  // namespace zano::mediadb
