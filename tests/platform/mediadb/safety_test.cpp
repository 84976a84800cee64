/* Texts come from outside: whatever they are, the database stays as it is. And files that are
 * not what they should be are refused. */
#include <linux/capability.h>
#include <sqlite3.h>
#include <sys/syscall.h>
#include <unistd.h>
#include <zanoplatform/sql_escape.h>

#include <array>
#include <cstdio>
#include <cstring>

#include "engines.h"
#include "mediadb/sqlite/handle.h"
#include "support/files.h"
#include "support/process.h"

namespace zano::mediadb {
namespace {

class SafetyTest : public EngineTest {
  protected:
    /* Everything that is stored. */
    std::string contents() const {
        return isSqlite()
                   ? files::read(databasePath())
                   : Cluster::run(location(),
                                  "SELECT (SELECT string_agg(s::text, ' ') FROM zano.songs s) || "
                                  "(SELECT string_agg(t::text, ' ') FROM zano.state t) || "
                                  "(SELECT string_agg(c.oid::text, ' ') FROM pg_class c)");
    }
};

/* What is of a file only. */
class FileTest : public MediaDatabaseTest {};

TEST_P(SafetyTest, TextsThatAreNoConditionsFailTheOpenAndNothingElse) {
    putThreeSongs();
    std::string many = "title ilike '%a%'";
    std::string deep = "id=1";
    for (int i = 0; i < 1000; ++i) {
        many += " or title ilike '%b%'";
        deep.insert(0, "not not not not not ");
    }
    const std::string open(5000, '(');
    const std::vector<std::vector<std::string>> conditions = {
        // More than a condition.
        {"title='x' --", "id=1 limit 1", "title='x' /* */", "exists(select 1)", "id=1 order by id",
         "id=1 returning id", "1=1; drop table songs", "1=1; delete from songs",
         "id in (select id from songs)", "(update songs set title='x')",
         "id=1 union select * from sqlite_master",
         "id=(with recursive c(x) as (select 1 union all select x+1 from c) select x from c)"},
        // Functions that are none of ours, then names and operators.
        {"title=char(0)", "sqlite_version()='3'", "cast(id as text)='1'", "fts3_tokenizer('x')='y'",
         "zeroblob(1000000000)=''", "randomblob(1000000000)=1", "writefile('/tmp/x','y')=1",
         "load_extension('/tmp/x.so')", "load_extension('/tmp/x.so')=1"},
        {"rank=1", "rowid=1", "title=?1", "title=[x]", "title=`x`", "title=\"x\"", "title=:name",
         "title=x'00'", "title_key='x'", "title glob '*'", "main.songs.id=1", "grams match 'x'",
         "title regexp 'a'", "pragma_user_version=1", "title collate nocase='x'",
         "case when 1=1 then 1 end"},
        // Not whole.
        {"id=1)", "id in ()", "title like", "id in (1,2", " ilike '%x%'", "title ilike '%a' or"},
        {"id", "=1", "id=", "and", "(id=1", "id=1e5", "id=0x10", "id=1abc", "id is 1", "title='x",
         "id between 1", "id in (1,abc)", "title like title",
         "id=99999999999999999999999999999999999999999.x"},
        // Too much.
        {many, deep, open, open + "id=1" + std::string(5000, ')'),
         "title like '" + std::string(70000, 'a') + "'"}};
    const std::string before = contents();
    for (const std::vector<std::string> &group : conditions) {
        for (const std::string &condition : group) {
            SCOPED_TRACE(condition.substr(0, 80));
            const char *const text = condition.c_str();
            for (const int table : {0, 3, 4}) {
                EXPECT_EQ(MediaInfoDBOpen(table, "*", text, nullptr, nullptr, 0, 50, 0), nullptr);
                EXPECT_EQ(KLIBCErrGet(), KLIB_ERR_DATABASE_QUERY);
                EXPECT_STRNE(KLIBCErrTextGet(), "");
            }
            EXPECT_EQ(MediaInfoDBGetCount(0, "*", text, 0, 0), -1);
        }
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
    putThreeSongs();
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
    putThreeSongs();
    const std::vector<std::vector<const char *>> byCount = {
        {"1=2", "id=-1", "'5'=5", "'a'='A'", "year='x'", "title='5'", "title='one'",
         "title is null", "title='it''s'", "title like 'one'", "length(title)='3'",
         "path like '/MUSIC/%'", "album_artist ilike 'x%'"},
        {"id=1", " id = 2 ", "title='One'", "path like '%/b'", "title ilike 'ONE'",
         "lower(title)='one'", "path like '%_sic/b'", "TITLE='One' AND ID=1",
         "path ilike '/MUSIC/A'", "id not between 2 and 3", "lower(path)='/music/c'",
         "lower(title) like 'o_e'", "lower(title) ilike 'ONE'", "title between 'A' and 'P'",
         "path in ('/music/a','/x')"},
        {"id<>2", "id!=2", "not (id=1)", "id<2 or id>2", "id not in (1)", "id in (1,3,99)",
         "id>=2 and id<=3", "length(title)=3", "path>'/music/a'", "id between 2 and 3",
         "id in ('2','x',3.0)", "id between '2' and 3", "title not ilike 'one'",
         "not (id in (1) or title is null)"},
        {"", "  ", "1=1", "title>5", "year='0'", "year<'x'", "year < 0.5", "year like '0'",
         "lower('A')='a'", "length('ab')=2", "length(path)=8", "title is not null",
         "'Abc' ilike 'aB_'", "path like '/music/_'", "duration=0 and duration<'1.5'"}};
    for (int count = 0; count < 4; ++count) {
        for (const char *condition : byCount[static_cast<size_t>(count)]) {
            EXPECT_EQ(rows(condition, "path").size(), static_cast<size_t>(count)) << condition;
            EXPECT_EQ(MediaInfoDBGetCount(0, "*", condition, 0, 0), count) << condition;
        }
    }
}

TEST_F(FileTest, FilesThatAreNoMediaDatabaseAreRefusedAndLeftAlone) {
    const auto refused = [this](int code, const std::string &what) {
        const std::string before = files::read(databasePath());
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
        EXPECT_TRUE(before == files::read(databasePath())) << what;
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
    putThreeSongs();
    EXPECT_EQ(std::filesystem::file_size(databasePath() + "-wal"), 0U) << "kept, but empty";
    const auto folder = std::filesystem::path(databasePath()).parent_path();
    using std::filesystem::perms;
    for (const char *suffix : {"", "-wal", "-shm"}) {
        permissions(std::filesystem::path(databasePath() + suffix),
                    perms::owner_read | perms::group_read | perms::others_read);
    }
    permissions(folder, perms(0555));
    const pid_t reader = process::start([&] {
        const bool isBound = isBoundByModes();
        const bool isRefused = std::ofstream(folder / "new").fail() &&
                               std::ofstream(databasePath(), std::ios::app).fail();
        return isBound && isRefused ? static_cast<int>(rows(nullptr, "path").size()) : 100;
    });
    EXPECT_EQ(process::statusOf(reader), 3);
    permissions(folder, perms::owner_all);
}

TEST_P(SafetyTest, AResultEndsWithTheProcessThatOpenedIt) {
    putThreeSongs();
    MEDIA_DB_RESULT *result = MediaInfoDBOpen(0, "*", nullptr, nullptr, "path", 0, 0, 0);
    ASSERT_NE(result, nullptr);
    auto record = std::make_unique<ZANO_MEDIA_INFO>();
    const pid_t child = process::start([&] {
        const bool isRefused =
            MediaInfoDBGet(result, record.get()) == -1 && KLIBCErrGet() == KLIB_ERR_DATABASE_FAILED;
        MediaInfoDBClose(result);
        return isRefused ? static_cast<int>(rows(nullptr, "path").size()) : 100;
    });
    EXPECT_EQ(process::statusOf(child), 3) << "but opens its own";
    EXPECT_EQ(MediaInfoDBGet(result, record.get()), 0) << "and leaves the parent's alone";
    MediaInfoDBClose(result);
}

TEST_P(SafetyTest, ManyMayBeTheFirstToWrite) {
    process::runAtOnce(8, [](int number) {
        ZANO_MEDIA_INFO row{};
        std::snprintf(row.path, sizeof row.path, "/music/%d.m3u", number);
        return -MediaInfoDBSave(MEDIA_TABLE_PLAYLISTS, &row);
    });
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
    putThreeSongs();
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
    putThreeSongs();
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
