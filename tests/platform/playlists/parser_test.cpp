#include <algorithm>
#include <cstring>

#include "music.h"
#include "playlist.h"
#include "support/failing_allocator.h"

namespace {
int openedQueries = 0;
}

/* The linker sends the parser's calls here. */
extern "C" MEDIA_DB_RESULT *__real_MediaInfoDBOpen(int, const char *, const char *, const char *,
                                                   const char *, int, int, int);
extern "C" MEDIA_DB_RESULT *__wrap_MediaInfoDBOpen(int table, const char *select,
                                                   const char *condition, const char *distinct,
                                                   const char *orderBy, int offset, int limit,
                                                   int flag) {
    ++openedQueries;
    return __real_MediaInfoDBOpen(table, select, condition, distinct, orderBy, offset, limit, flag);
}

namespace zano::playlists {
namespace {

class ParserTest : public MusicTest {
  protected:
    int queriesFor(const std::string &contents, int entries) const {
        const std::string path = write("many.m3u", contents);
        openedQueries = 0;
        const std::string text = dump(path);
        EXPECT_EQ(std::count(text.begin(), text.end(), '\n'), entries);
        return openedQueries;
    }
};

std::string repeated(const std::string &line, int times) {
    std::string text;
    for (int i = 0; i < times; ++i) {
        text += line;
    }
    return text;
}

TEST_F(ParserTest, QueriesAreAsManyForManyEntriesAsForOne) {
    EXPECT_EQ(queriesFor("http://a/\n", 1), 0);
    for (const char *line :
         {"Artist/Album/01 First.mp3\n", "loose.mp3\n", "gone.mp3\n", "C:\\Music\\x\\gone.mp3\n"}) {
        EXPECT_EQ(queriesFor(repeated(line, 5000), 5000), queriesFor(line, 1)) << line;
    }
}

TEST_F(ParserTest, OneSongInManyPlacesHasItsRowInEach) {
    const std::string text = dump(write("twice.m3u", "a & b.mp3\nloose.mp3\na & b.mp3\n"));
    EXPECT_EQ(text,
              "song ~/a & b.mp3|title of a & b.mp3|artist|||2001|0|0|61.5\n"
              "     ~/loose.mp3|||||0|0|0|0\n"
              "song ~/a & b.mp3|title of a & b.mp3|artist|||2001|0|0|61.5\n");
}

/* A line that begins with # is an entry when such a file is there. */
TEST_F(ParserTest, FilesAreLookedForInEachFolderAnew) {
    std::filesystem::create_directory(music() / "hash");
    write("hash/#1.mp3", "");
    write("hash/#3.mp3", "");
    EXPECT_EQ(dump(write("hash/list.m3u",
                         "#0.mp3\n#1.mp3\n#2.mp3\n#3.mp3\n#../gone/1.mp3\n#../gone/2.mp3\n"
                         "#../gone/3.mp3\n#1.mp3\n#3.mp3/4.mp3\n#3.mp3/5.mp3\n#3.mp3/6.mp3\n"
                         "#3.mp3\n#/\n#/\n#/\n")),
              "     ~/hash/#1.mp3|||||0|0|0|0\n     ~/hash/#3.mp3|||||0|0|0|0\n"
              "     ~/hash/#1.mp3|||||0|0|0|0\n     ~/hash/#3.mp3|||||0|0|0|0\n");
}

TEST_F(ParserTest, FieldsThatAreNotAskedForAreEmpty) {
    const std::string path = write("fields.m3u",
                                   "#EXTINF:5,Title\n#EXTINFALBUM:Album\n#EXTINFYEAR:1999\n"
                                   "loose.mp3\na & b.mp3\n");
    EXPECT_EQ(dump(path, "id, path, title, album"),
              "     ~/loose.mp3|Title||Album||0|0|0|0\n"
              "song ~/a & b.mp3|title of a & b.mp3||||0|0|0|0\n");
    EXPECT_EQ(dump(path, " YEAR ,title"),
              "     |Title||||1999|0|0|0\n     |title of a & b.mp3||||2001|0|0|0\n");
    EXPECT_EQ(dump(path, nullptr), dump(path, "*"));
    EXPECT_EQ(dump(path, "id, nonsense"),
              "error d00 ~/fields.m3u: there is no field \"nonsense\"\n");
    EXPECT_EQ(dump(path, "id; drop"), "error d00 ~/fields.m3u: there is no field \"id; drop\"\n");
}

TEST_F(ParserTest, PlaylistsAreFoundByTheirIds) {
    ZANO_MEDIA_INFO row{};
    const std::string path = write("lists/sub.m3u", "../loose.mp3\n../../up.mp3\n");
    std::strncpy(row.path, path.c_str(), sizeof row.path - 1);
    ASSERT_EQ(MediaInfoDBSave(MEDIA_TABLE_PLAYLISTS, &row), 0);
    const std::pair<const char *, const char *> cases[] = {
        {"1", "     ~/loose.mp3|||||0|0|0|0\n     ~/../up.mp3|||||0|0|0|0\n"},
        {"2", "error 1100 2: no playlist has this id\n"},
        {"", "error d00 : the id of a playlist is a number\n"},
        {"1 or 1=1", "error d00 1 or 1=1: the id of a playlist is a number\n"},
        {"-1", "error d00 -1: the id of a playlist is a number\n"},
        {nullptr, "error d00 playlist: no playlist or no place for the total\n"},
    };
    for (const auto &[id, expected] : cases) {
        int total = -1;
        const List list(ParsePlayListByField(id, &total, 0, 0, "*", 1));
        EXPECT_EQ(dump(list.get(), total), expected);
    }
    EXPECT_EQ(ParsePlayListByField("1", nullptr, 0, 0, "*", 1), nullptr);
    EXPECT_EQ(KLIBCErrGet(), KLIB_ERR_BAD_PARAMETER);
}

TEST_F(ParserTest, FilesThatCannotBeReadAreRefused) {
    std::filesystem::create_directory(music() / "folder.m3u");
    ASSERT_EQ(mkfifo((music() / "pipe.m3u").c_str(), 0600), 0);
    const std::string large = write("large.m3u", "");
    std::filesystem::resize_file(large, kMaxFileBytes + 1);
    const std::string many = write("many.m3u", repeated("http://a/\n", kMaxEntries + 1));
    EXPECT_EQ(dump("relative.m3u"), "error d00 relative.m3u: the path of a playlist is absolute\n");
    const std::string prefix = music().string() + "/";
    EXPECT_EQ(dump(prefix + "none.m3u"), "error 1100 ~/none.m3u: No such file or directory\n");
    EXPECT_EQ(dump(prefix + "folder.m3u"), "error 1101 ~/folder.m3u: not a regular file\n");
    EXPECT_EQ(dump(prefix + "pipe.m3u"), "error 1101 ~/pipe.m3u: not a regular file\n");
    EXPECT_EQ(dump(large), "error 1103 ~/large.m3u: more than 64 MiB\n");
    EXPECT_EQ(dump(many), "error 1103 ~/many.m3u: more than 1000000 entries\n");
}

/* All ids would be 0, and an edit that drops missing songs would drop every one. */
TEST_F(ParserTest, AMediaDatabaseThatCannotBeAskedIsAFailure) {
    const std::string path = write("a.m3u", "loose.mp3\n");
    setSetting("sqlite:" + databasePath() + ".none");
    EXPECT_EQ(dump(path).substr(0, 11), "error 1000 ");
}

TEST_F(ParserTest, LinesThatNoPathCanHoldCostNoOther) {
    const std::string megabyte(1 << 20, 'x');
    const std::string longest(kMaxPathBytes - music().string().size() - 1, 'y');
    for (const std::string &line :
         {megabyte, "#" + megabyte, "#EXTINF:1," + megabyte, "C:\\" + repeated("a\\", 1 << 19),
          repeated("../", 1 << 18), "file:///" + repeated("%41", 1 << 18), longest + "y"}) {
        const std::string text = dump(write("long.m3u", "loose.mp3\n" + line + "\n/last\n"));
        EXPECT_EQ(text.substr(0, 16), "     ~/loose.mp3") << line.substr(0, 20);
        EXPECT_NE(text.find("\n     /last|"), std::string::npos) << line.substr(0, 20);
        EXPECT_LT(text.size(), 5000U) << line.substr(0, 20);
    }
    EXPECT_EQ(dump(write("long.m3u", longest + "\n")), "     ~/" + longest + "|||||0|0|0|0\n");
}

TEST_F(ParserTest, WithoutMemoryForARecordTheWholeListFails) {
    const std::string path =
        write("memory.m3u", "a & b.mp3\na & b.mp3\nloose.mp3\n#hash.mp3\nhttp://a/\n");
    int failures = 0;
    for (int after = 0;; ++after) {
        failing_allocator::failOnSize(sizeof(ZANO_PLAYLIST_REC), after);
        const std::string text = dump(path);
        if (!failing_allocator::hasFailed()) {
            break;
        }
        EXPECT_EQ(text, "error 200 out of memory while reading a playlist\n");
        ++failures;
    }
    EXPECT_GE(failures, 5);
    failing_allocator::failOnSize(0);
}

/* Titles are cut between characters. */
TEST_F(ParserTest, LongTagsAreCutToTheirFields) {
    const std::string text =
        dump(write("tags.m3u", "#EXTINF:1," + repeated("\u00e9", 200) + "\nloose.mp3\n"));
    EXPECT_EQ(text, "     ~/loose.mp3|" + repeated("\u00e9", 127) + "||||0|0|0|1\n");
}

}  // namespace
}  // namespace zano::playlists
