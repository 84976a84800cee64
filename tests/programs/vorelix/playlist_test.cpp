#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <csignal>
#include <fstream>
#include <random>
#include <thread>

#include "command_line.h"
#include "system_paths_internal.h"

namespace command_line {
namespace {

namespace fs = std::filesystem;
using Words = std::vector<std::string>;

/* Songs a, b, ... below the music root, with the ids 1, 2, ... */
class Playlists : public CommandLine {
  protected:
    Playlists() : music_(folder_ / "music"), folderOfShared_(music_ / "playlists") {
        fs::create_directories(music_);
        fs::create_directory_symlink(music_, ZANO_PATH_MUSIC_LINK);
        std::vector<zano::mediadb::Song> songs;
        for (char letter = 'a'; letter <= 'j'; ++letter) {
            zano::mediadb::Song song;
            song.path = music_ / (std::string(1, letter) + ".mp3");
            song.title = letter;
            songs.push_back(song);
        }
        fill(songs);
    }

    /* What is printed on standard output; the command has to succeed. */
    static std::string says(Words arguments, const std::string &input = "") {
        arguments.insert(arguments.begin(), "playlist");
        const Ended ended = run({.arguments = arguments, .input = input});
        EXPECT_EQ(ended.err, "");
        EXPECT_EQ(ended.status, 0);
        return ended.out;
    }

    /* The error of a command that has to fail. */
    static std::string fails(Words arguments, int status = 1) {
        arguments.insert(arguments.begin(), "playlist");
        const Ended ended = run({arguments});
        EXPECT_EQ(ended.status, status) << ended.out << ended.err;
        EXPECT_EQ(ended.err.find("vorelix: "), 0U) << ended.err;
        return ended.err;
    }

    /* The titles of the entries, their paths where they have none, in one text. */
    static std::string entriesOf(Words words) {
        words.insert(words.begin(), {"playlist", "show", "--limit", "10000"});
        std::string titles;
        const Json::Value answer = answerOf(words);
        for (const Json::Value &entry : answer["entries"]) {
            const bool isTitled = entry["title"] != "";
            titles += entry[isTitled ? "title" : "path"].asString() + (isTitled ? "" : " ");
        }
        return titles;
    }

    /* A playlist of so many songs, too long to be written in no time. */
    fs::path makeLong(int count) const {
        std::string ids;
        for (int i = 0; i < count; ++i) {
            ids += std::to_string(i % 10 + 1) + "\n";
        }
        says({"create", "long", "-"}, ids);
        return folderOfShared_ / "long.m3u";
    }

    std::ptrdiff_t filesOfShared() const { return files::countIn(folderOfShared_); }

