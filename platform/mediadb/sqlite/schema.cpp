#include "schema.h"

#include <zanoplatform/error.h>
#include <algorithm>
#include <array>
#include <chrono>
#include <filesystem>
#include <thread>
#include <utility>

#include "../catalogue.h"
#include "grams.h"
#include "short_counts.h"
#include "text/fold.h"

namespace zano::mediadb::sqlite {
namespace {

constexpr int kBusyTimeoutMs = 10000;
/* Address space for reading without copies; a device of 32 bits has little of it. */
constexpr std::int64_t kMappedBytes = sizeof(void *) >= 8 ? std::int64_t{4} << 30 : 64 << 20;

/* One row for each version: what brings the version before it up to it. */
constexpr std::array<const char *, kSchemaVersion> kMigrations = {R"sql(
CREATE TABLE songs(
    id INTEGER PRIMARY KEY AUTOINCREMENT,
    path TEXT NOT NULL,
    title TEXT NOT NULL, album TEXT NOT NULL, artist TEXT NOT NULL, genre TEXT NOT NULL,
    track INTEGER NOT NULL, disc INTEGER NOT NULL, year INTEGER NOT NULL,
    duration REAL NOT NULL, bitrate INTEGER NOT NULL, frequency INTEGER NOT NULL,
    title_key TEXT NOT NULL, album_key TEXT NOT NULL,
    artist_key TEXT NOT NULL, genre_key TEXT NOT NULL,
    rank INTEGER, tail_rank INTEGER,
    album_artist TEXT NOT NULL,
    size INTEGER NOT NULL, modified INTEGER NOT NULL, changed INTEGER NOT NULL,
    tail_rank_down INTEGER GENERATED ALWAYS AS (-tail_rank) VIRTUAL);
CREATE UNIQUE INDEX songs_by_path ON songs(path);
CREATE TABLE playlists(
    id INTEGER PRIMARY KEY AUTOINCREMENT,
    path TEXT NOT NULL UNIQUE,
    title TEXT NOT NULL, album TEXT NOT NULL,
    title_key TEXT NOT NULL, album_key TEXT NOT NULL);
CREATE INDEX playlists_by_title ON playlists(title_key, album_key, path);
CREATE TABLE notices(
    id INTEGER PRIMARY KEY AUTOINCREMENT,
    path TEXT NOT NULL, former_path TEXT NOT NULL, operation INTEGER NOT NULL);
CREATE TABLE facets(
    facet INTEGER NOT NULL, key TEXT NOT NULL, name TEXT NOT NULL, songs INTEGER NOT NULL,
    PRIMARY KEY(facet, key, name)) WITHOUT ROWID;
CREATE TABLE anchors(
    stored_order INTEGER NOT NULL, place INTEGER NOT NULL, song INTEGER NOT NULL,
    PRIMARY KEY(stored_order, place)) WITHOUT ROWID;
CREATE TABLE gram_counts(gram TEXT PRIMARY KEY, songs INTEGER NOT NULL) WITHOUT ROWID;
CREATE TABLE state(name TEXT PRIMARY KEY, value INTEGER NOT NULL) WITHOUT ROWID;
INSERT INTO state VALUES('songs', 0), ('generation', 0), ('anchored', -1), ('ordered', 0), ('counted', 0),
    ('artists', 0), ('albums', 0), ('genres', 0);
CREATE VIRTUAL TABLE grams USING fts5(
    document, content='', detail=none, columnsize=0, tokenize='zanograms');
)sql",
                                                                  R"sql(
CREATE TABLE short_counts(gram TEXT PRIMARY KEY, songs INTEGER NOT NULL) WITHOUT ROWID;
)sql"};

/* What a SELECT of ours reads, FTS5's own tables included. */
constexpr std::array<std::string_view, 14> kReadableTables = {
    "songs",     "playlists",     "facets",        "anchors",     "gram_counts",
    "state",     "grams",         "grams_data",    "grams_idx",   "grams_config",
    "json_each", "sqlite_master", "grams_docsize", "short_counts"};
constexpr std::array<std::string_view, 16> kCallableFunctions = {
    "random", "instr", "zano_like", "zano_fold", "zano_lower", "length",    "count", "min",
    "max",    "-",     "match",     "fts5",      "json_each",  "json_type", "abs",   "total"};

int authorize(void *, int action, const char *first, const char *second, const char *,
              const char *) {
    const auto isIn = [](const auto &allowed, const char *name) {
        return name != nullptr &&
               std::find(allowed.begin(), allowed.end(), std::string_view(name)) != allowed.end();
    };
    switch (action) {
        case SQLITE_SELECT:
            return SQLITE_OK;
        case SQLITE_READ:
            return isIn(kReadableTables, first) ? SQLITE_OK : SQLITE_DENY;
        case SQLITE_FUNCTION:
            return isIn(kCallableFunctions, second) ? SQLITE_OK : SQLITE_DENY;
        case SQLITE_UPDATE:
            /* How SQLite declares a virtual table to itself; the connection cannot write. */
            return first != nullptr && std::string_view(first) == "sqlite_master" ? SQLITE_OK
                                                                                  : SQLITE_DENY;
        case SQLITE_PRAGMA:
            return first != nullptr && std::string_view(first) == "data_version" ? SQLITE_OK
                                                                                 : SQLITE_DENY;
        default:
            return SQLITE_DENY;
    }
}

std::string_view textOf(sqlite3_value *value) {
    const auto *text = reinterpret_cast<const char *>(sqlite3_value_text(value));
    return {text != nullptr ? text : "", static_cast<size_t>(sqlite3_value_bytes(value))};
}

/* No exception crosses SQLite's C code. */
template <std::string (*convert)(std::string_view)>
void textFunction(sqlite3_context *context, int, sqlite3_value **arguments) {
    try {
        const std::string result = convert(textOf(arguments[0]));
        sqlite3_result_text64(context, result.data(), result.size(), SQLITE_TRANSIENT, SQLITE_UTF8);
    } catch (const std::bad_alloc &) {
        sqlite3_result_error_nomem(context);
    }
}

/* SQLite's own LIKE can take hours for one text where a pattern has many %, and cannot be
 * interrupted meanwhile. The pattern is read once for a statement. */
void likeFunction(sqlite3_context *context, int, sqlite3_value **arguments) {
    try {
        auto *pattern = static_cast<Pattern *>(sqlite3_get_auxdata(context, 1));
        std::unique_ptr<Pattern> read;
        if (pattern == nullptr) {
            read = std::make_unique<Pattern>(textOf(arguments[1]), false);
            pattern = read.get();
        }
        sqlite3_result_int(context, pattern->matches(textOf(arguments[0])) ? 1 : 0);
        if (read) {
            sqlite3_set_auxdata(context, 1, read.release(),
                                [](void *held) { delete static_cast<Pattern *>(held); });
        }
    } catch (const std::bad_alloc &) {
        sqlite3_result_error_nomem(context);
    }
}

void prepareForUse(Connection &connection) {
    sqlite3 *database = connection.get();
    sqlite3_busy_timeout(database, kBusyTimeoutMs);
    constexpr int kFlags = SQLITE_UTF8 | SQLITE_DETERMINISTIC | SQLITE_INNOCUOUS;
    sqlite3_create_function_v2(database, "zano_fold", 1, kFlags, nullptr, textFunction<foldedKey>,
                               nullptr, nullptr, nullptr);
    sqlite3_create_function_v2(database, "zano_lower", 1, kFlags, nullptr, textFunction<lowerCase>,
                               nullptr, nullptr, nullptr);
    sqlite3_create_function_v2(database, "zano_like", 2, kFlags, nullptr, likeFunction, nullptr,
                               nullptr, nullptr);
    addGramTokenizer(database);
}

void checkVersion(Connection &connection, const std::string &path) {
    const std::int64_t application = connection.integer("PRAGMA application_id");
    const std::int64_t version = connection.integer("PRAGMA user_version");
    if (application != kApplicationId || version < 1) {
        throw DatabaseError(KLIB_ERR_DATABASE_OPEN, path + " is not a media database");
    }
    if (version > kSchemaVersion) {
        throw DatabaseError(KLIB_ERR_DATABASE_VERSION,
                            path + " was made by a newer version of this program (schema " +
                                std::to_string(version) + ", this one knows " +
                                std::to_string(kSchemaVersion) + ")");
    }
}

bool isEmptyFile(Connection &connection) {
    return connection.integer("SELECT count(*) FROM sqlite_master") == 0 &&
           connection.integer("PRAGMA application_id") == 0 &&
           connection.integer("PRAGMA user_version") == 0;
}

/* SQLite reads a file first when it is asked something, and does not name it then. */
template <typename Action>
void namingFile(const std::string &path, Action action) {
    try {
        action();
    } catch (const DatabaseError &error) {
        const std::string words = error.what();
        const bool isNamed = words.find(path) != std::string::npos;
        throw DatabaseError(error.code(), isNamed ? words : path + ": " + words);
    }
}

void migrate(Connection &connection, const std::string &path) {
    if (connection.integer("PRAGMA user_version") == kSchemaVersion &&
        connection.integer("PRAGMA application_id") == kApplicationId) {
        return;
    }
    /* Looked at again within the lock: another program may have made it meanwhile. */
    connection.run("BEGIN IMMEDIATE");
    try {
        if (!isEmptyFile(connection)) {
            checkVersion(connection, path);
        }
        const auto before = connection.integer("PRAGMA user_version");
        for (auto version = before; version < kSchemaVersion; ++version) {
            connection.run(kMigrations[static_cast<size_t>(version)]);
        }
        if (before == 1 &&
            connection.integer("SELECT value FROM state WHERE name='ordered'") != 0) {
            countShort(connection).write(connection);
        }
        connection.run("PRAGMA application_id=" + std::to_string(kApplicationId));
        connection.run("PRAGMA user_version=" + std::to_string(kSchemaVersion));
        connection.run("COMMIT");
    } catch (...) {
        sqlite3_exec(connection.get(), "ROLLBACK", nullptr, nullptr, nullptr);
        throw;
    }
}

void makeFolderOf(const std::string &path) {
    std::error_code error;
    const auto folder = std::filesystem::path(path).parent_path();
    if (!folder.empty() && !std::filesystem::create_directories(folder, error) && error) {
        throw DatabaseError(KLIB_ERR_DATABASE_OPEN,
                            "could not make the folder of the media database, " + folder.string() +
                                ": " + error.message());
    }
}

/* SQLite gives up at once, without its usual waiting, when two programs change the mode of one
 * new file. */
void useWriteAheadLog(Connection &connection) {
    const auto deadline =
        std::chrono::steady_clock::now() + std::chrono::milliseconds(kBusyTimeoutMs);
    for (;;) {
        try {
            connection.run("PRAGMA journal_mode=WAL");
            return;
        } catch (const DatabaseError &error) {
            if (error.code() != KLIB_ERR_DATABASE_BUSY ||
                std::chrono::steady_clock::now() > deadline) {
                throw;
            }
        }
        std::this_thread::sleep_for(std::chrono::milliseconds(5));
    }
}

Connection prepareForWriting(Connection connection, const std::string &path) {
    prepareForUse(connection);
    namingFile(path, [&] {
        if (!isEmptyFile(connection)) {
            checkVersion(connection, path);
        }
        useWriteAheadLog(connection);
    });
    connection.run("PRAGMA synchronous=NORMAL");
    connection.run("PRAGMA cache_size=-65536");
    connection.run("PRAGMA temp_store=FILE");
    /* The last writer leaves an empty journal: readers of another user cannot clear it, and each
     * new one would have to read it through. */
    connection.run("PRAGMA journal_size_limit=4194304");
    /* The journal stays when the last writer leaves, so that a reader that may not write in the
     * folder (a web front of another user) can still open the database. */
    int keep = 1;
    sqlite3_file_control(connection.get(), "main", SQLITE_FCNTL_PERSIST_WAL, &keep);
    migrate(connection, path);
    return connection;
}

/* What the file says is as it may be, but the schema may be an older one. */
Connection readOnly(const std::string &path) {
    Connection connection(path, Connection::Mode::ReadOnly);
    prepareForUse(connection);
    try {
        namingFile(path, [&] { checkVersion(connection, path); });
    } catch (const DatabaseError &error) {
        if ((sqlite3_errcode(connection.get()) & 0xFF) != SQLITE_READONLY) {
            throw;
        }
        throw DatabaseError(error.code(), path +
                                              " can be read only with its files -wal and -shm "
                                              "beside it, which the next run of a user who may "
                                              "write in its folder makes");
    }
    return connection;
}

void requireVersion(Connection &connection, const std::string &path) {
    if (connection.integer("PRAGMA user_version") != kSchemaVersion) {
        throw DatabaseError(KLIB_ERR_DATABASE_VERSION,
                            path + " has an older schema; zanoindex brings it up to date");
    }
}

}  // namespace

