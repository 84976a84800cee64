#include <sys/stat.h>
#include <algorithm>

#include "index_test.h"

namespace zano::index {
namespace {

class ScanTest : public IndexTest {
  protected:
    /* The bytes of all files of the database. */
    std::string databaseContent() const {
        std::string content;
        for (const char *suffix : {"", "-wal"}) {
            content += files::read(databaseFile() + suffix);
        }
        return content;
    }

    void addMany(const std::string &name, int count) const {
        for (int i = 0; i < count; ++i) {
            add(name + "/" + std::to_string(i) + ".ogg", "ogg");
        }
    }
};

TEST_F(ScanTest, ChangedFilesAreReadAgain) {
    addMany("a", 4);
    run({music()});
    const fs::path path = music() + "/a/1.ogg";
    const auto time = fs::last_write_time(path);

    files::write(path, files::read(sample("flac")));  // another size
    EXPECT_EQ(summaryOf({music()})["updated"], 1);
    fs::last_write_time(path, time + std::chrono::nanoseconds(1));
    EXPECT_EQ(summaryOf({music()})["updated"], 1);
    // only the change time is another, as after a tag editor that keeps the other two
    auto content = files::read(path);
    const auto at = content.find("Älbum");
    ASSERT_NE(at, std::string::npos);
    const auto kept = fs::last_write_time(path);
    files::write(path, content.replace(at, 6, "Album2"));
    fs::last_write_time(path, kept);
    EXPECT_EQ(counts(summaryOf({music()})), "updated 1, unchanged 3");
    EXPECT_EQ(counts(summaryOf({"--reread", music()})), "updated 4");
    EXPECT_EQ(paths().size(), 4U);
}

TEST_F(ScanTest, RowsOfVanishedFilesGo) {
    addMany("a", 3);
    add("b/x.mp3");
    run({music()});
    fs::remove(music() + "/a/0.ogg");
    fs::rename(music() + "/b", music() + "/c");
    // half of them is not more than half
    EXPECT_EQ(counts(summaryOf({music()})), "added 1, unchanged 2, removed 2");
    EXPECT_EQ(paths().back(), "c/x.mp3");
    // other folders than the scanned one are left alone
    fs::remove(music() + "/c/x.mp3");
    EXPECT_EQ(counts(summaryOf({music() + "/a"})), "unchanged 2");
    EXPECT_EQ(paths().size(), 3U);
}

TEST_F(ScanTest, FolderThatLostItsSongsKeepsItsRows) {
    const struct {
        const char *what;
        int left;  // files; -1: not the folder either
        const char *reason;
    } cases[] = {
        {"missing", -1, "it is missing"},
        {"empty", 0, "it holds no audio files any more"},
        {"half", 2, "more than half of its songs are gone (3 of 5 songs)"},
    };
    for (const auto &[what, left, reason] : cases) {
        SCOPED_TRACE(what);
        const auto folder = music() + "/" + what;
        addMany(what, 5);
        addMany("other", 2);
        run({music()});
        fs::remove_all(folder);
        if (left >= 0) {
            fs::create_directory(folder);
            addMany(what, left);
        }
        fs::remove(music() + "/other/0.ogg");

        const auto error = failsAt({folder, music() + "/other"});
        EXPECT_TRUE(contains(error, folder + ": " + reason));
        EXPECT_TRUE(contains(error, "--prune"));
        EXPECT_EQ(paths().size(), 6U) << "the other folder was cleaned up";

        const auto summary = summaryOf({"--prune", folder});
        EXPECT_EQ(summary["removed"].asInt(), 5 - std::max(left, 0));
        fs::remove_all(music());
        fs::create_directory(music());
        summaryOf({"--prune", music()});
        EXPECT_EQ(paths(), Lines());
    }
}

TEST_F(ScanTest, PlaylistsAreListedWhileTheirFilesAreThere) {
    addMany("a", 3);
    add("a/.hidden.mp3");
    files::write(music() + "/a/notes.txt", "no music");
    fs::create_directories(music() + "/playlists");
    fs::create_directories(music() + "/b");
    for (const char *name : {"a/x.m3u", "playlists/S\u00F6mmer.M3U8", "playlists/caf\xE9.pls",
                             "playlists/.hidden.m3u", "playlists/m3u", "b/only.wpl"}) {
        files::write(music() + "/" + name, "0.ogg\n");
    }
    fs::create_symlink(music() + "/a/x.m3u", music() + "/playlists/link.m3u");
    const Lines all = {
        "a/x.m3u|x|a", "b/only.wpl|only|b", "playlists/S\u00F6mmer.M3U8|S\u00F6mmer|playlists",
        "playlists/caf\xE9.pls|caf\u00E9|playlists", "playlists/link.m3u|link|playlists"};
    auto summary = summaryOf({music()});
    EXPECT_EQ(summary["playlistsAdded"], 5);
    EXPECT_EQ(summary["files"], 3);
    EXPECT_EQ(playlists(), all);
    const auto before = databaseContent();
    summary = summaryOf({music()});
    EXPECT_EQ(counts(summary), "unchanged 3");
    EXPECT_EQ(summary["playlistsAdded"], 0);
    EXPECT_EQ(databaseContent(), before) << "a second run touches nothing";

    fs::rename(music() + "/playlists/link.m3u", music() + "/a/link.pls");
    summary = summaryOf({music() + "/a", music() + "/playlists"});
    EXPECT_EQ(summary["playlistsAdded"], 1);
    EXPECT_EQ(summary["playlistsRemoved"], 1);

    // what is empty may be a disk that is not mounted
    fs::remove(music() + "/b/only.wpl");
    EXPECT_EQ(summaryOf({music() + "/b"})["playlistsRemoved"], 0);
    fs::rename(music() + "/a", path("elsewhere"));
    EXPECT_EQ(summaryOf({music() + "/a"}, 1)["playlistsRemoved"], 0);
    EXPECT_EQ(summaryOf({"--prune", music()})["playlistsRemoved"], 3);
    EXPECT_EQ(playlists().size(), 2U);
}

TEST_F(ScanTest, SongsBelowUnreadableFoldersAreKept) {
    addMany("open", 3);
    addMany("shut/inner", 2);
    addMany("listed", 2);
    run({music()});
    const auto shut = music() + "/shut";
    const auto listed = music() + "/listed";
    ASSERT_EQ(chmod(shut.c_str(), 0), 0);
    ASSERT_EQ(chmod(listed.c_str(), 0400), 0);  // names can be read, files cannot be looked at
    auto arguments = argumentsOf({"--json", "--prune", music()});
    const auto ended =
        Process({.path = ZANOINDEX_PROGRAM, .argv = arguments, .mayReadEverything = false}).wait();
    chmod(shut.c_str(), 0700);
    chmod(listed.c_str(), 0700);
    EXPECT_EQ(ended.status, 1) << ended.err;
    EXPECT_EQ(counts(parsed(ended.out)), "unchanged 3, kept 4");
    EXPECT_TRUE(contains(ended.err, shut + ": cannot be looked at: Permission denied"));
    EXPECT_EQ(paths().size(), 7U);
}

TEST_F(ScanTest, AnyNameIsIndexedAndOpensAgain) {
    // of the longest step and path, too
    const std::string step = std::string(250, 'p') + "/";
    std::string longest = step;
    while (longest.size() + music().size() + step.size() + 8 < 4096) {
        longest += step;
    }
    Lines names = {
        "!before/x.mp3", "a b/x.mp3",      "a/x.mp3",      "a-b.mp3",       "Bj\xF6rk.mp3",
        "\xFF\xFE.mp3",  "two\nlines.mp3", "'quote\".mp3", "per%cent_.mp3", "back\\slash.mp3",
        "-d.mp3",        "trailing .mp3",  "UPPER.MP3",
    };
    names.insert(names.end(), {longest + "1.mp3", longest + "2.mp3", step + "3.mp3"});
    for (const auto &name : names) {
        add(name);
    }
    run({music()});
    auto expected = names;
    std::sort(expected.begin(), expected.end());
    auto listed = paths();
    std::sort(listed.begin(), listed.end());
    EXPECT_EQ(listed, expected);
    for (const auto &name : listed) {
        EXPECT_TRUE(fs::exists(music() + "/" + name)) << name;
    }
    EXPECT_EQ(counts(summaryOf({music()})), "unchanged 16");
}

TEST_F(ScanTest, NamesInMessagesAndJson) {
    const auto path = music() + "/\x1B[2J\xFF\n.mp3";
    files::write(path, "not music");
    const auto ended = run({"--json", music()});
    EXPECT_TRUE(contains(ended.err, music() + "/\\x1B[2J\\xFF\\n.mp3: not an audio file\n"));
    const auto failed = parsed(ended.out)["failed"][0];
    EXPECT_TRUE(failed["pathBytes"].asString().ends_with("/%1B[2J%FF%0A.mp3"));
}

TEST_F(ScanTest, LinksAndSpecialFiles) {
    add("real/x.mp3");
    fs::create_symlink(music() + "/real/x.mp3", music() + "/link.mp3");
    fs::create_symlink("nowhere.mp3", music() + "/dangling.mp3");
    fs::create_symlink("self.mp3", music() + "/self.mp3");
    fs::create_directory_symlink(music(), music() + "/real/loop");
    fs::create_directory(music() + "/folder.mp3");
    add("folder.mp3/y.mp3");
    ASSERT_EQ(mkfifo((music() + "/pipe.mp3").c_str(), 0600), 0);
    const auto ended = run({music()});
    EXPECT_EQ(ended.status, 0);
    EXPECT_EQ(paths(), (Lines{"folder.mp3/y.mp3", "link.mp3", "real/x.mp3"}));
    EXPECT_TRUE(contains(
        ended.err, "1 links to folders were not followed, the first is " + music() + "/real/loop"));
}

TEST_F(ScanTest, PathsThatAreTooLong) {
    add("x.mp3");
    // deeper than a path can say, made step by step
    const std::string step(250, 'd');
    const auto home = fs::current_path();
    fs::current_path(music());
    for (int depth = 0; depth < 20; ++depth) {
        fs::create_directory(step);
        fs::current_path(step);
    }
    fs::copy_file(sample("mp3"), "deep.mp3");
    fs::current_path(home);
    const auto summary = summaryOf({music()}, 1);
    EXPECT_EQ(paths(), Lines{"x.mp3"});
    EXPECT_TRUE(contains(summary["folders"][0]["reason"].asString(), "File name too long"));
}

TEST_F(ScanTest, FoldersAreGivenInAnyForm) {
    addMany("a/b", 2);
    addMany("c", 1);
    fs::create_directory_symlink(music(), path("link"));
    const auto link = path("link");
    EXPECT_EQ(summaryOf({link + "/a/../a//", music() + "/a/b", music(), music() + "/"})["added"],
              3);
    EXPECT_EQ(paths(), (Lines{"a/b/0.ogg", "a/b/1.ogg", "c/0.ogg"}));
    EXPECT_EQ(summaryOf({music() + "/c/0.ogg"})["unchanged"], 1) << "a single file";
}

TEST_F(ScanTest, Notices) {
    addMany("a", 2);
    run({music()});
    const auto song = music() + "/a/0.ogg";
    const auto other = music() + "/a/1.ogg";
    const auto moved = music() + "/moved.ogg";
    const auto fresh = add("new.ogg", "ogg");
    fs::rename(other, moved);
    fs::remove(song);
    const auto engine = this->engine();
    engine->addNotice({0, "/lists/a.m3u", "", 1});
    engine->addNotice({0, fresh, "", 1});
    engine->addNotice({0, song, "", 5});  // gone, but nobody said so
    engine->addNotice({0, moved, other, 4});
    const auto ended = run({"--notices"});
    EXPECT_EQ(ended.status, 0) << ended.err;
    EXPECT_EQ(ended.out.substr(0, ended.out.rfind('\n', ended.out.size() - 2) + 1),
              "playlist /lists/a.m3u was added\nsong " + fresh + " was added\nsong " + song +
                  " was changed\nsong " + moved + " was changed and moved from " + other + "\n");
    EXPECT_EQ(paths(), (Lines{"a/0.ogg", "moved.ogg", "new.ogg"}));
    engine->addNotice({0, song, "", 2});
    EXPECT_EQ(summaryOf({"--notices"})["notices"].size(), 1U);
    EXPECT_EQ(paths(), (Lines{"moved.ogg", "new.ogg"}));
    EXPECT_EQ(summaryOf({"--notices"})["notices"].size(), 0U) << "each is worked off once";
}

TEST_F(ScanTest, Usage) {
    for (const Lines &arguments :
         {Lines{}, Lines{"--unknown", "x"}, Lines{"-j", "0", "x"}, Lines{"-j", "many", "x"},
          Lines{"--watch"}, Lines{""}, Lines{"-d"}, Lines{"-d", ""}, Lines{"-d", "x", "y"},
          Lines{"-d", "x", "--notices"}, Lines{"--database"}}) {
        const auto ended = run(arguments);
        EXPECT_EQ(ended.status, 2) << testing::PrintToString(arguments);
        EXPECT_EQ(ended.out, "");
        EXPECT_NE(ended.err, "");
    }
    EXPECT_FALSE(fs::exists(databaseFile()));
    EXPECT_TRUE(contains(run({"--help"}).out, "--prune"));
    EXPECT_TRUE(run({"--version"}).out.starts_with("zanoindex "));
}

TEST_F(ScanTest, DatabaseThatCannotBeUsed) {
    add("x.mp3");
    files::write(databaseFile(), "this is not a database, but it is somebody's file\n");
    const auto before = files::read(databaseFile());
    EXPECT_TRUE(contains(failsAt({music()}), databaseFile()));
    EXPECT_EQ(files::read(databaseFile()), before);
    const program::Start unknown{ZANOINDEX_PROGRAM, {"zanoindex", "--database", "x:y", music()}};
    EXPECT_EQ(Process(unknown).wait().status, 1);
}

TEST_F(ScanTest, SeveralAtOnce) {
    for (const char *folder : {"a", "b", "c"}) {
        addMany(folder, 30);
    }
    std::vector<std::unique_ptr<Process>> programs;
    for (const char *folder : {"/a", "/b", "/c", "", ""}) {
        programs.push_back(std::make_unique<Process>(
            program::Start{ZANOINDEX_PROGRAM, argumentsOf({music() + folder})}));
    }
    for (const auto &program : programs) {
        const auto ended = program->wait();
        EXPECT_EQ(ended.status, 0) << ended.err;
    }
    EXPECT_EQ(paths().size(), 90U);
    EXPECT_NO_THROW(mediadb::openCatalogue(location())->check());
}

TEST_F(ScanTest, OutputAndItsLack) {
    add("x.mp3");
    const auto full = Process({.path = ZANOINDEX_PROGRAM,
                               .argv = argumentsOf({music()}),
                               .output = program::Stream::Full})
                          .wait();
    EXPECT_EQ(full.status, 1);
    EXPECT_TRUE(contains(full.err, "standard output: No space left"));
    const auto quiet = run({"-q", music()});
    EXPECT_EQ(quiet.out + quiet.err, "");
    EXPECT_EQ(paths(), Lines{"x.mp3"});
    EXPECT_TRUE(contains(failsAt({music() + "/nowhere"}), "/nowhere: No such file or directory"));
}

}  // namespace
}  // namespace zano::index
