#include "raw.h"

#include <zanoplatform/media_database.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <stdexcept>

#include "mediadb/sqlite/grams.h"
#include "mediadb/sqlite/handle.h"

namespace zano::bench {
namespace {

void check(bool isRight, sqlite3 *database) {
    if (!isRight) {
        throw std::runtime_error(sqlite3_errmsg(database));
    }
}

void copy(char *field, size_t width, sqlite3_stmt *row, int column) {
    const auto length = std::min(width - 1, static_cast<size_t>(sqlite3_column_bytes(row, column)));
    std::memcpy(field, sqlite3_column_text(row, column), length);
}

}  // namespace

const std::string Raw::kColumns =
    "songs.id, songs.path, songs.title, songs.album, songs.artist, songs.genre, songs.track, "
    "songs.disc, songs.year, songs.duration, songs.bitrate, songs.frequency";

Raw::Raw(const std::string &path) {
    check(sqlite3_open_v2(path.c_str(), &database_, SQLITE_OPEN_READONLY | SQLITE_OPEN_NOMUTEX,
                          nullptr) == SQLITE_OK,
          database_);
    sqlite3_exec(database_, "PRAGMA cache_size=-16384; PRAGMA mmap_size=4294967296", nullptr,
                 nullptr, nullptr);
    mediadb::sqlite::addGramTokenizer(database_);
}

Raw::~Raw() {
    for (sqlite3_stmt *statement : statements_) {
        sqlite3_finalize(statement);
    }
    sqlite3_close(database_);
}

int Raw::prepare(const std::string &sql) {
    sqlite3_stmt *statement = nullptr;
    check(sqlite3_prepare_v2(database_, sql.c_str(), -1, &statement, nullptr) == SQLITE_OK,
          database_);
    statements_.push_back(statement);
    return static_cast<int>(statements_.size()) - 1;
}

ZANO_PLAYLIST_REC *Raw::record(sqlite3_stmt *row) {
    auto *node = static_cast<ZANO_PLAYLIST_REC *>(std::calloc(1, sizeof(ZANO_PLAYLIST_REC)));
    ZANO_MEDIA_INFO &info = node->info;
    info.id = sqlite3_column_int(row, 0);
    copy(info.path, sizeof info.path, row, 1);
    copy(info.title, sizeof info.title, row, 2);
    copy(info.album, sizeof info.album, row, 3);
    copy(info.artist, sizeof info.artist, row, 4);
    copy(info.genre, sizeof info.genre, row, 5);
    info.track = sqlite3_column_int(row, 6);
    info.disc = sqlite3_column_int(row, 7);
    info.year = sqlite3_column_int(row, 8);
    info.duration = static_cast<float>(sqlite3_column_double(row, 9));
    info.bitrate = sqlite3_column_int(row, 10);
    info.frequency = sqlite3_column_int(row, 11);
    return node;
}

int Raw::rows(int statement, const std::vector<std::string> &texts,
              const std::vector<long> &numbers) {
    sqlite3_stmt *row = statements_[static_cast<size_t>(statement)];
    int index = 0;
    for (const std::string &text : texts) {
        sqlite3_bind_text(row, ++index, text.c_str(), -1, SQLITE_STATIC);
    }
    for (const long number : numbers) {
        sqlite3_bind_int64(row, ++index, number);
    }
    ZANO_PLAYLIST_REC *list = nullptr;
    ZANO_PLAYLIST_REC **tail = &list;
    int count = 0;
    while (sqlite3_step(row) == SQLITE_ROW) {
        *tail = record(row);
        tail = &(*tail)->next;
        ++count;
    }
    sqlite3_reset(row);
    ZANOPlaylistRecFree(list);
    return count;
}

int Raw::rowsById(int statement, const std::vector<long> &ids) {
    sqlite3_stmt *row = statements_[static_cast<size_t>(statement)];
    ZANO_PLAYLIST_REC *list = nullptr;
    ZANO_PLAYLIST_REC **tail = &list;
    int count = 0;
    sqlite3_exec(database_, "BEGIN", nullptr, nullptr, nullptr);
    for (const long id : ids) {
        sqlite3_bind_int64(row, 1, id);
        if (sqlite3_step(row) == SQLITE_ROW) {
            *tail = record(row);
            tail = &(*tail)->next;
            ++count;
        }
        sqlite3_reset(row);
    }
    sqlite3_exec(database_, "COMMIT", nullptr, nullptr, nullptr);
    ZANOPlaylistRecFree(list);
    return count;
}

long Raw::number(int statement, const std::vector<std::string> &texts) {
    sqlite3_stmt *row = statements_[static_cast<size_t>(statement)];
    int index = 0;
    for (const std::string &text : texts) {
        sqlite3_bind_text(row, ++index, text.c_str(), -1, SQLITE_STATIC);
    }
    check(sqlite3_step(row) == SQLITE_ROW, database_);
    const long number = sqlite3_column_int64(row, 0);
    sqlite3_reset(row);
    return number;
}

std::string Raw::text(int statement) {
    sqlite3_stmt *row = statements_[static_cast<size_t>(statement)];
    check(sqlite3_step(row) == SQLITE_ROW, database_);
    std::string text(reinterpret_cast<const char *>(sqlite3_column_text(row, 0)));
    sqlite3_reset(row);
    return text;
}

int Raw::values(int statement) {
    sqlite3_stmt *row = statements_[static_cast<size_t>(statement)];
    ZANO_PLAYLIST_REC *list = nullptr;
    int count = 0;
    while (sqlite3_step(row) == SQLITE_ROW) {
        auto *node = static_cast<ZANO_PLAYLIST_REC *>(std::calloc(1, sizeof(ZANO_PLAYLIST_REC)));
        copy(node->info.title, sizeof node->info.title, row, 0);
        node->next = list;
        list = node;
        ++count;
    }
    sqlite3_reset(row);
    ZANOPlaylistRecFree(list);
    return count;
}

}  // namespace zano::bench