Connection openForWriting(const std::string &path) {
    makeFolderOf(path);
    return prepareForWriting(Connection(path, Connection::Mode::Create), path);
}

Connection openExistingForWriting(const std::string &path) {
    return prepareForWriting(Connection(path, Connection::Mode::ReadWrite), path);
}

std::int64_t versionOf(const std::string &path) {
    return readOnly(path).integer("PRAGMA user_version");
}

Connection openWhole(const std::string &path) {
    Connection connection = readOnly(path);
    requireVersion(connection, path);
    connection.run("PRAGMA cache_size=-16384");
    connection.run("PRAGMA temp_store=FILE");
    return connection;
}

Connection openForReading(const std::string &path) {
    Connection connection = readOnly(path);
    requireVersion(connection, path);
    connection.run("PRAGMA query_only=ON");
    connection.run("PRAGMA cache_size=-16384");
    connection.run("PRAGMA mmap_size=" + std::to_string(kMappedBytes));
    sqlite3_db_config(connection.get(), SQLITE_DBCONFIG_DEFENSIVE, 1, nullptr);
    sqlite3_db_config(connection.get(), SQLITE_DBCONFIG_ENABLE_LOAD_EXTENSION, 0, nullptr);
    sqlite3_limit(connection.get(), SQLITE_LIMIT_ATTACHED, 0);
    sqlite3_set_authorizer(connection.get(), authorize, nullptr);
    return connection;
}

