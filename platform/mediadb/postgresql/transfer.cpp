/* Whole databases in PostgreSQL. */
#include "../transfer.h"

#include <zanoplatform/error.h>

#include <algorithm>

#include "../query/statements.h"
#include "../transfer_rows.h"
#include "check.h"
#include "engine.h"
#include "schema.h"
#include "text/fold.h"

namespace zano::mediadb::postgresql {
namespace {

/* Rows go to the server in pieces of this size. */
constexpr size_t kPieceBytes = 65536;

std::string textOf(Connection &connection, const char *sql) {
    const Result result = connection.run(std::string(sql));
    return result.size() > 0 ? std::string(result[0].text(0)) : "";
}

/* A standby that was promoted has the number of its former primary. An engine that only speaks
 * PostgreSQL's protocol has none. */
std::string serverOf(Connection &connection) {
    try {
        return textOf(
            connection,
            "SELECT concat(system_identifier, ' ', extract(epoch FROM pg_postmaster_start_time())) "
            "FROM pg_control_system()");
    } catch (const ServerError &) {
        return textOf(connection,
                      "SELECT concat(host(inet_server_addr()), ' ', inet_server_port())");
    }
}

std::string identityOf(Connection &connection) {
    return "server " + serverOf(connection) + " " + textOf(connection, "SELECT current_database()");
}

Contents contentsOf(Connection &connection) {
    return ofEachTable([&](const char *table) {
        return connection.integer(newSql("SELECT count(*) FROM ").add(table));
    });
}

std::string sequenceOf(Connection &connection, const std::string &table) {
    const std::string sql = "SELECT pg_get_serial_sequence('zano." + table + "', 'id')";
    return textOf(connection, sql.c_str());
}

std::int64_t lastIdOf(Connection &connection, const std::string &table) {
    return connection.integer(
        newSql("SELECT CASE WHEN is_called THEN last_value ELSE last_value-1 END FROM ")
            .add(sequenceOf(connection, table)));
}

/* An existing media database, for reading as long as it takes. */
Connection openWhole(const std::string &uri) {
    Connection connection(uri, Connection::Access::Read);
    connection.run(std::string("SET statement_timeout=0"));
    if (versionOf(connection) == 0) {
        throw DatabaseError(KLIB_ERR_DATABASE_OPEN,
                            "the PostgreSQL database holds no media database");
    }
    return connection;
}

class PostgresqlSnapshot : public SnapshotOf<PostgresqlSnapshot> {
  public:
    explicit PostgresqlSnapshot(const std::string &uri)
        : connection_(openWhole(uri)), identity_(identityOf(connection_)) {
        connection_.run(
            std::string("BEGIN TRANSACTION ISOLATION LEVEL REPEATABLE READ, READ ONLY"));
        requireVersion(versionOf(connection_));
    }

    Contents contents() override { return contentsOf(connection_); }

    Contents lastIds() override {
        return ofEachTable([this](const char *table) { return lastIdOf(connection_, table); });
    }

    bool isIndexed() override {
        return connection_.integer(newSql("SELECT value FROM state WHERE name='indexed'")) != 0;
    }

    void check() override { checkDatabase(connection_); }

    std::string identity() override { return identity_; }

    template <typename Read>
    void forEachRow(const std::function<void(const Read &)> &callback) {
        Read read;
        connection_.run(std::string("DECLARE whole NO SCROLL CURSOR FOR ") + selectionOf(read));
        const auto next = [this] { return connection_.runOnce("FETCH 2000 FROM whole"); };
        for (Result rows = next(); rows.size() > 0; rows = next()) {
            for (int i = 0; i < rows.size(); ++i) {
                readRow(rows[i], read);
                callback(read);
            }
        }
        connection_.run(std::string("CLOSE whole"));
    }

  private:
    Connection connection_;
    std::string identity_;
};

class PostgresqlReplacement : public Replacement {
  public:
    explicit PostgresqlReplacement(const std::string &uri)
        : connection_(openForWriting(uri)), identity_(identityOf(connection_)) {
        connection_.run(std::string(kPatience));
        connection_.run(std::string("BEGIN TRANSACTION ISOLATION LEVEL READ COMMITTED"));
        connection_.run(std::string(kLockWriting));
        lockPlaylists();
    }

    std::string identity() override { return identity_; }

    Contents contents() override { return contentsOf(connection_); }

    /* Not TRUNCATE, for which readers would have to wait. */
    void clear() override {
        for (const std::string table :
             {"anchors", "grams", "facets", "songs", "playlists", "notices"}) {
            connection_.run("DELETE FROM " + table);
        }
    }

