/* The columns that queries may name, and where they go in a record. */
#pragma once

#include <optional>
#include <string_view>

namespace zano::mediadb {

enum class Table { Songs, Playlists };

enum class Column {
    Id,
    Path,
    Title,
    Album,
    Artist,
    Genre,
    Track,
    Disc,
    Year,
    Duration,
    Bitrate,
    Frequency,
    AlbumArtist,
};

struct ColumnInfo {
    Column column;
    std::string_view name;
    std::string_view key;  // the column that holds the folded key; "" when there is none
    bool isText;
    bool inPlaylists;
};

const ColumnInfo &columnInfo(Column column);

/* The column of a name in any mix of case, when the table has it. */
std::optional<Column> findColumn(Table table, std::string_view name);

/* Letters A to Z do not count as different from a to z. */
bool equalsIgnoringCase(std::string_view a, std::string_view b);

}  // namespace zano::mediadb
