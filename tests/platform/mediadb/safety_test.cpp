/* Texts come from outside: whatever they are, the database stays as it is. And files that are
 * not what they should be are refused. */
#include <linux/capability.h>
#include <sqlite3.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>
#include <zanoplatform/sql_escape.h>

#include <array>
#include <cstdio>
#include <cstring>
#include <sstream>

#include "engines.h"
#include "mediadb/sqlite/handle.h"

namespace zano::mediadb {
namespace {

std::string contentsOf(const std::string &path) {
    std::ostringstream text;
    text << std::ifstream(path, std::ios::binary).rdbuf();
    return text.str();
}

void fillCatalogue(const std::string &location) {
    auto catalogue = openCatalogue(location);
    catalogue->begin();
    const std::pair<const char *, std::string> songs[] = {
        {"/music/a", "One"}, {"/music/b", "Two"}, {"/music/c", std::string(4000, 'a')}};
    for (const auto &[path, title] : songs) {
        Song song;
        song.path = path;
        song.title = title;
        catalogue->putSong(song);
    }
    catalogue->commit();
    catalogue->finish({});
}

class SafetyTest : public EngineTest {
  protected:
    void fill() { fillCatalogue(location()); }

    /* Everything that is stored. */
    std::string contents() const {
        return isSqlite()
                   ? contentsOf(databasePath())
                   : Cluster::run(location(),
                                  "SELECT (SELECT string_agg(s::text, ' ') FROM zano.songs s) || "
                                  "(SELECT string_agg(t::text, ' ') FROM zano.state t) || "
                                  "(SELECT string_agg(c.oid::text, ' ') FROM pg_class c)");
    }
};

/* What is of a file only. */
class FileTest : public MediaDatabaseTest {
  protected:
    void fill() { fillCatalogue(location()); }
};

TEST_P(SafetyTest, TextsThatAreNoConditionsFailTheOpenAndNothingElse) {
    fill();
    const std::vector<std::string> conditions = {
        "1=1; drop table songs",
        "1=1; delete from songs",
        "id=1 union select * from sqlite_master",
        "id in (select id from songs)",
        "id=(with recursive c(x) as (select 1 union all select x+1 from c) select x from c)",
        "load_extension('/tmp/x.so')",
        "load_extension('/tmp/x.so')=1",
        "writefile('/tmp/x','y')=1",
        "fts3_tokenizer('x')='y'",
        "randomblob(1000000000)=1",
        "zeroblob(1000000000)=''",
        "sqlite_version()='3'",
        "exists(select 1)",
        "(update songs set title='x')",
        "id=1 returning id",
        "title='x",
        "title=\"x\"",
        "title=[x]",
        "title=`x`",
        "title='x' --",
        "title='x' /* */",
        "title=?1",
        "title=:name",
        "title=x'00'",
        "title=char(0)",
        "main.songs.id=1",
        "rowid=1",
        "rank=1",
        "title_key='x'",
        "pragma_user_version=1",
        "grams match 'x'",
        "title glob '*'",
        "title regexp 'a'",
        "title collate nocase='x'",
        "case when 1=1 then 1 end",
        "cast(id as text)='1'",
        "id=1 order by id",
        "id=1 limit 1",
        "id=1)",
        "(id=1",
        "id",
        "id=",
        "=1",
        "and",
        "title like",
        "title like title",
        "title ilike '%a' or",
        " ilike '%x%'",
        "id in ()",
        "id in (1,2",
        "id in (1,abc)",
        "id=1e5",
        "id=0x10",
        "id=1abc",
        "id=99999999999999999999999999999999999999999.x",
        "id between 1",
        "id is 1",
        "title like '" + std::string(70000, 'a') + "'",
        [] {
            std::string many = "title ilike '%a%'";
            for (int i = 0; i < 1000; ++i) {
                many += " or title ilike '%b%'";
            }
            return many;
        }(),
        std::string(5000, '('),
        std::string(5000, '(') + "id=1" + std::string(5000, ')'),
        [] {
            std::string deep;
            for (int i = 0; i < 5000; ++i) {
                deep += "not ";
            }
            return deep + "id=1";
        }(),
    };
    const std::string before = contents();
    for (const std::string &condition : conditions) {
        for (const int table : {0, 3, 4}) {
            EXPECT_EQ(MediaInfoDBOpen(table, "*", condition.c_str(), nullptr, nullptr, 0, 50, 0),
                      nullptr)
                << condition.substr(0, 80);
            EXPECT_EQ(KLIBCErrGet(), KLIB_ERR_DATABASE_QUERY);
            EXPECT_STRNE(KLIBCErrTextGet(), "");
        }
        EXPECT_EQ(MediaInfoDBGetCount(0, "*", condition.c_str(), 0, 0), -1);
    }
    for (const char *other :
         {"*, (select 1)", "id, *", "count(*)", "title as id", "x", "id;", "'text'", "title as"}) {
        EXPECT_EQ(MediaInfoDBOpen(0, other, nullptr, nullptr, nullptr, 0, 0, 0), nullptr) << other;
    }
    for (const char *other :
         {"id; drop table songs", "(select 1)", "random", "RANDOM(1)", "lower(title", "lower()",
          "title sideways", "upper(title)", "1", "title,", "abs(id)", "title collate nocase"}) {
        EXPECT_EQ(MediaInfoDBOpen(0, "*", nullptr, nullptr, other, 0, 0, 0), nullptr) << other;
        EXPECT_EQ(MediaInfoDBOpen(0, "*", nullptr, other, nullptr, 0, 0, 0), nullptr) << other;
    }
    EXPECT_EQ(MediaInfoDBOpen(7, "*", nullptr, nullptr, nullptr, 0, 0, 0), nullptr);
    EXPECT_EQ(MediaInfoDBOpen(-1, "*", nullptr, nullptr, nullptr, 0, 0, 0), nullptr);
    EXPECT_TRUE(before == contents()) << "the database changed";
    EXPECT_EQ(rows(nullptr, "path").size(), 3U);
}

/* SQLite's own matching would not come back from the first of these. */
TEST_P(SafetyTest, HostilePatternsAndLongTextsAreAnswered) {
    fill();
    std::string percents;
    for (int i = 0; i < 40; ++i) {
        percents += "a%";
    }
    EXPECT_EQ(rows(("title ilike '%" + percents + "b'").c_str(), "path").size(), 0U);
    EXPECT_EQ(rows(("title like '%" + percents + "'").c_str(), "path").size(), 1U);
    EXPECT_EQ(found(std::string(3999, 'a')).size(), 1U);
    EXPECT_EQ(found(std::string(10000, 'a')).size(), 0U);
    EXPECT_EQ(found(std::string(60000, '_')).size(), 0U);
    EXPECT_EQ(found("\xFF\xFE\xC3").size(), 0U);
    EXPECT_EQ(rows("title like '%\\'", "path").size(), 0U);
    std::string ids = "1";
    for (int i = 2; i < 3000; ++i) {
        ids += "," + std::to_string(i);
    }
    EXPECT_EQ(rows(("id in (" + ids + ")").c_str(), "path").size(), 3U);
}

TEST_P(SafetyTest, ConditionsMeanWhatTheySay) {
    fill();
    const std::vector<std::pair<const char *, size_t>> cases = {
        {"id=1", 1},
        {" id = 2 ", 1},
        {"id<>2", 2},
        {"id!=2", 2},
        {"id>=2 and id<=3", 2},
        {"id<2 or id>2", 2},
        {"not (id=1)", 2},
        {"id between 2 and 3", 2},
        {"id not between 2 and 3", 1},
        {"id in (1,3,99)", 2},
        {"id not in (1)", 2},
        {"title='One'", 1},
        {"title='one'", 0},
        {"lower(title)='one'", 1},
        {"title like 'one'", 0},
        {"title ilike 'ONE'", 1},
        {"title not ilike 'one'", 2},
        {"length(title)=3", 2},
        {"title is null", 0},
        {"title is not null", 3},
        {"1=1", 3},
        {"1=2", 0},
        {"title='it''s'", 0},
        {"path like '/music/_'", 3},
        {"path like '/MUSIC/%'", 0},
        {"id=-1", 0},
        {"year < 0.5", 3},
        {"year='0'", 3},
        {"year='x'", 0},
        {"year<'x'", 3},
        {"id in ('2','x',3.0)", 2},
        {"title>5", 3},
        {"title='5'", 0},
        {"'5'=5", 0},
        {"'a'='A'", 0},
        {"lower('A')='a'", 3},
        {"length('ab')=2", 3},
        {"length(title)='3'", 0},
        {"'Abc' ilike 'aB_'", 3},
        {"year like '0'", 3},
        {"id between '2' and 3", 2},
        {"title between 'A' and 'P'", 1},
        {"path ilike '/MUSIC/A'", 1},
        {"path like '%_sic/b'", 1},
        {"path like '%/b'", 1},
        {"length(path)=8", 3},
        {"path in ('/music/a','/x')", 1},
        {"lower(path)='/music/c'", 1},
        {"path>'/music/a'", 2},
        {"album_artist ilike 'x%'", 0},
        {"lower(title) ilike 'ONE'", 1},
        {"lower(title) like 'o_e'", 1},
        {"duration=0 and duration<'1.5'", 3},
        {"not (id in (1) or title is null)", 2},
        {"TITLE='One' AND ID=1", 1},
        {"", 3},
        {"  ", 3}};
    for (const auto &[condition, count] : cases) {
        EXPECT_EQ(rows(condition, "path").size(), count) << condition;
        EXPECT_EQ(MediaInfoDBGetCount(0, "*", condition, 0, 0), static_cast<int>(count))
            << condition;
    }
}

TEST_F(FileTest, FilesThatAreNoMediaDatabaseAreRefusedAndLeftAlone) {
    const auto refused = [this](int code, const std::string &what) {
        const std::string before = contentsOf(databasePath());
        EXPECT_EQ(rows(nullptr, nullptr)[0].substr(0, 7), "failed:") << what;
        EXPECT_EQ(KLIBCErrGet(), code) << what << KLIBCErrTextGet();
        EXPECT_NE(std::string(KLIBCErrTextGet()).find(databasePath()), std::string::npos)
            << KLIBCErrTextGet();
        try {
            openCatalogue(location());
            ADD_FAILURE() << what << " was opened for writing";
        } catch (const DatabaseError &error) {
            EXPECT_EQ(error.code(), code) << what << error.what();
        }
        EXPECT_TRUE(before == contentsOf(databasePath())) << what;
    };
    EXPECT_EQ(MediaInfoDBOpen(0, "*", nullptr, nullptr, nullptr, 0, 0, 0), nullptr);
    EXPECT_EQ(KLIBCErrGet(), KLIB_ERR_DATABASE_OPEN) << "a missing file";
    EXPECT_FALSE(std::filesystem::exists(databasePath())) << "reading made a file";

    std::ofstream(databasePath()) << "This is not a database, but it is long enough to be read.\n"
                                  << std::string(4096, 'x');
    refused(KLIB_ERR_DATABASE_OPEN, "a text file");

    std::filesystem::remove(databasePath());
    sqlite::Connection(databasePath(), sqlite::Connection::Mode::Create)
        .run("CREATE TABLE songs(id INTEGER)");
    refused(KLIB_ERR_DATABASE_OPEN, "a database of another program");

    std::filesystem::remove(databasePath());
    openCatalogue(location()).reset();
    sqlite::Connection(databasePath(), sqlite::Connection::Mode::ReadWrite)
        .run("PRAGMA user_version=99; PRAGMA wal_checkpoint(TRUNCATE)");
    refused(KLIB_ERR_DATABASE_VERSION, "a database of a newer version");

    setSetting("mysql://localhost/x");
    for (int call = 0; call < 3; ++call) {
        EXPECT_EQ(MediaInfoDBOpen(0, "*", nullptr, nullptr, nullptr, 0, 0, 0), nullptr);
        EXPECT_EQ(KLIBCErrGet(), KLIB_ERR_BAD_CONFIGURATION);
    }
}

TEST_P(SafetyTest, ListsOfTextsHoldAnyBytes) {
    const std::vector<std::string> paths = {"/a/\"quoted\"", "/a/back\\slash\\\\", "/a/it's",
                                            "/a/tab\tand\x01", "/a/\xC3\xA9\xE3\x83\x89"};
    const std::string notText = "/a/\xFF";
    auto catalogue = openCatalogue(location());
    std::vector<Song> songs = {song(notText, "x"), song("/a/other", "x")};
    std::string list;
    for (const std::string &path : paths) {
        songs.push_back(song(path, "x"));
        std::array<char, 100> quoted{};
        ZANODBEscapeString(quoted.data(), path.c_str(), static_cast<int>(path.size()));
        list.append(list.empty() ? "'" : ",'").append(quoted.data()).append("'");
    }
    put(*catalogue, songs);
    EXPECT_EQ(rows(("path in (" + list + ")").c_str(), nullptr), paths);
    EXPECT_EQ(rows(("path in (" + list + ",'" + notText + "')").c_str(), nullptr).size(), 6U);
    EXPECT_EQ(rows(("path not in (" + list + ")").c_str(), nullptr).size(), 2U);
    EXPECT_EQ(rows("title in (1,'x',2.5)", nullptr).size(), 7U) << "of several kinds";
}

/* Runs an action in a child; its exit status, which the action gives. */
template <typename Action>
int statusOfChild(Action action) {
    const pid_t child = fork();
    if (child == 0) {
        _exit(action());
    }
    int status = -1;
    waitpid(child, &status, 0);
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

/* Takes from root the power to write whatever a file's mode says; that to read stays, for the
 * folders above the tree may be root's own. */
bool isBoundByModes() {
    __user_cap_header_struct header{_LINUX_CAPABILITY_VERSION_3, 0};
    std::array<__user_cap_data_struct, 2> sets{};
    if (geteuid() != 0) {
        return true;
    }
    const bool isKnown = syscall(SYS_capget, &header, sets.data()) == 0;
    sets[0].effective &= ~(1U << CAP_DAC_OVERRIDE);
    return isKnown && syscall(SYS_capset, &header, sets.data()) == 0;
}

/* As a web front of another user, who may not write in the database's folder. */
TEST_F(FileTest, ADatabaseIsReadableWithoutTheRightToWrite) {
    fill();
    EXPECT_EQ(std::filesystem::file_size(databasePath() + "-wal"), 0U) << "kept, but empty";
    const auto folder = std::filesystem::path(databasePath()).parent_path();
    using std::filesystem::perms;
    for (const char *suffix : {"", "-wal", "-shm"}) {
        permissions(std::filesystem::path(databasePath() + suffix),
                    perms::owner_read | perms::group_read | perms::others_read);
    }
    permissions(folder, perms(0555));
    const int found = statusOfChild([&] {
        const bool isBound = isBoundByModes();
        const bool isRefused = std::ofstream(folder / "new").fail() &&
                               std::ofstream(databasePath(), std::ios::app).fail();
        return isBound && isRefused ? static_cast<int>(rows(nullptr, "path").size()) : 100;
    });
    permissions(folder, perms::owner_all);
    EXPECT_EQ(found, 3);
}

TEST_P(SafetyTest, AResultEndsWithTheProcessThatOpenedIt) {
    fill();
    MEDIA_DB_RESULT *result = MediaInfoDBOpen(0, "*", nullptr, nullptr, "path", 0, 0, 0);
    ASSERT_NE(result, nullptr);
    auto record = std::make_unique<ZANO_MEDIA_INFO>();
    const int inChild = statusOfChild([&] {
        const bool isRefused =
            MediaInfoDBGet(result, record.get()) == -1 && KLIBCErrGet() == KLIB_ERR_DATABASE_FAILED;
        MediaInfoDBClose(result);
        return isRefused ? static_cast<int>(rows(nullptr, "path").size()) : 100;
    });
    EXPECT_EQ(inChild, 3) << "but opens its own";
    EXPECT_EQ(MediaInfoDBGet(result, record.get()), 0) << "and leaves the parent's alone";
    MediaInfoDBClose(result);
}

TEST_P(SafetyTest, ManyMayBeTheFirstToWrite) {
    std::array<int, 2> gate{};
    ASSERT_EQ(pipe(gate.data()), 0);
    std::vector<pid_t> children;
    for (int i = 0; i < 8; ++i) {
        children.push_back(fork());
        if (children.back() == 0) {
            close(gate[1]);
            char none = 0;
            (void)!read(gate[0], &none, 1);
            ZANO_MEDIA_INFO row{};
            std::snprintf(row.path, sizeof row.path, "/music/%d.m3u", i);
            _exit(MediaInfoDBSave(MEDIA_TABLE_PLAYLISTS, &row) == 0 ? 0 : 1);
        }
    }
    close(gate[0]);
    close(gate[1]);
    for (const pid_t child : children) {
        int status = -1;
        waitpid(child, &status, 0);
        EXPECT_EQ(status, 0);
    }
    EXPECT_EQ(MediaInfoDBGetCount(MEDIA_TABLE_PLAYLISTS, "*", nullptr, 0, 0), 8);
}

/* Changing what is not there makes no database either. */
TEST_F(FileTest, ChangesOfNothingMakeNoDatabase) {
    const ZANO_MEDIA_INFO row{};
    EXPECT_EQ(MediaInfoDBUpdate(MEDIA_TABLE_PLAYLISTS, &row), -1);
    EXPECT_EQ(KLIBCErrGet(), KLIB_ERR_DATABASE_OPEN);
    EXPECT_EQ(MediaInfoDBDelete(MEDIA_TABLE_PLAYLISTS, "/music/x.m3u"), -1);
    EXPECT_FALSE(std::filesystem::exists(databasePath()));
}

TEST_P(SafetyTest, AResultSeesOneMomentAndBlocksNobody) {
    fill();
    MEDIA_DB_RESULT *result = MediaInfoDBOpen(0, "*", nullptr, nullptr, "path", 0, 0, 0);
    ASSERT_NE(result, nullptr);
    auto catalogue = openCatalogue(location());
    put(*catalogue, {song("/music/d", "Four")});
    EXPECT_EQ(rows(nullptr, "path").size(), 4U);
    auto record = std::make_unique<ZANO_MEDIA_INFO>();
    int count = 0;
    while (MediaInfoDBGet(result, record.get()) == 0) {
        ++count;
    }
    EXPECT_EQ(count, 3);
    EXPECT_EQ(result->rowCount, 3);
    MediaInfoDBClose(result);
}

/* A database that was put back from a copy is another file under the same name. */
TEST_F(FileTest, AReplacedDatabaseIsNoticed) {
    fill();
    EXPECT_EQ(rows(nullptr, "path").size(), 3U);
    for (const char *suffix : {"", "-wal", "-shm"}) {
        std::filesystem::remove(databasePath() + suffix);
    }
    auto catalogue = openCatalogue(location());
    put(*catalogue, {song("/other/x", "X")});
    awaitTick();
    EXPECT_EQ(rows(nullptr, "path"), std::vector<std::string>{"/other/x"});
}

ZANO_FOR_EVERY_ENGINE(SafetyTest);

}  // namespace
}  // namespace zano::mediadb
