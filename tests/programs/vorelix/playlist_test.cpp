#include <fstream>

#include "command_line.h"

namespace command_line {
namespace {

namespace fs = std::filesystem;

/* Songs a, b, ... below the music root, with the ids 1, 2, ... */
class Playlists : public CommandLine {
  protected:
    Playlists() : CommandLine({"playlist"}) {
        fs::create_directories(music_);
        fs::create_directory_symlink(music_, ZANO_PATH_MUSIC_LINK);
        fillWithLetters(10, music_);
    }

    /* The titles of the entries, their paths where they have none, in one text. */
    std::string entriesOf(Words words) const {
        words.insert(words.begin(), "show");
        std::string titles;
        const Json::Value answer = answerOf(words);
        for (const Json::Value &entry : answer["entries"]) {
            const bool isTitled = entry["title"] != "";
            titles += entry[isTitled ? "title" : "path"].asString() + (isTitled ? "" : " ");
        }
        return titles;
    }

    const files::Places places_{ZANO_PATH_MUSIC_LINK};
    const fs::path music_ = folder_ / "music";
    const fs::path shared_ = music_ / "playlists";
};

TEST_F(Playlists, AreMadeEditedAndWrittenInEachForm) {
    const std::string file = shared_ / "Été.m3u";
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
        EXPECT_TRUE(contains(fails({"export", "1", "--to", target}), "--force"));
        const std::string form = fs::path(target).extension() == ".wpl" ? "pls" : "wpl";
        const std::string out = says({"import", target, "--name", name, "--form", form});
        EXPECT_EQ(out.substr(out.find(" with ")),
                  " with 3 entries, 3 of them in the media database: " + (shared_ / name).string() +
                      "." + form + "\n");
        EXPECT_EQ(says({"append", name, "4"}).find("appended 1 entry"), 0U);
        EXPECT_EQ(entriesOf({name}), "bcad");
        says({"delete", name});
        EXPECT_EQ(answerOf({"list"})["total"], 1);
    }
    EXPECT_EQ(files::countIn(shared_), 1);
}

TEST_F(Playlists, WhatChangesNothingSaysSo) {
    says({"create", "p", "1", "2"});
    const fs::path file = shared_ / "p.m3u";
    fs::permissions(file, fs::perms(0640));
    const fs::file_time_type before = fs::last_write_time(file);
    for (const Words &words :
         {Words{"append", "p", "-"}, Words{"move", "p", "2", "2"}, Words{"prune", "p"}}) {
        EXPECT_EQ(says(words), "'p' (playlist 1) is unchanged: it has 2\n");
        EXPECT_EQ(answerOf(words)["changed"], false);
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
    const fs::path file = shared_ / "p.m3u";
    std::ofstream(file, std::ios::app) << "#EXTINF:5,Gone\r\n../gone.mp3\r\nhttp://r/2\r\n";
    const std::string own =
        "https://r/1 " + (music_ / "z.mp3").string() + " " + (music_ / "play/y.mp3").string() + " ";
    EXPECT_EQ(entriesOf({"p"}), "a" + own + "Gonehttp://r/2 ");
    const std::string contents = files::read(file);
    EXPECT_TRUE(
        contains(fails({"append", "p", "--path", music_ / "line\nbreak.mp3"}), "cannot stand in"));
    EXPECT_TRUE(contains(fails({"append", "p", "2", "--path", "nowhere.mp3"}), "nowhere.mp3"));
    EXPECT_TRUE(contains(fails({"append", "p", "2", "99", "98"}), "no song has the id 99, 98"));
    EXPECT_EQ(files::read(file), contents);
    EXPECT_TRUE(contains(says({"prune", "p"}), "removed 1 entry from 'p'"));
    EXPECT_EQ(entriesOf({"p"}), "a" + own + "http://r/2 ");

    std::ofstream(folder_ / "theirs.m3u") << "D:\\Alben\\a.mp3\nE:\\later.mp3\nhere.mp3\n";
    EXPECT_EQ(answerOf({"import", folder_ / "theirs.m3u"})["known"], 1);
    EXPECT_EQ(files::read(shared_ / "theirs.m3u"),
              "#EXTM3U\r\n../a.mp3\r\nE:\\later.mp3\r\n../../here.mp3\r\n");
}

TEST_F(Playlists, PersonalOnesStandInAFolder) {
    const std::string home = folder_ / "home [a]*";
    fs::create_directory(home);
    EXPECT_EQ(says({"list", "--dir", home}),
              "no playlists yet; make one: vorelix playlist create NAME ID...\n");
    EXPECT_EQ(answerOf({"create", "two", "2", "--dir", home + "/"})["playlist"]["id"], 1);
    says({"create", "one", "1", "--dir", home});
    EXPECT_EQ(entriesOf({home + "/playlists/two.m3u", "--dir", home + "/."}), "b");
    says({"append", "1", "3", "--dir", home});
    EXPECT_EQ(entriesOf({"one", "--dir", home}), "ac");
    const Json::Value page = answerOf({"list", "--dir", home, "--offset", "1"});
    EXPECT_EQ(page["playlists"][0]["id"], 2);
    EXPECT_EQ(page["playlists"][0]["title"], "two");
    EXPECT_EQ(page["total"], 2);
    EXPECT_EQ(answerOf({"list"})["total"], 0) << "they have no rows";
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
        EXPECT_TRUE(contains(fails({"show", name}), "several playlists")) << name;
    }
    for (const char *name : {"M_x", "7", "/nowhere.m3u"}) {
        EXPECT_TRUE(contains(fails({"delete", name}), "there is no playlist")) << name;
    }
    fails({"delete", music_ / "playlists/../a.mp3"});
    EXPECT_TRUE(contains(fails({"create", "mix"}), "--force"));
    says({"create", "mix", "--force"});
    EXPECT_EQ(answerOf({"show", "mix"})["playlist"]["id"], 2);
    fs::remove(shared_ / "mix.m3u");
    EXPECT_TRUE(contains(fails({"append", "mix", "1"}), "No such file"));
    says({"delete", "mix"});
    EXPECT_EQ(answerOf({"list"})["total"], 2);
    for (const char *name : {"a/b", ".a", "a\nb", "\xff"}) {
        fails({"create", name});
    }
    EXPECT_EQ(files::countIn(shared_), 2);
}

TEST_F(Playlists, FilesThatAreNoPlaylistsStayAsTheyAre) {
    const std::string page = music_ / "page.m3u";
    const std::string html = "<!DOCTYPE html><html><body>404</body></html>\n";
    files::write(page, html);
    files::write(music_ / "long.m3u8", "a.mp3\n");
    EXPECT_TRUE(contains(fails({"append", page, "1"}), "not a playlist"));
    EXPECT_TRUE(contains(fails({"append", music_ / "long.m3u8", "1"}),
                         "only m3u, pls and wpl are written"));
    EXPECT_EQ(files::read(page), html);
    EXPECT_EQ(files::read(music_ / "long.m3u8"), "a.mp3\n");
    fails({"import", page});
    EXPECT_EQ(says({"import", music_ / "long.m3u8"}).find("imported 'long'"), 0U);
    fs::create_directory(music_ / "links");
    fs::create_symlink(shared_ / "long.m3u", music_ / "links/long.m3u");
    EXPECT_TRUE(contains(fails({"append", music_ / "links/long.m3u", "1"}), "link"));
}

}  // namespace
}  // namespace command_line
