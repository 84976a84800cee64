/* The commands of configuration, custom keys, queues and iPod. */
#include <fcntl.h>
#include <sys/file.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <functional>
#include <random>
#include <thread>

#include "command_line.h"
#include "support/files.h"
#include "system_paths_internal.h"

namespace command_line {
namespace {

namespace fs = std::filesystem;
using Words = std::vector<std::string>;

constexpr const char *kConf = ZANO_PATH_AUDIO_CONF;
constexpr const char *kKeys = ZANO_PATH_CUSTOM_KEYS;
constexpr const char *kDefaults =
    "AS_Player_Source=\"Music\"\nAS_Player_Repeat=\"All\"\nAS_Player_Shuffle=\"Off\"\n"
    "AS_Default_Music_PLS=\"\"\nAS_Default_IPod_PLS=\"\"\n";

class State : public CommandLine {
  protected:
    State() : queue_(folder_ / "q.queue") { fs::create_directories(ZANO_PATH_IPOD_FOLDER); }

    static std::string says(const Words &words) {
        const Ended ended = run({words});
        EXPECT_EQ(ended.err, "");
        EXPECT_EQ(ended.status, 0);
        return ended.out;
    }

    /* The error of a command that has to fail, with nothing on standard output. */
    static std::string fails(const Words &words, unsigned long fileSizeLimit = 0) {
        const Ended ended = run({.arguments = words, .fileSizeLimit = fileSizeLimit});
        EXPECT_EQ(ended.status, 1) << ended.err;
        EXPECT_EQ(ended.out, "");
        return ended.err;
    }

    /* Runs each of the loops in a process of its own. */
    static void atOnce(const std::vector<std::function<Words(int)>> &loops, int calls) {
        process::runAtOnce(static_cast<int>(loops.size()), [&](int number) {
            int failures = 0;
            for (int call = 0; call < calls; ++call) {
                failures += run({loops[static_cast<size_t>(number)](call)}).status == 0 ? 0 : 1;
            }
            return failures;
        });
    }

    void fillDatabase() const {
        std::vector<zano::mediadb::Song> songs(3);
        for (size_t i = 0; i < songs.size(); ++i) {
            songs[i].title = std::string(1, static_cast<char>('a' + i));
            songs[i].path = folder_ / (songs[i].title + ".mp3");
        }
        fill(songs);
    }

    /* The titles in the queue's file. */
    std::string songs() const {
        std::string titles;
        const Json::Value answer = answerOf({"queue", "show", queue_});
        for (const Json::Value &entry : answer["entries"]) {
            titles += entry["title"].asString();
        }
        return titles;
    }

