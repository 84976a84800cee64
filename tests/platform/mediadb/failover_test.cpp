/* A primary and its standby, both of the test's own: what goes on when the primary is gone. */
#include <unistd.h>

#include <cstring>

#include "cluster.h"
#include "fixture.h"

namespace zano::mediadb {
namespace {

struct Pair {
    Cluster primary;
    std::string address = primary.newDatabase();
    std::string database = Cluster::run(address, "SELECT current_database()");
    Cluster standby{&primary};
};

class PostgresqlFailoverTest : private std::unique_ptr<Pair>, public MediaDatabaseTest {
  protected:
    PostgresqlFailoverTest()
        : std::unique_ptr<Pair>(std::make_unique<Pair>()),
          MediaDatabaseTest(get()->primary.addressWith(get()->standby, get()->database)) {
        /* A commit is done when the standby shows it, so that nothing can be lost. */
        Cluster::run(get()->address, "ALTER SYSTEM SET synchronous_standby_names='*'");
        Cluster::run(get()->address, "ALTER SYSTEM SET synchronous_commit=remote_apply");
        Cluster::run(get()->address, "SELECT pg_reload_conf()");
        while (Cluster::run(get()->address,
                            "SELECT count(*) FROM pg_stat_replication WHERE sync_state='sync'") !=
               "1") {
            usleep(1000);
        }
    }

    Pair &servers() { return *get(); }

    static int savePlaylist(const char *path) {
        ZANO_MEDIA_INFO row{};
        std::strcpy(row.path, path);
        std::strcpy(row.title, "List");
        return MediaInfoDBSave(MEDIA_TABLE_PLAYLISTS, &row);
    }

    static int playlists() {
        return MediaInfoDBGetCount(MEDIA_TABLE_PLAYLISTS, "*", nullptr, 0, 0);
    }
};

TEST_F(PostgresqlFailoverTest, TheStandbyIsReadUntilItIsThePrimary) {
    constexpr int kSongs = 1500;
    std::vector<Song> songs;
    for (int i = 0; i < kSongs; ++i) {
        songs.push_back(song("/music/" + std::to_string(i), "Title " + std::to_string(i)));
    }
    put(*openCatalogue(location()), songs);
    ASSERT_EQ(savePlaylist("/music/one.m3u"), 0) << KLIBCErrTextGet();
    const auto all = rows(nullptr, "title");
    ASSERT_EQ(all.size(), songs.size());
    const auto found = this->found("title 77");

    MEDIA_DB_RESULT *cut = MediaInfoDBOpen(0, "*", nullptr, nullptr, "title", 0, 0, 0);
    auto record = std::make_unique<ZANO_MEDIA_INFO>();
    ASSERT_EQ(MediaInfoDBGet(cut, record.get()), 0);
    servers().primary.kill();
    while (MediaInfoDBGet(cut, record.get()) == 0) {
    }
    EXPECT_EQ(KLIBCErrGet(), KLIB_ERR_DATABASE_FAILED) << "a cut listing looks whole";
    MediaInfoDBClose(cut);

    EXPECT_EQ(rows(nullptr, "title"), all);
    EXPECT_EQ(this->found("title 77"), found);
    EXPECT_EQ(rows(nullptr, "title", {1400, 50}).size(), 50U);
    EXPECT_EQ(savePlaylist("/music/two.m3u"), -1);
    EXPECT_EQ(KLIBCErrGet(), KLIB_ERR_DATABASE_OPEN);
    EXPECT_NE(std::string(KLIBCErrTextGet()).find("for writing"), std::string::npos)
        << KLIBCErrTextGet();
    EXPECT_THROW(openCatalogue(location()), DatabaseError);
    EXPECT_EQ(playlists(), 1);

    const std::string standby = servers().standby.address(servers().database, "zano");
    ASSERT_EQ(Cluster::run(standby, "SELECT pg_promote()"), "t");
    EXPECT_EQ(savePlaylist("/music/two.m3u"), 0) << KLIBCErrTextGet();
    EXPECT_EQ(playlists(), 2);
    EXPECT_EQ(rows(nullptr, "title"), all);
    EXPECT_NO_THROW(openCatalogue(location())->check());
}

TEST_F(PostgresqlFailoverTest, ReadersMayPreferTheStandby) {
    put(*openCatalogue(location()), {song("/music/1", "One")});
    setSetting(location() + "&target_session_attrs=prefer-standby");
    EXPECT_EQ(rows(nullptr, "title").size(), 1U);
    const std::string standby = servers().standby.address(servers().database, "zano");
    EXPECT_EQ(Cluster::run(standby,
                           "SELECT count(*) FROM pg_stat_activity WHERE application_name='zano'"),
              "1");
    EXPECT_EQ(savePlaylist("/music/one.m3u"), 0) << KLIBCErrTextGet();
    EXPECT_EQ(playlists(), 1);
}

}  // namespace
}  // namespace zano::mediadb