    void add(const SongRow &song) override {
        CopyText &row = rowFor(
            "COPY songs(id, path, title, album, artist, album_artist, genre, path_key, title_key, "
            "album_key, artist_key, album_artist_key, genre_key, year, track, disc, bitrate, "
            "frequency, duration, size, modified, changed) FROM STDIN");
        row.add(song.id);
        row.addPath(song.path);
        const std::string_view texts[] = {song.title, song.album, song.artist, song.albumArtist,
                                          song.genre};
        for (const std::string_view text : texts) {
            row.add(text);
        }
        row.add(std::string_view(foldedKey(song.path)));
        for (const std::string_view text : texts) {
            row.add(std::string_view(foldedKey(text)));
        }
        for (const int number : {song.year, song.track, song.disc, song.bitrate, song.frequency}) {
            row.add(std::int64_t{number});
        }
        row.add(song.duration);
        for (const std::int64_t number :
             {song.stamp.size, song.stamp.modified, song.stamp.changed}) {
            row.add(number);
        }
        endRow();
        ++songs_;
    }

    void add(const PlaylistRow &playlist) override {
        CopyText &row = rowFor(
            "COPY playlists(id, path, title, album, path_key, title_key, album_key) FROM STDIN");
        row.add(playlist.id);
        row.addPath(playlist.path);
        row.add(std::string_view(playlist.title));
        row.add(std::string_view(playlist.folder));
        for (const std::string *text : {&playlist.path, &playlist.title, &playlist.folder}) {
            row.add(std::string_view(foldedKey(*text)));
        }
        endRow();
    }

    void add(const Notice &notice) override {
        CopyText &row = rowFor("COPY notices(id, path, former_path, operation) FROM STDIN");
        row.add(notice.id);
        row.addPath(notice.path);
        row.addPath(notice.formerPath);
        row.add(std::int64_t{notice.operation});
        endRow();
    }

    void commit(const Contents &lastIds) override {
        endTable();
        fillFacets();
        setState("songs", std::to_string(songs_));
        setState("counted", "0");  // so that finish() has the planner's numbers made
        setState("generation", "value+1");
        raiseLastId("songs", lastIds.songs);
        raiseLastId("playlists", lastIds.playlists);
        raiseLastId("notices", lastIds.notices);
        connection_.run(std::string("COMMIT"));
    }

  private:
    /* Programs that edit playlists do not take the lock on writing. An engine that only speaks
     * PostgreSQL's protocol may know no such lock: what they save meanwhile may stay, then. */
    void lockPlaylists() {
        connection_.run(std::string("SAVEPOINT attempt"));
        try {
            connection_.run(
                std::string("LOCK TABLE playlists, notices IN SHARE ROW EXCLUSIVE MODE"));
        } catch (const ServerError &error) {
            if (error.state() != "42601" && error.state() != "0A000") {
                throw;
            }
            connection_.run(std::string("ROLLBACK TO attempt"));
        }
    }

    /* The rows of a table are one COPY. */
    CopyText &rowFor(const char *copy) {
        if (table_ != copy) {
            endTable();
            connection_.beginCopy(copy);
            table_ = copy;
        }
        return rows_;
    }

    void endRow() {
        rows_.endRow();
        if (rows_.text().size() >= kPieceBytes) {
            send();
        }
    }

    void send() {
        connection_.sendRows(rows_.text());
        rows_.text().clear();
    }

    void endTable() {
        if (!table_.empty()) {
            send();
            connection_.endCopy();
            table_.clear();
        }
    }

    void setState(const std::string &name, const std::string &value) {
        connection_.run("UPDATE state SET value=" + value + " WHERE name='" + name + "'");
    }

    void fillFacets() {
        for (const Facet &facet : facets()) {
            const ColumnInfo &info = columnInfo(facet.column);
            const std::string number = std::to_string(facet.number);
            std::string fill = "INSERT INTO facets SELECT " + number + ", ";
            fill.append(info.key).append(", ").append(info.name);
            connection_.run(fill + ", count(*) FROM songs GROUP BY 2, 3");
            setState(std::string(facet.state),
                     "(SELECT count(*) FROM facets WHERE facet=" + number + ")");
        }
    }

    /* Not setval(), which stays when the transaction is undone. */
    void raiseLastId(const std::string &table, std::int64_t id) {
        const std::int64_t last = std::max(id, lastIdOf(connection_, table));
        connection_.run("ALTER SEQUENCE " + sequenceOf(connection_, table) + " RESTART WITH " +
                        std::to_string(last + 1));
    }

    Connection connection_;
    std::string identity_;
    CopyText rows_;
    std::string table_;  // the statement of the COPY under way; "" when there is none
    std::int64_t songs_ = 0;
};

}  // namespace

std::int64_t schemaVersion(const std::string &place) {
    Connection connection = openWhole("postgresql:" + place);
    const std::int64_t version = versionOf(connection);
    if (version < 1 || version > kSchemaVersion) {
        requireVersion(version);
    }
    return version;
}

std::unique_ptr<Snapshot> openSnapshot(const std::string &place) {
    return std::make_unique<PostgresqlSnapshot>("postgresql:" + place);
}

std::unique_ptr<Replacement> openReplacement(const std::string &place) {
    return std::make_unique<PostgresqlReplacement>("postgresql:" + place);
}

}  // namespace zano::mediadb::postgresql
