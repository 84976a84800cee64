/* From a row of an engine to a record. A Row has integer(), real() and text() of a column. */
#pragma once

#include <vorelix/records.h>

#include <cstring>
#include <string>
#include <string_view>
#include <vector>

#include "query/expression.h"
#include "text/fold.h"

namespace zano::mediadb {

template <size_t width>
void putText(char (&field)[width], std::string_view text) {
    const std::string_view cut = cutAtCharacter(text, width - 1);
    std::memcpy(field, cut.data(), cut.size());
}

/* A field that its writer filled to the last byte ends there. */
template <size_t width>
std::string_view fieldText(const char (&field)[width]) {
    return {field, strnlen(field, width)};
}

/* Writes one column of a row into a field of a record that is zero. */
template <typename Row>
void putColumn(const Row &row, int index, Column field, ZANO_MEDIA_INFO &record) {
    switch (field) {
        case Column::Id:
            record.id = static_cast<int>(row.integer(index));
            break;
        case Column::Path:
            putText(record.path, row.text(index));
            break;
        case Column::Title:
            putText(record.title, row.text(index));
            break;
        case Column::Album:
            putText(record.album, row.text(index));
            break;
        case Column::Artist:
            putText(record.artist, row.text(index));
            break;
        case Column::Genre:
            putText(record.genre, row.text(index));
            break;
        case Column::Track:
            record.track = static_cast<int>(row.integer(index));
            break;
        case Column::Disc:
            record.disc = static_cast<int>(row.integer(index));
            break;
        case Column::Year:
            record.year = static_cast<int>(row.integer(index));
            break;
        case Column::Duration:
            record.duration = static_cast<float>(row.real(index));
            break;
        case Column::Bitrate:
            record.bitrate = static_cast<int>(row.integer(index));
            break;
        case Column::Frequency:
            record.frequency = static_cast<int>(row.integer(index));
            break;
        case Column::AlbumArtist:
            break;  // the record has no place for it
    }
}

template <typename Row>
void putRow(const Row &row, const std::vector<SelectedColumn> &select, ZANO_MEDIA_INFO &record) {
    std::memset(&record, 0, sizeof record);
    int index = 0;
    for (const SelectedColumn &selected : select) {
        putColumn(row, index++, selected.field, record);
    }
}

/* "songs.id, songs.path", for the qualifier "songs.". */
inline std::string columnList(const std::vector<SelectedColumn> &select,
                              std::string_view qualifier) {
    std::string list;
    list.reserve(select.size() * 24);
    for (const SelectedColumn &selected : select) {
        list.append(list.empty() ? "" : ", ").append(qualifier);
        list.append(columnInfo(selected.column).name);
    }
    return list;
}

}  // namespace zano::mediadb
