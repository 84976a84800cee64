/* Whole databases: copied between engines, checked, brought up to date. */
#include "mediadb/transfer.h"

#include <sys/wait.h>
#include <unistd.h>
#include <zanoplatform/media_database_upkeep.h>

#include <csignal>
#include <functional>

#include "engines.h"
#include "mediadb/engine.h"
#include "mediadb/sqlite/handle.h"
#include "support/files.h"

namespace zano::mediadb {
namespace {

class TransferTest : public EngineTest {
  protected:
    /* A second database of the same engine. */
    std::string newPlace(const std::string &name = "other.db") const {
        return isSqlite() ? "sqlite:" + file(name) : Cluster::get().newDatabase();
    }
    std::string file(const std::string &name) const {
        return std::filesystem::path(databasePath()).replace_filename(name);
    }

    static void runSql(const std::string &location, const std::string &sql) {
        if (isSqlite()) {
            sqlite::Connection(location.substr(7), sqlite::Connection::Mode::ReadWrite).run(sql);
        } else {
            Cluster::run(location, "SET search_path=zano; " + sql);
        }
    }

    static std::vector<Song> songs(int count, const std::string &title) {
        std::vector<Song> made;
        for (int i = 0; i < count; ++i) {
            made.push_back(song("/music/" + title + std::to_string(i), title + std::to_string(i)));
            made.back().artist = "Artist " + std::to_string(i % 7);
        }
        return made;
    }
};

/* All columns of the tables that are the truth, and the ids that come next. */
std::string dump(const std::string &location) {
    sqlite::Connection file(location.substr(7), sqlite::Connection::Mode::ReadOnly);
    std::string text;
    for (const std::string table : {"songs", "playlists", "notices", "sqlite_sequence"}) {
        auto columns = file.prepare(
            "SELECT group_concat('quote(' || name || ')', ' || '','' || ') FROM "
            "pragma_table_info(?1) WHERE name NOT LIKE '%rank%'");
        columns.bind(1, table).step();
        auto rows = file.prepare("SELECT " + std::string(columns.text(0)) + " FROM " + table +
                                 " ORDER BY 1");
        while (rows.step()) {
            text.append(table).append(": ").append(rows.text(0)).append("\n");
        }
    }
    return text;
}

/* Ids with gaps, in front and at the end; texts and paths that some form of them could spoil. */
void fillWithOddities(const std::string &location) {
    const char *texts[] = {"plain",
                           "it's \"quoted\", {braced}",
                           "tab\t, line\nand return\r",
                           "\\N",
                           "back\\slash\\",
                           "\\.",
                           "",
                           "\xF0\x9F\x8E\xB5 \xC3\x89t\xC3\xA9",
                           "gone",
                           "last"};
    auto catalogue = openCatalogue(location);
    catalogue->begin();
    for (const char *text : texts) {
        Song made;
        made.path = std::string("/music/\xFF\xFE") + text;
        made.title = made.album = made.artist = made.albumArtist = made.genre = text;
        made.year = 1999;
        made.track = 3;
        made.disc = 2;
        made.duration = 0.1;
        made.bitrate = 320001;
        made.frequency = 44100;
        made.stamp = {std::int64_t{5} << 32, 1234567890123456789, -1};
        catalogue->putSong(made);
    }
    for (const char *text : {"one", "two's", "three"}) {
        catalogue->addPlaylist({std::string("/music/\xFF") + text + ".m3u", text, "folder"});
    }
    for (const std::string text : {"plain", "gone", "last"}) {
        catalogue->removeSong("/music/\xFF\xFE" + text);
    }
    catalogue->removePlaylist("/music/\xFFone.m3u");
    catalogue->commit();
    catalogue->finish({});
    const auto engine = makeEngine(location);
    engine->addNotice({0, "/a\t\xFF", "", 1});
    engine->addNotice({0, "/b", "/former\\", 4});
}

/* From each engine to each. */
TEST(PostgresqlTransferTest, RowsAndIdsSurviveEveryWay) {
    const files::Folder folder;
    const std::string places[] = {"sqlite:" + folder.path("a.db"), Cluster::get().newDatabase(),
                                  Cluster::get().newDatabase(), "sqlite:" + folder.path("b.db"),
                                  "sqlite:" + folder.path("c.db")};
    fillWithOddities(places[0]);
    for (size_t i = 1; i < std::size(places); ++i) {
        const Contents copied = copyDatabase(places[i - 1], places[i], false, {});
        EXPECT_EQ(copied.songs, 7);
        EXPECT_EQ(copied.playlists, 2);
        EXPECT_EQ(copied.notices, 2);
        EXPECT_NO_THROW(openSnapshot(places[i])->check()) << places[i];
        EXPECT_TRUE(openSnapshot(places[i])->isIndexed()) << places[i];
        EXPECT_EQ(openSnapshot(places[i])->lastIds().songs, 10) << "ids would be given again";
    }
    EXPECT_EQ(dump(places[4]), dump(places[0]));
    auto catalogue = openCatalogue(places[2]);
    catalogue->begin();
    catalogue->putSong({});
    catalogue->commit();
    openSnapshot(places[2])->forEachSong([](const SongRow &row) {
        EXPECT_EQ(row.path.empty(), row.id == 11) << row.path << row.id;
    });
}

TEST_P(TransferTest, ASnapshotIsOfOneMoment) {
    auto catalogue = openCatalogue(location());
    put(*catalogue, songs(300, "before"));
    const auto snapshot = openSnapshot(location());
    put(*catalogue, songs(500, "after"));
    int seen = 0;
    snapshot->forEachSong([&](const SongRow &row) {
        ++seen;
        EXPECT_EQ(row.title.substr(0, 6), "before");
    });
    EXPECT_EQ(seen, 300);
    EXPECT_EQ(snapshot->contents().songs, 300);
    EXPECT_NO_THROW(snapshot->check());
    EXPECT_EQ(openSnapshot(location())->contents().songs, 800);
}

/* The ids that the former content had are not given again either. */
TEST_P(TransferTest, AContentThatIsThereIsReplacedOnlyWhenAskedFor) {
    const std::string other = newPlace();
    put(*openCatalogue(location()), songs(20, "new"));
    put(*openCatalogue(other), songs(500, "former"));
    EXPECT_EQ(MediaInfoDBCopy(nullptr, other.c_str(), 0, nullptr, nullptr, nullptr), -1);
    EXPECT_EQ(KLIBCErrGet(), KLIB_ERR_DATABASE_FILLED);
    EXPECT_NE(std::string(KLIBCErrTextGet()).find("500 songs and 0 playlists"), std::string::npos);
    EXPECT_EQ(openSnapshot(other)->contents().songs, 500);
    MEDIA_DB_CONTENTS copied{};
    ASSERT_EQ(MediaInfoDBCopy(nullptr, other.c_str(), 1, &copied, nullptr, nullptr), 0)
        << KLIBCErrTextGet();
    EXPECT_EQ(copied.songs, 20);
    EXPECT_EQ(openSnapshot(other)->lastIds().songs, 500);
    EXPECT_NO_THROW(openSnapshot(other)->check());
    setSetting(other);
    EXPECT_EQ(rows(nullptr, "path").size(), 20U);
    EXPECT_EQ(found("former").size(), 0U);
    EXPECT_EQ(MediaInfoDBGetCount(0, "DISTINCT artist", nullptr, 0, 0), 7);
}

/* A kill, and a disk that fills or a server that goes away. */
TEST_P(TransferTest, AFailureInTheMiddleLeavesWhatWasThere) {
    const std::string other = newPlace();
    put(*openCatalogue(location()), songs(3000, "new"));
    put(*openCatalogue(other), songs(50, "former"));
    const auto copyWith = [&](const std::function<void()> &disaster) {
        int progress = 0;
        EXPECT_THROW(copyDatabase(location(), other, true,
                                  {[&](std::int64_t done, std::int64_t) {
                                       progress += done == 1000 ? 1 : 0;
                                       if (done == 1000) {
                                           disaster();
                                       }
                                   },
                                   {}}),
                     DatabaseError);
        EXPECT_EQ(progress, 1);
    };
    const pid_t child = fork();
    if (child == 0) {
        copyWith([] { raise(SIGKILL); });
        _exit(0);
    }
    int status = 0;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    EXPECT_TRUE(WIFSIGNALED(status));
    if (isSqlite()) {
        const files::FullDisk full(200000);
        copyWith([] {});
    } else {
        copyWith([] { Cluster::get().endConnections(); });
    }
    EXPECT_EQ(openSnapshot(other)->contents().songs, 50);
    EXPECT_NO_THROW(openSnapshot(other)->check());
    EXPECT_NO_THROW(copyDatabase(location(), other, true, {}));
    EXPECT_EQ(openSnapshot(other)->contents().songs, 3000);
}

TEST_P(TransferTest, WhatCannotBeCopiedIsRefused) {
    put(*openCatalogue(location()), songs(3, "a"));
    std::string alias = location() + "&application_name=other";
    if (isSqlite()) {
        std::filesystem::create_symlink(databasePath(), file("link.db"));
        alias = "sqlite:" + file("link.db");
    }
    files::write(file("text.db"), "no database, but long enough to be taken for one at first");
    files::write(file("empty.db"), "");
    const std::string fresh = newPlace("fresh.db");
    const std::string missing =
        isSqlite() ? "sqlite:" + file("missing.db") : "postgresql://zano:secret@/x?host=/missing";
    const std::pair<std::string, std::string> cases[] = {
        {location(), location()},
        {location(), alias},
        {missing, fresh},
        {"sqlite:" + file("text.db"), fresh},
        {"sqlite:" + file("empty.db"), fresh},
        {isSqlite() ? "/no/scheme" : Cluster::get().newDatabase(), fresh},
        {location(), "sqlite:" + file("text.db")},
        {location(), "postgresql://zano:secret@/x?host=/missing"},
    };
    for (const auto &[from, to] : cases) {
        EXPECT_EQ(MediaInfoDBCopy(from.c_str(), to.c_str(), 1, nullptr, nullptr, nullptr), -1)
            << from << " to " << to;
        EXPECT_EQ(std::string(KLIBCErrTextGet()).find("secret"), std::string::npos);
        EXPECT_THROW(openSnapshot(fresh), DatabaseError) << "made for nothing: " << from;
    }
    EXPECT_EQ(openSnapshot(location())->contents().songs, 3);
    EXPECT_EQ(files::read(file("empty.db")), "");
}

TEST_P(TransferTest, EveryDamageIsFound) {
    std::vector<std::string> damages = {
        "UPDATE songs SET title_key='other' WHERE id=200",
        "UPDATE playlists SET album_key='other'",
        "UPDATE facets SET songs=songs+1 WHERE key='artist 3'",
        "DELETE FROM facets WHERE key='artist 3'",
        "UPDATE state SET value=value+1 WHERE name='songs'",
        "UPDATE state SET value=value+1 WHERE name='artists'",
        "UPDATE anchors SET song=song+1 WHERE place=1 AND stored_order=5",
        "DELETE FROM anchors WHERE place=2 AND stored_order=2",
    };
    if (isSqlite()) {
        damages.insert(damages.end(),
                       {"UPDATE songs SET rank=rank+100000 WHERE id=200",
                        "UPDATE songs SET tail_rank=NULL WHERE id=200",
                        "UPDATE short_counts SET songs=songs+1 WHERE gram=char(1)||'t'",
                        "INSERT INTO short_counts VALUES(char(1)||'?', 1)",
                        "DELETE FROM grams_data WHERE id=(SELECT max(id) FROM grams_data)",
                        "UPDATE songs SET title='Other', title_key='other' WHERE id=200"});
    }
    put(*openCatalogue(location()), songs(300, "t"));
    makeEngine(location())->savePlaylist({});
    EXPECT_EQ(MediaInfoDBCheck(nullptr, nullptr), 0) << KLIBCErrTextGet();
    for (const std::string &damage : damages) {
        const std::string other = newPlace();
        copyDatabase(location(), other, true, {});
        runSql(other, damage);
        EXPECT_EQ(MediaInfoDBCheck(other.c_str(), nullptr), -1) << damage;
        EXPECT_NE(std::string(KLIBCErrTextGet()).find("is damaged"), std::string::npos)
            << damage << ": " << KLIBCErrTextGet();
        EXPECT_THROW(openCatalogue(other)->check(), DatabaseError) << damage;
    }
}

TEST_P(TransferTest, MigrationFinishesAFirstScanAndMakesNothing) {
    const std::string fresh = newPlace("fresh.db");
    EXPECT_EQ(MediaInfoDBMigrate(fresh.c_str(), nullptr, nullptr, nullptr), -1);
    EXPECT_THROW(openSnapshot(fresh), DatabaseError);
    EXPECT_FALSE(std::filesystem::exists(file("fresh.db")));
    {
        auto catalogue = openCatalogue(location());
        catalogue->begin();
        catalogue->putSong(song("/music/a", "a"));
        catalogue->commit();
    }
    MEDIA_DB_CHECKED checked{};
    MEDIA_DB_MIGRATED migrated{};
    int steps = 0;
    const auto count = [](void *context, int phase, long long, long long) {
        *static_cast<int *>(context) += phase == MEDIA_DB_INDEXING ? 1 : 0;
    };
    for (const int isBehind : {1, 0}) {
        ASSERT_EQ(MediaInfoDBCheck(nullptr, &checked), 0) << KLIBCErrTextGet();
        EXPECT_EQ(checked.isIndexed, 1 - isBehind);
        ASSERT_EQ(MediaInfoDBMigrate(nullptr, &migrated, count, &steps), 0) << KLIBCErrTextGet();
        EXPECT_EQ(migrated.isIndexed, isBehind);
        EXPECT_EQ(migrated.before, migrated.after);
    }
    EXPECT_GT(steps, 1);
    runSql(location(),
           isSqlite() ? "PRAGMA user_version=99" : "UPDATE state SET value=99 WHERE name='schema'");
    EXPECT_EQ(MediaInfoDBMigrate(nullptr, nullptr, nullptr, nullptr), -1);
    EXPECT_EQ(KLIBCErrGet(), KLIB_ERR_DATABASE_VERSION) << KLIBCErrTextGet();
}

TEST_P(TransferTest, AnOlderSchemaIsBroughtUpToDate) {
    fillWithOddities(location());
    runSql(location(), isSqlite()
                           ? "DROP TABLE short_counts; PRAGMA user_version=1"
                           : "DROP TABLE grams; UPDATE state SET value=1 WHERE name='schema'");
    EXPECT_EQ(MediaInfoDBCheck(nullptr, nullptr), -1);
    EXPECT_EQ(KLIBCErrGet(), KLIB_ERR_DATABASE_VERSION) << KLIBCErrTextGet();
    MEDIA_DB_MIGRATED migrated{};
    ASSERT_EQ(MediaInfoDBMigrate(nullptr, &migrated, nullptr, nullptr), 0) << KLIBCErrTextGet();
    EXPECT_EQ(migrated.before, 1);
    EXPECT_EQ(migrated.after, isSqlite() ? 2 : 3);
    EXPECT_EQ(MediaInfoDBCheck(nullptr, nullptr), 0) << KLIBCErrTextGet();
    if (!isSqlite()) {
        EXPECT_EQ(Cluster::run(location(), "SELECT count(*) FROM zano.grams"), "4");
    }
}

TEST(PostgresqlTransferTest, BothKindsOfSchemaTwoAreBroughtUpToDate) {
    for (const bool hasAnotherColumn : {false, true}) {
        const std::string place = Cluster::get().newDatabase();
        openCatalogue(place)->finish({});
        Cluster::run(place, "ALTER TABLE zano.grams RENAME COLUMN shares TO common");
        if (hasAnotherColumn) {
            Cluster::run(place, "DELETE FROM zano.grams");
            Cluster::run(place, "ALTER TABLE zano.grams ADD COLUMN frequent bytea NOT NULL");
        }
        Cluster::run(place, "UPDATE zano.state SET value=2 WHERE name='schema'");
        openCatalogue(place)->finish({});
        EXPECT_EQ(Cluster::run(place, "SELECT count(shares) FROM zano.grams"), "4");
    }
}

TEST(PostgresqlTransferTest, WritersOfPlaylistsAndNoticesWaitForACopy) {
    const std::string place = Cluster::get().newDatabase();
    const auto target = openReplacement(place);
    EXPECT_EQ(Cluster::run(place,
                           "SELECT count(*) FROM pg_locks WHERE mode='ShareRowExclusiveLock' AND "
                           "granted AND relation IN ('zano.playlists'::regclass, "
                           "'zano.notices'::regclass)"),
              "2");
}

/* The grants that the documentation names. */
TEST(PostgresqlTransferTest, AReaderMayCheckAndCopyFrom) {
    const files::Folder folder;
    const std::string place = Cluster::get().newDatabase();
    fillWithOddities(place);
    Cluster::run(place,
                 "CREATE ROLE music_copier LOGIN; GRANT USAGE ON SCHEMA zano TO music_copier; "
                 "GRANT SELECT ON ALL TABLES IN SCHEMA zano TO music_copier");
    const std::string database = Cluster::run(place, "SELECT current_database()");
    const std::string reader = Cluster::get().address(database, "music_copier");
    EXPECT_EQ(MediaInfoDBCheck(reader.c_str(), nullptr), 0) << KLIBCErrTextGet();
    Cluster::run(place, "GRANT SELECT ON ALL SEQUENCES IN SCHEMA zano TO music_copier");
    EXPECT_NO_THROW(copyDatabase(reader, "sqlite:" + folder.path("copy.db"), false, {}));
    EXPECT_THROW(copyDatabase("sqlite:" + folder.path("copy.db"), reader, true, {}), DatabaseError);
    Cluster::run(place, "DROP OWNED BY music_copier; DROP ROLE music_copier");
}

ZANO_FOR_EVERY_ENGINE(TransferTest);

}  // namespace
}  // namespace zano::mediadb