    const files::Places places_{ZANO_PATH_MUSIC_LINK};
    fs::path music_;
    fs::path folderOfShared_;
};

TEST_F(Playlists, AreMadeEditedAndWrittenInEachForm) {
    const std::string file = folderOfShared_ / "Été.m3u";
    EXPECT_EQ(says({"create", "Été", "1", "2"}),
              "made 'Été' (playlist 1) with 2 entries: " + file + "\n");
    const struct {
        Words arguments;
        const char *out;  // up to the name
        const char *entries;
    } edits[] = {
        {{"append", "1", "3", "1"}, "appended 2 entries to", "abca"},
        {{"append", "été", "-"}, "appended 2 entries to", "abcade"},
        {{"insert", "1", "1", "6"}, "inserted 1 entry into", "fabcade"},
        {{"insert", "1", "end", "7", "8"}, "inserted 2 entries into", "fabcadegh"},
        {{"insert", "1", "10", "9"}, "inserted 1 entry into", "fabcadeghi"},
        {{"move", "1", "1", "3"}, "moved 1 entry in", "abfcadeghi"},
        {{"move", "1", "9-end", "2", "1"}, "moved 3 entries in", "hibafcadeg"},
        {{"move", "1", "1-2", "end"}, "moved 2 entries in", "bafcadeghi"},
        {{"remove", file, "2-3", "end", "2"}, nullptr, "bcadegh"},
    };
    for (const auto &edit : edits) {
        const std::string out = says(edit.arguments, "4,\n5");
        if (edit.out != nullptr) {
            EXPECT_EQ(out, std::string(edit.out) + " 'Été' (playlist 1), which has " +
                               std::to_string(std::string(edit.entries).size()) + " now\n");
        }
        EXPECT_EQ(entriesOf({"1"}), edit.entries);
    }
    EXPECT_EQ(files::read(file),
              "#EXTM3U\r\n../b.mp3\r\n../c.mp3\r\n../a.mp3\r\n../d.mp3\r\n../e.mp3\r\n"
              "../g.mp3\r\n../h.mp3\r\n");
    says({"remove", "1", "4-end"});
    const std::pair<std::string, const char *> exports[] = {
        {"x.M3U", "#EXTM3U\r\nmusic/b.mp3\r\n"},
        {"x.pls", "[playlist]\r\nFile1=music/b.mp3\r\n"},
        {"x.wpl", "<?wpl version=\"1.0\"?>\r\n"},
    };
    for (const auto &[name, start] : exports) {
        const std::string target = folder_ / name;
        says({"export", "Été", "--to", target});
        EXPECT_TRUE(files::read(target).starts_with(start)) << name;
        EXPECT_NE(fails({"export", "1", "--to", target}).find("--force"), std::string::npos);
        const std::string form = fs::path(target).extension() == ".wpl" ? "pls" : "wpl";
        const std::string out = says({"import", target, "--name", name, "--form", form});
        EXPECT_EQ(out.substr(out.find(" with ")),
                  " with 3 entries, 3 of them in the media database: " +
                      (folderOfShared_ / name).string() + "." + form + "\n");
        EXPECT_EQ(says({"append", name, "4"}).find("appended 1 entry"), 0U);
        EXPECT_EQ(entriesOf({name}), "bcad");
        says({"delete", name});
        EXPECT_EQ(answerOf({"playlist", "list"})["total"], 1);
    }
    EXPECT_EQ(filesOfShared(), 1);
}

TEST_F(Playlists, WhatChangesNothingSaysSo) {
    says({"create", "p", "1", "2"});
    const fs::path file = folderOfShared_ / "p.m3u";
    fs::permissions(file, fs::perms(0640));
    const fs::file_time_type before = fs::last_write_time(file);
    for (const Words &words :
         {Words{"append", "p", "-"}, Words{"move", "p", "2", "2"}, Words{"prune", "p"}}) {
        EXPECT_EQ(says(words), "'p' (playlist 1) is unchanged: it has 2\n");
        Words forPrograms = words;
        forPrograms.insert(forPrograms.begin(), "playlist");
        EXPECT_EQ(answerOf(forPrograms)["changed"], false);
    }
    EXPECT_EQ(fs::last_write_time(file), before);
    says({"append", "p", "3"});
    EXPECT_EQ(fs::status(file).permissions(), fs::perms(0640));
}

/* Web addresses, files that are not indexed, and files that are not there. */
TEST_F(Playlists, EntriesOutsideOfTheDatabase) {
    std::ofstream(music_ / "z.mp3");
    std::ofstream(music_ / "line\nbreak.mp3");
    fs::create_directory(music_ / "play");  // with which the name of the folder playlists begins
    std::ofstream(music_ / "play/y.mp3");
    says({"create", "p", "1", "--path", "https://r/1", "--path", music_ / "z.mp3", "--path",
          music_ / "play/y.mp3"});
    const fs::path file = folderOfShared_ / "p.m3u";
    std::ofstream(file, std::ios::app) << "#EXTINF:5,Gone\r\n../gone.mp3\r\nhttp://r/2\r\n";
    const std::string own =
        "https://r/1 " + (music_ / "z.mp3").string() + " " + (music_ / "play/y.mp3").string() + " ";
    EXPECT_EQ(entriesOf({"p"}), "a" + own + "Gonehttp://r/2 ");
    const std::string contents = files::read(file);
    EXPECT_NE(fails({"append", "p", "--path", music_ / "line\nbreak.mp3"}).find("cannot stand in"),
              std::string::npos);
    EXPECT_NE(fails({"append", "p", "2", "--path", "nowhere.mp3"}).find("nowhere.mp3"),
              std::string::npos);
    EXPECT_NE(fails({"append", "p", "2", "99", "98"}).find("no song has the id 99, 98"),
              std::string::npos);
    EXPECT_EQ(files::read(file), contents);
    EXPECT_NE(says({"prune", "p"}).find("removed 1 entry from 'p'"), std::string::npos);
    EXPECT_EQ(entriesOf({"p"}), "a" + own + "http://r/2 ");

    std::ofstream(folder_ / "theirs.m3u") << "D:\\Alben\\a.mp3\nE:\\later.mp3\nhere.mp3\n";
    EXPECT_EQ(answerOf({"playlist", "import", folder_ / "theirs.m3u"})["known"], 1);
    EXPECT_EQ(files::read(folderOfShared_ / "theirs.m3u"),
              "#EXTM3U\r\n../a.mp3\r\nE:\\later.mp3\r\n../../here.mp3\r\n");
}

TEST_F(Playlists, PersonalOnesStandInAFolder) {
    const std::string home = folder_ / "home [a]*";
    fs::create_directory(home);
    EXPECT_EQ(says({"list", "--dir", home}),
              "no playlists yet; make one: vorelix playlist create NAME ID...\n");
    EXPECT_EQ(answerOf({"playlist", "create", "two", "2", "--dir", home + "/"})["playlist"]["id"],
              1);
    says({"create", "one", "1", "--dir", home});
    EXPECT_EQ(entriesOf({home + "/playlists/two.m3u", "--dir", home + "/."}), "b");
    says({"append", "1", "3", "--dir", home});
    EXPECT_EQ(entriesOf({"one", "--dir", home}), "ac");
    const Json::Value page = answerOf({"playlist", "list", "--dir", home, "--offset", "1"});
    EXPECT_EQ(page["playlists"][0]["id"], 2);
    EXPECT_EQ(page["playlists"][0]["title"], "two");
    EXPECT_EQ(page["total"], 2);
    EXPECT_EQ(answerOf({"playlist", "list"})["total"], 0) << "they have no rows";
    says({"delete", "2", "--dir", home});
    EXPECT_FALSE(fs::exists(fs::path(home) / "playlists/two.m3u"));
    fails({"create", "three", "--dir", home, "--form", "pls"}, 2);
    fails({"list", "--dir", folder_ / "nobody"});
}

TEST_F(Playlists, OneIsMeantOrNone) {
    says({"create", "Mix", "1"});
    says({"create", "mix", "2"});
    says({"create", "2", "3"});
    EXPECT_EQ(entriesOf({"mix"}), "b");
    EXPECT_EQ(entriesOf({"1"}), "a");
    for (const char *name : {"MIX", "2"}) {
        EXPECT_NE(fails({"show", name}).find("several playlists"), std::string::npos) << name;
    }
    for (const char *name : {"M_x", "7", "/nowhere.m3u"}) {
        EXPECT_NE(fails({"delete", name}).find("there is no playlist"), std::string::npos) << name;
    }
    fails({"delete", music_ / "playlists/../a.mp3"});
    EXPECT_NE(fails({"create", "mix"}).find("--force"), std::string::npos);
    says({"create", "mix", "--force"});
    EXPECT_EQ(answerOf({"playlist", "show", "mix"})["playlist"]["id"], 2);
    fs::remove(folderOfShared_ / "mix.m3u");
    EXPECT_NE(fails({"append", "mix", "1"}).find("No such file"), std::string::npos);
    says({"delete", "mix"});
    EXPECT_EQ(answerOf({"playlist", "list"})["total"], 2);
    for (const char *name : {"a/b", ".a", "a\nb", "\xff"}) {
        fails({"create", name});
    }
    EXPECT_EQ(filesOfShared(), 2);
}

TEST_F(Playlists, BadUsageIsExplained) {
    const struct {
        Words arguments;
        const char *named;
    } cases[] = {
        {{}, "command"},
        {{"play"}, "play"},
        {{"append", "p"}, "ID or --path"},
        {{"append", "p", "0"}, "'0'"},
        {{"remove", "p"}, "POSITION"},
        {{"remove", "p", "0"}, "'0'"},
        {{"remove", "p", "7-3"}, "'7-3'"},
        {{"remove", "p", "end-3"}, "'end-3'"},
        {{"remove", "p", "3-"}, "'3-'"},
        {{"move", "p", "1"}, "2"},
        {{"move", "p", "1", "2-3"}, "'2-3'"},
        {{"insert", "p", "1-2", "1"}, "'1-2'"},
        {{"export", "p", "--to", "x.m3u8"}, "x.m3u8"},
        {{"create", "p", "--form", "m3u8"}, "m3u8"},
        {{"show", "p", "--wait", "1"}, "--wait"},
    };
    for (const auto &row : cases) {
        const std::string error = fails(row.arguments, 2);
        EXPECT_NE(error.find(row.named), std::string::npos) << error;
        EXPECT_NE(error.find("see vorelix playlist"), std::string::npos) << error;
    }
}

TEST_F(Playlists, FilesThatAreNoPlaylistsStayAsTheyAre) {
    const struct {
        const char *name;
        const char *contents;
        const char *error;
    } cases[] = {
        {"page.m3u", "<!DOCTYPE html><html><body>404</body></html>\n", "not a playlist"},
        {"long.m3u8", "a.mp3\n", "only m3u, pls and wpl are written"},
    };
    for (const auto &row : cases) {
        const fs::path file = music_ / row.name;
        std::ofstream(file) << row.contents;
        EXPECT_NE(fails({"append", file, "1"}).find(row.error), std::string::npos) << row.name;
        EXPECT_EQ(files::read(file), row.contents);
    }
    fails({"import", music_ / "page.m3u"});
    EXPECT_EQ(says({"import", music_ / "long.m3u8"}).find("imported 'long'"), 0U);
    fs::create_directory(music_ / "links");
    fs::create_symlink(folderOfShared_ / "long.m3u", music_ / "links/long.m3u");
    EXPECT_NE(fails({"append", music_ / "links/long.m3u", "1"}).find("link"), std::string::npos);
}

TEST_F(Playlists, EditsAtOnceLoseNothing) {
    says({"create", "p"});
    process::runAtOnce(2, [](int writer) {
        int failures = 0;
        Words words = {"playlist", "append", "p", "--wait", "300"};
        words.insert(words.end(), 10, std::to_string(writer + 1));
        for (int call = 0; call < 50; ++call) {
            failures += run({words}).status == 0 ? 0 : 1;
        }
        return failures;
    });
    const std::string entries = entriesOf({"p"});
    EXPECT_EQ(std::count(entries.begin(), entries.end(), 'a'), 500);
    EXPECT_EQ(std::count(entries.begin(), entries.end(), 'b'), 500);
    EXPECT_EQ(filesOfShared(), 1);
}

TEST_F(Playlists, AKillLeavesTheOldOrTheNewOne) {
    using std::chrono::microseconds;
    const fs::path file = makeLong(1000);
    const fs::path draft = folderOfShared_ / ".long.vorelix.m3u";
    const auto begun = std::chrono::steady_clock::now();
    says({"append", "long", "1"});
    const auto whole =
        std::chrono::duration_cast<microseconds>(std::chrono::steady_clock::now() - begun);
    std::mt19937 random(4711);
    int killed = 0;
    std::string before = files::read(file);
    for (int round = 0; round < 50; ++round) {
        const pid_t child = start({.arguments = {"playlist", "append", "long", "2"}});
        // Every other one within the edit itself, which is a small part of the whole run.
        const bool isWithin = round % 2 == 0;
        while (isWithin && !fs::exists(draft) && waitpid(child, nullptr, WNOHANG | WNOWAIT) == 0) {
        }
        const auto most = whole.count() / (isWithin ? 4 : 1);
        std::this_thread::sleep_for(microseconds(random() % static_cast<unsigned long>(most)));
        kill(child, SIGKILL);
        killed += statusOf(child) == 128 + SIGKILL ? 1 : 0;
        const std::string after = files::read(file);
        ASSERT_TRUE(after == before || after == before + "../b.mp3\r\n") << round;
        before = after;
    }
    EXPECT_GT(killed, 0);
    says({"append", "long", "3"});
    EXPECT_EQ(files::read(file), before + "../c.mp3\r\n");
    EXPECT_EQ(filesOfShared(), 1) << "what killed edits left is gone";
}

TEST_F(Playlists, AFullDiskLeavesTheOldOne) {
    const fs::path file = makeLong(10000);
    const std::string before = files::read(file);
    ASSERT_GT(before.size(), 65536U);
    for (const Words &words : {Words{"append", "long", "1"}, Words{"remove", "long", "1"},
                               Words{"export", "long", "--to", folder_ / "x.wpl"},
                               Words{"import", file, "--name", "other", "--form", "pls"}}) {
        Invocation invocation{.arguments = words, .fileSizeLimit = 65536};
        invocation.arguments.insert(invocation.arguments.begin(), "playlist");
        const Ended ended = run(invocation);
        EXPECT_EQ(ended.status, 1);
        EXPECT_NE(ended.err.find("File too large; it is as it was"), std::string::npos)
            << ended.err;
        EXPECT_EQ(files::read(file), before);
    }
    EXPECT_EQ(filesOfShared(), 1);
    EXPECT_FALSE(fs::exists(folder_ / "x.wpl"));
    EXPECT_EQ(answerOf({"playlist", "list"})["total"], 1);
}

TEST_F(Playlists, AnEditWaitsForAnother) {
    says({"create", "p", "1"});
    const std::string before = files::read(folderOfShared_ / "p.m3u");
    const fs::path draft = folderOfShared_ / ".p.vorelix.m3u";
    const int other = open(draft.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0666);
    struct flock lock {};
    lock.l_type = F_WRLCK;
    ASSERT_EQ(fcntl(other, F_OFD_SETLK, &lock), 0);
    for (const Words &words :
         {Words{"append", "p", "2"}, Words{"delete", "p"}, Words{"create", "p", "--force"}}) {
        Words atOnce = words;
        atOnce.insert(atOnce.end(), {"--wait", "0"});
        EXPECT_NE(fails(atOnce).find("another vorelix is changing it"), std::string::npos);
        EXPECT_EQ(files::read(folderOfShared_ / "p.m3u"), before);
    }
    const pid_t waiting = start({.arguments = {"playlist", "append", "p", "2", "--wait", "300"}});
    close(other);
    EXPECT_EQ(statusOf(waiting), 0);
    EXPECT_EQ(entriesOf({"p"}), "ab");
    EXPECT_EQ(filesOfShared(), 1);
}

}  // namespace
}  // namespace command_line
