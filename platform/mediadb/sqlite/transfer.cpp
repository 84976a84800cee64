/* Whole databases in SQLite. */
#include "../transfer.h"

#include <sys/stat.h>
#include <zanoplatform/error.h>

#include <cerrno>
#include <system_error>

#include "../transfer_rows.h"
#include "check.h"
#include "engine.h"
#include "schema.h"
#include "text/fold.h"

namespace zano::mediadb::sqlite {
namespace {

/* Links and other ways to a file lead to the same numbers. */
std::string identityOf(const std::string &path) {
    struct stat file {};
    if (stat(path.c_str(), &file) != 0) {
        throw DatabaseError(KLIB_ERR_DATABASE_OPEN,
                            path + ": " + std::generic_category().message(errno));
    }
    return "file " + std::to_string(file.st_dev) + " " + std::to_string(file.st_ino);
}

Contents contentsOf(Connection &connection) {
    return ofEachTable([&](const std::string &table) {
        return connection.integer("SELECT count(*) FROM " + table);
    });
}

class SqliteSnapshot : public SnapshotOf<SqliteSnapshot> {
  public:
    /* The moment is that of the first statement, so there has to be one. */
    explicit SqliteSnapshot(const std::string &path)
        : connection_(openWhole(path)), moment_(connection_, "BEGIN"), identity_(identityOf(path)) {
        connection_.integer("SELECT count(*) FROM state");
    }

    Contents contents() override { return contentsOf(connection_); }

    Contents lastIds() override {
        return ofEachTable([this](const char *table) {
            Statement row = connection_.prepare("SELECT seq FROM sqlite_sequence WHERE name=?1");
            row.bind(1, table);
            return row.step() ? row.integer(0) : 0;
        });
    }

    bool isIndexed() override {
        return connection_.integer("SELECT value FROM state WHERE name='ordered'") != 0;
    }

    void check() override { checkDatabase(connection_); }

    std::string identity() override { return identity_; }

    template <typename Read>
    void forEachRow(const std::function<void(const Read &)> &callback) {
        Read read;
        Statement rows = connection_.prepare(selectionOf(read));
        while (rows.step()) {
            readRow(rows, read);
            callback(read);
        }
    }

  private:
    Connection connection_;
    Transaction moment_;
    std::string identity_;
};

class SqliteReplacement : public Replacement {
  public:
    explicit SqliteReplacement(const std::string &path)
        : connection_(openForWriting(path)),
          transaction_(connection_, "BEGIN IMMEDIATE"),
          identity_(identityOf(path)),
          song_(connection_.prepare(
              "INSERT INTO songs(id, path, title, album, artist, album_artist, genre, title_key, "
              "album_key, artist_key, genre_key, year, track, disc, bitrate, frequency, duration, "
              "size, modified, changed) "
              "VALUES(?1,?2,?3,?4,?5,?6,?7,?8,?9,?10,?11,?12,?13,?14,?15,?16,?17,?18,?19,?20)")),
          playlist_(connection_.prepare("INSERT INTO playlists(id, path, title, album, title_key, "
                                        "album_key) VALUES(?1, ?2, ?3, ?4, ?5, ?6)")),
          notice_(connection_.prepare("INSERT INTO notices(id, path, former_path, operation) "
                                      "VALUES(?1, ?2, ?3, ?4)")) {}

    std::string identity() override { return identity_; }

    Contents contents() override { return contentsOf(connection_); }

    void clear() override {
        dropOrdersOf(connection_);
        connection_.run("DELETE FROM songs; DELETE FROM playlists; DELETE FROM notices");
    }

    void add(const SongRow &song) override {
        const std::string keys[] = {foldedKey(song.title), foldedKey(song.album),
                                    foldedKey(song.artist), foldedKey(song.genre)};
        int index = 1;
        song_.bind(index++, song.id);
        for (const std::string *text :
             {&song.path, &song.title, &song.album, &song.artist, &song.albumArtist, &song.genre}) {
            song_.bind(index++, std::string_view(*text));
        }
        for (const std::string &key : keys) {
            song_.bind(index++, std::string_view(key));
        }
        for (const int number : {song.year, song.track, song.disc, song.bitrate, song.frequency}) {
            song_.bind(index++, number);
        }
        song_.bind(index++, song.duration);
        song_.bind(index, song.stamp.size).bind(index + 1, song.stamp.modified);
        song_.bind(index + 2, song.stamp.changed).run();
        ++songs_;
    }

    void add(const PlaylistRow &playlist) override {
        const std::string titleKey = foldedKey(playlist.title);
        const std::string folderKey = foldedKey(playlist.folder);
        playlist_.bind(1, playlist.id).bind(2, std::string_view(playlist.path));
        playlist_.bind(3, std::string_view(playlist.title));
        playlist_.bind(4, std::string_view(playlist.folder));
        playlist_.bind(5, std::string_view(titleKey)).bind(6, std::string_view(folderKey)).run();
    }

    void add(const Notice &notice) override {
        notice_.bind(1, notice.id).bind(2, std::string_view(notice.path));
        notice_.bind(3, std::string_view(notice.formerPath)).bind(4, notice.operation).run();
    }

    /* The rest is made at the end of a first scan, which this is like. */
    void commit(const Contents &lastIds) override {
        raiseLastId("songs", lastIds.songs);
        raiseLastId("playlists", lastIds.playlists);
        raiseLastId("notices", lastIds.notices);
        connection_.run(
            "UPDATE state SET value=0 WHERE name IN ('ordered', 'counted', 'artists', 'albums', "
            "'genres'); UPDATE state SET value=value+1 WHERE name='generation'; "
            "UPDATE state SET value=" +
            std::to_string(songs_) + " WHERE name='songs'");
        transaction_.commit();
    }

  private:
    /* SQLite has a row for a table from its first row on. */
    void raiseLastId(const char *table, std::int64_t id) {
        connection_
            .prepare(
                "INSERT INTO sqlite_sequence SELECT ?1, 0 WHERE NOT EXISTS "
                "(SELECT 1 FROM sqlite_sequence WHERE name=?1)")
            .bind(1, table)
            .run();
        connection_.prepare("UPDATE sqlite_sequence SET seq=max(seq, ?2) WHERE name=?1")
            .bind(1, table)
            .bind(2, id)
            .run();
    }

    Connection connection_;
    Transaction transaction_;
    std::string identity_;
    Statement song_, playlist_, notice_;
    std::int64_t songs_ = 0;
};

}  // namespace

std::int64_t schemaVersion(const std::string &path) {
    return versionOf(path);
}

std::unique_ptr<Snapshot> openSnapshot(const std::string &path) {
    return std::make_unique<SqliteSnapshot>(path);
}

std::unique_ptr<Replacement> openReplacement(const std::string &path) {
    return std::make_unique<SqliteReplacement>(path);
}

}  // namespace zano::mediadb::sqlite