const std::vector<StoredOrder> &storedOrders() {
    static const std::vector<StoredOrder> rows = {
        {{Column::Title, false}, 1, "songs_by_rank", "", "rank", false},
        {{Column::Title, true}, 2, "songs_by_title_down", "title_key", "tail_rank_down", true},
        {{Column::Album, false}, 3, "songs_by_tail_rank", "", "tail_rank", false},
        {{Column::Album, true}, 4, "songs_by_album_down", "album_key", "tail_rank_down", true},
        {{Column::Artist, false}, 5, "songs_by_artist", "artist_key", "tail_rank", false},
        {{Column::Artist, true}, 6, "songs_by_artist_down", "artist_key", "tail_rank_down", true},
        {{Column::Genre, false}, 7, "songs_by_genre", "genre_key", "tail_rank", false},
        {{Column::Genre, true}, 8, "songs_by_genre_down", "genre_key", "tail_rank_down", true},
        {{Column::Year, false}, 9, "songs_by_year", "year", "tail_rank", false},
        {{Column::Year, true}, 10, "songs_by_year_down", "year", "tail_rank_down", true},
        {{Column::Duration, false}, 11, "songs_by_duration", "duration", "tail_rank", false},
        {{Column::Duration, true},
         12,
         "songs_by_duration_down",
         "duration",
         "tail_rank_down",
         true},
        {{Column::Path, false}, 13, "songs_by_path", "", "path", false},
        {{Column::Path, true}, 14, "songs_by_path", "", "path", true},
        {{Column::Id, false}, 15, "", "", "id", false},
        {{Column::Id, true}, 16, "", "", "id", true},
    };
    return rows;
}

