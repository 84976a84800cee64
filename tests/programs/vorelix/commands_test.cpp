#include <algorithm>
#include <csignal>

#include "command_line.h"
#include "support/json.h"

namespace command_line {
namespace {

using zano::mediadb::Song;

Song song(const char *path, const std::string &title, const char *artist = "",
          const char *album = "", const char *genre = "", int year = 0, double duration = 0) {
    Song song;
    song.path = path;
    song.title = title;
    song.artist = artist;
    song.album = album;
    song.genre = genre;
    song.year = year;
    song.duration = duration;
    return song;
}

/* Songs that have made trouble to somebody: wide and accented letters, terminal escapes, the
 * letters that patterns and quotes give a meaning to, a name that is not UTF-8. */
std::vector<Song> library() {
    std::vector<Song> songs = {
        song("/music/Halo.mp3", "Halo", "Beyoncé", "I Am… Sasha Fierce", "Pop", 2008, 261.64),
        song("/music/音楽.flac", "音楽", "YMO", "幾何学模様", "Électro", 1981, 3723),
        song("/music/escape.ogg", "\x1b[31mRed\nGreen", "AC\\DC"),
        song("/music/caf\xe9.wav", "100% Don't_Stop", "AC/DC"),
    };
    songs[0].track = 5;
    songs[0].disc = 1;
    songs[0].bitrate = 320000;
    songs[0].frequency = 44100;
    return songs;
}

std::string idsOf(const Json::Value &answer) {
    std::string ids;
    for (const Json::Value &song : answer["songs"]) {
        ids += (ids.empty() ? "" : " ") + std::to_string(song["id"].asInt());
    }
    return ids;
}

TEST_F(CommandLine, TablesForPeople) {
    fill(library());
    const std::pair<Words, const char *> cases[] = {
        {{"list", "--sort", "added"},
         "ID  Title            Artist   Album               Genre    Year     Time\n"
         " 1  Halo             Beyoncé  I Am… Sasha Fierce  Pop      2008     4:22\n"
         " 2  音楽             YMO      幾何学模様          Électro  1981  1:02:03\n"
         " 3  ␛[31mRed␊Green   AC\\DC\n"
         " 4  100% Don't_Stop  AC/DC\n"
         "\n"
         "songs 1-4 of 4\n"},
        {{"search", "beyonce", "--in", "artist"},
         "ID  Title  Artist   Album               Genre  Year  Time\n"
         " 1  Halo   Beyoncé  I Am… Sasha Fierce  Pop    2008  4:22\n"
         "\n"
         "songs 1-1 of 1\n"},
        {{"search", "nothing\x1b"}, "no songs with 'nothing␛'\n"},
        {{"browse", "artist", "--page-size", "2"},
         "Artist\n"
         "AC/DC\n"
         "AC\\DC\n"
         "\n"
         "artists 1-2 of 4 (page 1 of 2; next: vorelix browse artist --page-size 2 --page 2)\n"},
        {{"browse", "genre", "--desc"}, "Genre\nPop\nÉlectro\n(unknown)\n\ngenres 1-3 of 3\n"},
        {{"browse", "album", "--search", "sasha"},
         "Album\nI Am… Sasha Fierce\n\nalbums 1-1 of 1\n"},
        {{"browse", "album", "--search", "none"}, "no albums with 'none'\n"},
        {{"show", "1"},
         "ID        1\n"
         "Title     Halo\n"
         "Artist    Beyoncé\n"
         "Album     I Am… Sasha Fierce\n"
         "Genre     Pop\n"
         "Year      2008\n"
         "Track     5\n"
         "Disc      1\n"
         "Time      4:22\n"
         "Bit rate  320 kbit/s\n"
         "Frequency 44.1 kHz\n"
         "Path      /music/Halo.mp3\n"},
        {{"count"}, "4\n"},
        {{"count", "ac", "--in", "artist"}, "2\n"},
    };
    for (const auto &[words, out] : cases) {
        EXPECT_EQ(says(words), out);
    }
}

TEST_F(CommandLine, DocumentsForPrograms) {
    fill(library());
    const std::pair<Words, const char *> cases[] = {
        {{"list", "--sort", "added", "--offset", "1", "--limit", "1"},
         R"({"limit":1,"offset":1,"songs":[{"album":"幾何学模様","artist":"YMO","bitrate":0,)"
         R"("disc":0,"duration":3723.0,"frequency":0,"genre":"Électro","id":2,)"
         R"("path":"/music/音楽.flac","title":"音楽","track":0,"year":1981}],"total":4})"},
        {{"search", "nothing"}, R"({"limit":50,"offset":0,"songs":[],"total":0})"},
        {{"browse", "genre"},
         R"({"column":"genre","limit":50,"offset":0,"total":3,"values":["","Électro","Pop"]})"},
        {{"count", "halo"}, R"({"total":1})"},
    };
    for (const auto &[words, document] : cases) {
        EXPECT_EQ(json::textOf(answerOf(words)), document);
    }
    const Json::Value drawn = answerOf({"random", "3"});
    EXPECT_EQ(drawn.getMemberNames(), answerOf({"list"}).getMemberNames());
    EXPECT_EQ(drawn["songs"].size(), 3U);
    EXPECT_EQ(drawn["total"], 4);

    const Json::Value shown = answerOf({"show", "4", "3", "4"});
    EXPECT_EQ(idsOf(shown), "4 3");
    EXPECT_TRUE(shown["unknown"].empty());
}

TEST_F(CommandLine, SearchTakesTheTextLiterally) {
    fill(library());
    const struct {
        std::string keyword;
        const char *in;
        const char *ids;
    } cases[] = {
        {"beyonce", "any", "1"},
        {"BEYONCÉ", "artist", "1"},
        {"beyonce", "title", ""},
        {"electro", "genre", "2"},
        {"何", "album", "2"},
        {"'", "any", "4"},
        {"don't_", "any", "4"},
        {"\\", "any", "3"},
        {"\\d", "any", "3"},
        {"%", "any", "4"},
        {"_", "any", "4"},
        {"h_lo", "any", ""},
        {"h%o", "any", ""},
        {"' or '1'='1", "any", ""},
        {std::string(10000, '\''), "any", ""},
        {std::string(10000, '%'), "any", ""},
    };
    for (const auto &row : cases) {
        const Json::Value found =
            answerOf({"search", row.keyword, "--in", row.in, "--sort", "added"});
        EXPECT_EQ(idsOf(found), row.ids) << row.keyword;
        EXPECT_EQ(found["total"].asUInt(), found["songs"].size());
        EXPECT_EQ(answerOf({"count", row.keyword, "--in", row.in})["total"], found["total"]);
    }
    EXPECT_EQ(run({{"search", "--", "--page"}}).out, "no songs with '--page'\n");
}

TEST_F(CommandLine, SortsByEveryColumn) {
    fill({song("/m/3", "É", "x", "b", "R", 1999, 30), song("/m/1", "f", "Ÿ", "A", "p", 2020, 10),
          song("/m/2", "d", "W", "Ç", "Q", 2001, 20)});
    const struct {
        const char *sort;
        const char *ascending;
        const char *descending;
    } cases[] = {
        {"title", "3 1 2", "2 1 3"}, {"artist", "3 1 2", "2 1 3"}, {"album", "2 1 3", "3 1 2"},
        {"genre", "2 3 1", "1 3 2"}, {"year", "1 3 2", "2 3 1"},   {"duration", "2 3 1", "1 3 2"},
        {"path", "2 3 1", "1 3 2"},  {"added", "1 2 3", "3 2 1"},
    };
    for (const auto &row : cases) {
        EXPECT_EQ(idsOf(answerOf({"list", "--sort", row.sort})), row.ascending) << row.sort;
        EXPECT_EQ(idsOf(answerOf({"list", "--desc", "--sort", row.sort})), row.descending)
            << row.sort;
    }
    std::string drawn = idsOf(answerOf({"list", "--sort", "random"}));
    std::sort(drawn.begin(), drawn.end());
    EXPECT_EQ(drawn, "  123");
}

TEST_F(CommandLine, PagesAtTheEnds) {
    std::vector<Song> songs;
    for (int i = 1; i <= 101; ++i) {
        songs.push_back(song(("/m/" + std::to_string(i)).c_str(), std::to_string(1000 + i)));
    }
    songs[99].title += " --page it's \x1b";
    songs[100].title += " --page it's \x1b";
    fill(songs);
    const std::pair<Words, const char *> cases[] = {
        {{"list", "--desc", "--page=2"},
         "songs 51-100 of 101 (page 2 of 3; next: vorelix list --desc --page 3)"},
        {{"list", "--page", "3"}, "songs 101-101 of 101 (page 3 of 3)"},
        {{"list", "--page", "4"}, "no songs here: there are 101 in all, on pages 1 to 3"},
        {{"list", "--page-size", "101"}, "songs 1-101 of 101"},
        {{"search", "10", "--page-size", "100"},
         "songs 1-100 of 101 (page 1 of 2; next: vorelix search 10 --page-size 100 --page 2)"},
        {{"list", "--offset", "100"}, "songs 101-101 of 101"},
        {{"list", "--offset", "3", "--limit", "2"},
         "songs 4-5 of 101 (next: vorelix list --limit 2 --offset 5)"},
        {{"search", "--page-size", "1", "--", "--page it's \x1b"},
         "songs 1-1 of 2 (page 1 of 2; next: vorelix search --page-size 1 --page 2 -- "
         "'--page it'\\''s ␛')"},
        {{"list", "--offset", "2147483647"}, "no songs here: there are 101 in all"},
        {{"random", "5"}, "5 of 101 songs, by chance"},
    };
    for (const auto &[words, last] : cases) {
        EXPECT_TRUE(("\n" + says(words)).ends_with("\n" + std::string(last) + "\n")) << last;
    }
    const Json::Value beyond = answerOf({"list", "--page", "4"});
    EXPECT_TRUE(beyond["songs"].isArray() && beyond["songs"].empty());
    EXPECT_EQ(beyond["offset"], 150);
}

TEST_F(CommandLine, EmptyLibrary) {
    fill({});
    EXPECT_EQ(says({"list"}), "no songs yet; index a folder: zanoindex FOLDER\n");
    EXPECT_EQ(says({"browse", "album"}), "no albums yet; index a folder: zanoindex FOLDER\n");
    EXPECT_EQ(says({"random", "3"}), "no songs yet; index a folder: zanoindex FOLDER\n");
}

TEST_F(CommandLine, FailuresSayWhatToDo) {
    const std::vector<Words> commands = {{"list"},      {"search", "x"}, {"browse", "artist"},
                                         {"show", "1"}, {"count"},       {"random", "1"}};
    const auto expectFailures = [&](const char *advice) {
        for (const auto &arguments : commands) {
            const std::string error = fails(arguments);
            EXPECT_TRUE(error.starts_with("vorelix: could not ")) << error;
            EXPECT_TRUE(contains(error, advice));
            EXPECT_FALSE(contains(error, "musiclib.cpp")) << error;
        }
    };
    expectFailures("; index a folder first: zanoindex FOLDER\n");
    files::write(database_, "not a database, but long enough to be looked at as if it were one");
    expectFailures("not a database");
    EXPECT_TRUE(contains(run({{"list", "--verbose"}}).err, "Failed to open media database"));
}

TEST_F(CommandLine, UnknownIdsAreNamed) {
    fill(library());
    const Ended ended = run({{"show", "9", "1", "2147483647", "9", "--json"}});
    EXPECT_EQ(ended.status, 1);
    EXPECT_EQ(ended.err,
              "vorelix: no song has the id 9, 2147483647; the listings show the ids that exist\n");
    EXPECT_TRUE(contains(ended.out, "\"title\" : \"Halo\""));
}

TEST_F(CommandLine, BadUsageIsExplained) {
    const std::pair<Words, const char *> cases[] = {
        {{}, "command"},
        {{"dance"}, "dance"},
        {{"list", "--sort", "colour"}, "colour"},
        {{"list", "--page", "0"}, "'0' is not a whole number from 1"},
        {{"list", "--page", "1x"}, "'1x'"},
        {{"list", "--page", " 1"}, "' 1'"},
        {{"list", "--page", "0x10"}, "'0x10'"},
        {{"list", "--page", "99999999999"}, "'99999999999'"},
        {{"list", "--page", "2147483647"}, "beyond"},
        {{"list", "--page-size", "10001"}, "10000"},
        {{"list", "--page", "2", "--offset", "5"}, "excludes"},
        {{"list", "extra"}, "extra"},
        {{"search"}, "KEYWORD"},
        {{"search", ""}, "empty"},
        {{"search", "\xff"}, "UTF-8"},
        {{"search", "two", "words"}, "words"},
        {{"search", "x", "--in", "lyrics"}, "lyrics"},
        {{"browse", "title"}, "title"},
        {{"show"}, "ID"},
        {{"show", "1", "two\x1b"}, "'two␛'"},
        {{"show", "0"}, "'0'"},
        {{"show", "1,2"}, "'1,2'"},
        {{"random", "-1"}, "-1"},
        {{"playlist"}, "command"},
        {{"playlist", "play"}, "play"},
        {{"playlist", "append", "p"}, "ID or --path"},
        {{"playlist", "append", "p", "0"}, "'0'"},
        {{"playlist", "remove", "p"}, "POSITION"},
        {{"playlist", "remove", "p", "0"}, "'0'"},
        {{"playlist", "remove", "p", "7-3"}, "'7-3'"},
        {{"playlist", "remove", "p", "end-3"}, "'end-3'"},
        {{"playlist", "remove", "p", "3-"}, "'3-'"},
        {{"playlist", "move", "p", "1"}, "2"},
        {{"playlist", "move", "p", "1", "2-3"}, "'2-3'"},
        {{"playlist", "insert", "p", "1-2", "1"}, "'1-2'"},
        {{"playlist", "export", "p", "--to", "x.m3u8"}, "x.m3u8"},
        {{"playlist", "create", "p", "--form", "m3u8"}, "m3u8"},
        {{"playlist", "create", "p", "--form", "pls", "--dir", "/"}, "are m3u files"},
        {{"playlist", "show", "p", "--wait", "1"}, "--wait"},
        {{"keys", "set", "1"}, "--title"},
        {{"keys", "set", "1", "--title", "\xff"}, "UTF-8"},
        {{"keys", "get", "5"}, "5"},
        {{"db", "copy", "x"}, "TO"},
        {{"users", "set", "ann"}, "RIGHT is required"},
        {{"users", "set", "ann", "everything"},
         "RIGHT: everything not in {usb,streaming,playlist,upnp,editsong,all,none}"},
    };
    for (const auto &[words, named] : cases) {
        const std::string error = fails(words, 2);
        EXPECT_TRUE(contains(error, named));
        EXPECT_TRUE(error.ends_with(" --help\n")) << error;
    }
    EXPECT_EQ(run({{"list", "--page", "010", "--page-size", "1"}}).status, 1);  // ten, no database
    EXPECT_EQ(run({{"--help"}}).status, 0);
    EXPECT_EQ(run({{"list", "--help"}}).status, 0);
    EXPECT_EQ(run({{"--version"}}).out, "vorelix " VORELIX_VERSION "\n");
}

TEST_F(CommandLine, FitsTheTerminal) {
    fill(library());
    Invocation invocation = {
        .arguments = {"browse", "album"}, .output = Output::Terminal, .columns = 9};
    const std::string rest = "(unknown)\r\nI Am… Sa…\r\n幾何学模…\r\n\r\nalbums 1-3 of 3\r\n";
    EXPECT_EQ(run(invocation).out, "\x1b[1mAlbum\x1b[0m\r\n" + rest);
    invocation.environment = {{"NO_COLOR", "1"}, {"COLUMNS", "70"}};
    EXPECT_EQ(run(invocation).out, "Album\r\n" + rest) << "the terminal knows its own width";
    invocation.environment["COLUMNS"] = "9";
    invocation.columns = 0;
    EXPECT_EQ(run(invocation).out, "Album\r\n" + rest);
    invocation.output = Output::Kept;
    EXPECT_NE(run(invocation).out.find("\nI Am… Sa…\n"), std::string::npos);
}

TEST_F(CommandLine, OutputThatNobodyTakes) {
    fill(library());
    const Ended closed = run({.arguments = {"list"}, .output = Output::ClosedPipe});
    EXPECT_EQ(closed.status, 128 + SIGPIPE);
    EXPECT_EQ(closed.err, "");
    const Ended full = run({.arguments = {"list"}, .output = Output::Full});
    EXPECT_EQ(full.status, 1);
    EXPECT_EQ(full.err, "vorelix: could not write the answer: No space left on device\n");
}

}  // namespace
}  // namespace command_line