    const files::Places places_{ZANO_PATH_AUDIO_FOLDER};
    const std::string queue_;
};

TEST_F(State, SettingsAreMadeSetAndShown) {
    fs::remove_all(ZANO_PATH_AUDIO_FOLDER);
    EXPECT_NE(fails({"config", "get"}).find("vorelix config restore"), std::string::npos);
    EXPECT_NE(fails({"config", "print"}).find("vorelix config restore"), std::string::npos);
    says({"config", "restore"});
    EXPECT_EQ(files::read(kConf), kDefaults);
    says({"config", "set", "AS_Player_Source", "USB \"1\""});
    EXPECT_EQ(answerOf({"config", "restore"})["made"], false);
    EXPECT_EQ(says({"config", "get", "AS_Player_Source"}), "USB \"1\"\n");
    EXPECT_EQ(says({"config", "get", "AS_Player_Repeat"}), "All\n");
    EXPECT_EQ(answerOf({"config", "get"})["settings"].size(), 5U);
    EXPECT_EQ(says({"config", "print"}), "CurentSource=0\nPlayMode=0\nszDefaultMusicPlaylist=\n");
    EXPECT_EQ(answerOf({"config", "print"})["playMode"], 0);
    const std::string before = files::read(kConf);
    for (const Words &words :
         {Words{"config", "set", "a=b", "c"}, Words{"config", "set", "a", "\n"},
          Words{"config", "set", "a", std::string(4000, 'x')},
          Words{"config", "get", "AS_player_source"}}) {
        fails(words);
    }
    EXPECT_EQ(files::read(kConf), before);
    EXPECT_EQ(files::countIn(ZANO_PATH_AUDIO_FOLDER), 1);
}

TEST_F(State, DefaultsOnAFullDiskAreNoFile) {
    fails({"config", "restore"}, 50);
    EXPECT_EQ(files::read(kConf), "(no file)");
    says({"config", "restore"});
    fails({"config", "set", "a", "b"}, 50);
    EXPECT_EQ(files::read(kConf), kDefaults);
}

TEST_F(State, WhatIsSetAtOnceIsAllThere) {
    says({"config", "restore"});
    constexpr int kCalls = 200;
    const auto setting = [](const std::string &prefix) {
        return [prefix](int call) -> Words {
            return {"config", "set", prefix + std::to_string(call), "x", "--wait", "300"};
        };
    };
    atOnce({setting("one"), setting("two")}, kCalls);
    EXPECT_EQ(answerOf({"config", "get"})["settings"].size(), 5U + 2 * kCalls);
    const auto value = [](const std::string &key) {
        return [key](int call) -> Words {
            return {"keys", "set", key, "--value", std::to_string(call), "--wait", "300"};
        };
    };
    atOnce({value("1"), value("4")}, 50);
    for (const char *key : {"1", "4"}) {
        EXPECT_EQ(answerOf({"keys", "get", key})["keys"][0]["value"], "49") << key;
    }
    EXPECT_EQ(files::countIn(ZANO_PATH_AUDIO_FOLDER), 3) << "the iPod's folder beside the files";
}

TEST_F(State, CustomKeysAreSetAsTheLibraryWouldWriteThem) {
    EXPECT_EQ(answerOf({"keys", "get"})["keys"].size(), 4U);
    EXPECT_FALSE(fs::exists(kKeys));
    says({"keys", "set", "2", "--title", "\"Ø\"\n", "--value", "v"});
    const std::string made = files::read(kKeys);
    EXPECT_EQ(made.find("{\n   \"items\" : [\n      {\n         \"id\" : 1,"), 0U) << made;
    says({"keys", "set", "2", "--type", "t"});
    const Json::Value key = answerOf({"keys", "get", "2"})["keys"][0];
    EXPECT_EQ(key["title"], "\"Ø\"\n");
    EXPECT_EQ(key["type"], "t");
    const struct {
        const char *before;
        const char *after;  // null: refused
    } cases[] = {
        {"[", nullptr},
        {"[1]", nullptr},
        {R"({"items":{}})", nullptr},
        {R"({"items":[7]})", nullptr},
        {R"({"items":[],"a\u0000":1})", nullptr},
        {R"(/*c*/{"items":[{"more":1}],"x":2})",
         R"(/*c*/{"items":[{"more":1,"title":"","type":"t","value":""}],"x":2})"},
    };
    for (const auto &each : cases) {
        files::write(kKeys, each.before);
        if (each.after != nullptr) {
            says({"keys", "set", "1", "--type", "t"});
        } else {
            EXPECT_NE(fails({"keys", "set", "1", "--type", "t"}).find(kKeys), std::string::npos);
        }
        std::string after = files::read(kKeys);
        std::erase_if(after, [](char c) { return c == ' ' || c == '\n'; });
        EXPECT_EQ(after, each.after != nullptr ? each.after : each.before);
    }
    EXPECT_EQ(run({{"keys", "set", "1"}}).status, 2);
    EXPECT_EQ(run({{"keys", "set", "1", "--title", "\xff"}}).status, 2);
    EXPECT_EQ(run({{"keys", "get", "5"}}).status, 2);
}

TEST_F(State, CustomKeysAreTheOldOrTheNewOnesAfterAKillAndOnAFullDisk) {
    const fs::path draft = fs::path(ZANO_PATH_AUDIO_FOLDER) / ".custom_key.vorelix.json";
    const auto words = [](char letter) -> Words {
        return {"keys", "set", "1", "--value", std::string(100000, letter)};
    };
    says(words('a'));
    const std::string old = files::read(kKeys);
    EXPECT_NE(fails(words('b'), 4096).find("it is as it was"), std::string::npos);
    EXPECT_EQ(files::read(kKeys), old);
    std::mt19937 random(4711);
    int killed = 0;
    for (int round = 0; round < 30; ++round) {
        files::write(kKeys, old);
        const pid_t child = start({words('b')});
        while (!fs::exists(draft) && waitpid(child, nullptr, WNOHANG | WNOWAIT) == 0) {
        }
        std::this_thread::sleep_for(std::chrono::microseconds(random() % 3000));
        kill(child, SIGKILL);
        killed += statusOf(child) == 128 + SIGKILL ? 1 : 0;
        const Json::Value keys = answerOf({"keys", "get", "1"});
        const std::string value = keys["keys"][0]["value"].asString();
        ASSERT_TRUE(value == std::string(100000, 'a') || value == std::string(100000, 'b'));
    }
    EXPECT_GT(killed, 0);
    says(words('c'));
    EXPECT_FALSE(fs::exists(draft));
}

TEST_F(State, QueuesAreSavedAppendedToAndShown) {
    fillDatabase();
    fails({"queue", "show", queue_});
    fails({"queue", "append", queue_, "1"});
    says({"queue", "save", queue_, "3", "1"});
    constexpr size_t kHeader = 16;
    constexpr size_t kSong = 7336;
    const std::string saved = files::read(queue_);
    ASSERT_EQ(saved.size(), kHeader + 2 * kSong);
    EXPECT_EQ(saved.substr(0, kHeader), std::string("\0\0\0\0\1\0\0\0\0\0\0\0\2\0\0\0", kHeader));
    EXPECT_EQ(saved[kHeader], 3);
    EXPECT_EQ(songs(), "ca");
    // The player's own words stay, and so does each record.
    std::string other = saved;
    other[0] = 7;
    files::write(queue_, other);
    says({"queue", "append", queue_, "2", "2"});
    const std::string appended = files::read(queue_);
    EXPECT_EQ(appended.substr(kHeader, 2 * kSong), saved.substr(kHeader));
    const Json::Value page = answerOf({"queue", "show", queue_, "--offset", "1", "--limit", "2"});
    EXPECT_EQ(page["queue"]["state"][0], 7);
    EXPECT_EQ(page["total"], 4);
    EXPECT_EQ(page["entries"][0]["position"], 2);
    EXPECT_EQ(page["entries"].size(), 2U);
    EXPECT_EQ(answerOf({"queue", "random", queue_, "2"})["total"], 2);
    EXPECT_EQ(songs().size(), 2U);
    files::write(queue_, "#EXTM3U\n");
    for (const Words &words :
         {Words{"queue", "save", queue_, "1"}, Words{"queue", "append", queue_, "1"},
          Words{"queue", "random", queue_, "1"}}) {
        EXPECT_NE(fails(words).find("no queue"), std::string::npos);
    }
    EXPECT_EQ(files::read(queue_), "#EXTM3U\n");
    says({"queue", "save", queue_, "--force"});
    EXPECT_EQ(files::read(queue_).size(), kHeader);
    fs::remove(database_);
    fails({"queue", "random", queue_, "2"});
    EXPECT_EQ(files::read(queue_).size(), kHeader) << "not emptied for want of a database";
}

TEST_F(State, QueuesLockedOrOnAFullDiskStayAsTheyAre) {
    fillDatabase();
    says({"queue", "save", queue_, "1"});
    const std::string before = files::read(queue_);
    Words many = {"queue", "append", queue_};
    many.insert(many.end(), 10, "2");
    EXPECT_NE(fails(many, 65536).find("it is as it was"), std::string::npos);
    const int file = open(queue_.c_str(), O_RDONLY | O_CLOEXEC);
    ASSERT_EQ(flock(file, LOCK_EX), 0);
    for (const Words &words :
         {Words{"queue", "append", queue_, "2"}, Words{"queue", "save", queue_, "2"},
          Words{"queue", "show", queue_}, Words{"queue", "random", queue_, "1"}}) {
        Words waiting = words;
        waiting.insert(waiting.end(), {"--wait", "0"});
        EXPECT_NE(fails(waiting).find("locked"), std::string::npos);
    }
    EXPECT_EQ(files::read(queue_), before);
    const pid_t child = start({{"queue", "append", queue_, "2", "--wait", "300"}});
    while (!fs::exists(folder_ / ".q.vorelix.queue")) {
    }
    close(file);
    EXPECT_EQ(statusOf(child), 0);
    EXPECT_EQ(songs(), "ab");
    const auto append = [this](const std::string &id) {
        return
            [this, id](int) -> Words { return {"queue", "append", queue_, id, "--wait", "300"}; };
    };
    atOnce({append("2"), append("3")}, 20);
    EXPECT_EQ(answerOf({"queue", "show", queue_})["total"], 42);
}

TEST_F(State, TheIPodIsShown) {
    EXPECT_NE(fails({"ipod", "tracks"}).find("config restore"), std::string::npos);
    says({"config", "restore"});
    EXPECT_NE(fails({"ipod", "tracks"}).find("zanoipod"), std::string::npos);
    const std::string folder = ZANO_PATH_IPOD_FOLDER;
    const std::string song =
        "#title: One\r\n#artist: A\n#duration: 65\n#bitrate: 128\n"
        "#frequency: 44100\n/i/one.mp3\n";
    files::write(folder + "tracks.m3u", song + "#title: Two\n/i/two.mp3\n");
    files::write(folder + "Road.Trip.m3u", song);
    const Json::Value page = answerOf({"ipod", "tracks", "--offset", "1"});
    EXPECT_EQ(page["total"], 2);
    EXPECT_EQ(page["tracks"][0]["title"], "Two");
    EXPECT_EQ(page["tracks"][0]["position"], 2);
    const Json::Value track = answerOf({"ipod", "track", "1"})["track"];
    EXPECT_EQ(track["bitrate"], 128000);
    EXPECT_EQ(track["title"], "One");
    fails({"ipod", "track", "3"});
    EXPECT_EQ(answerOf({"ipod", "playlists"})["playlists"][0]["title"], "Road.Trip");
    for (const std::string &name : {std::string("Road.Trip"), folder + "Road.Trip.m3u"}) {
        const Json::Value songs = answerOf({"ipod", "songs", name});
        EXPECT_EQ(songs["total"], 1);
        EXPECT_EQ(songs["tracks"][0]["path"], "/i/one.mp3");
    }
    fails({"ipod", "songs", "tracks"});
    EXPECT_NE(says({"ipod", "songs", "Road.Trip"}).find("1:05"), std::string::npos);
}

}  // namespace
}  // namespace command_line