const StoredOrder *findStoredOrder(const OrderTerm &leading) {
    const auto &rows = storedOrders();
    const auto row = std::find_if(rows.begin(), rows.end(), [&leading](const StoredOrder &order) {
        return order.leading == leading;
    });
    return row == rows.end() ? nullptr : &*row;
}

std::string orderText(const StoredOrder &order, std::string_view qualifier) {
    const std::string_view direction = order.descending ? " DESC" : "";
    std::string text;
    if (!order.key.empty()) {
        text.append(qualifier).append(order.key).append(direction).append(", ");
    }
    return text.append(qualifier).append(order.tail).append(direction);
}

std::string orderedIds(const StoredOrder &order) {
    std::string sql = "SELECT id FROM songs";
    if (!order.index.empty()) {
        sql.append(" INDEXED BY ").append(order.index);
    }
    return sql.append(" ORDER BY ").append(orderText(order, ""));
}

void dropOrdersOf(Connection &connection) {
    for (const StoredOrder &order : storedOrders()) {
        if (order.leading.column != Column::Path && !order.index.empty()) {
            connection.run("DROP INDEX IF EXISTS " + std::string(order.index));
        }
    }
    connection.run("INSERT INTO grams(grams) VALUES('delete-all')");
    connection.run("DELETE FROM short_counts; DELETE FROM facets; DELETE FROM anchors");
}

std::vector<std::string> createIndexes() {
    std::vector<std::string> statements;
    for (const StoredOrder &order : storedOrders()) {
        if (order.leading.column == Column::Path || order.index.empty()) {
            continue;
        }
        std::string sql = "CREATE INDEX " + std::string(order.index) + " ON songs(";
        if (!order.key.empty()) {
            sql.append(order.key).append(", ");
        }
        statements.push_back(sql.append(order.tail).append(")"));
    }
    return statements;
}

}  // namespace zano::mediadb::sqlite
