/* The commands of configuration, custom keys, queues and iPod. */
#include <algorithm>

#include "command_line.h"
#include "support/json.h"

namespace command_line {
namespace {

namespace fs = std::filesystem;

constexpr const char *kConf = ZANO_PATH_AUDIO_CONF;
constexpr const char *kKeys = ZANO_PATH_CUSTOM_KEYS;
constexpr const char *kDefaults =
    "AS_Player_Source=\"Music\"\nAS_Player_Repeat=\"All\"\nAS_Player_Shuffle=\"Off\"\n"
    "AS_Default_Music_PLS=\"\"\nAS_Default_IPod_PLS=\"\"\n";

class State : public CommandLine {
  protected:
    State() : queue_(folder_ / "q.queue") { fs::create_directories(ZANO_PATH_IPOD_FOLDER); }

    std::string songs() const {
        return json::titlesOf(answerOf({"queue", "show", queue_})["entries"]);
    }

    const files::Places places_{ZANO_PATH_AUDIO_FOLDER};
    const std::string queue_;
};

TEST_F(State, SettingsAreMadeSetAndShown) {
    fs::remove_all(ZANO_PATH_AUDIO_FOLDER);
    EXPECT_TRUE(contains(fails({"config", "get"}), "vorelix config restore"));
    EXPECT_TRUE(contains(fails({"config", "print"}), "vorelix config restore"));
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
    // Before and after; null: refused.
    const std::pair<const char *, const char *> cases[] = {
        {"[", nullptr},
        {"[1]", nullptr},
        {R"({"items":{}})", nullptr},
        {R"({"items":[7]})", nullptr},
        {R"({"items":[],"a\u0000":1})", nullptr},
        {R"(/*c*/{"items":[{"more":1}],"x":2})",
         R"(/*c*/{"items":[{"more":1,"title":"","type":"t","value":""}],"x":2})"},
    };
    for (const auto &[before, after] : cases) {
        files::write(kKeys, before);
        if (after != nullptr) {
            says({"keys", "set", "1", "--type", "t"});
        } else {
            EXPECT_TRUE(contains(fails({"keys", "set", "1", "--type", "t"}), kKeys));
        }
        std::string text = files::read(kKeys);
        std::erase_if(text, [](char c) { return c == ' ' || c == '\n'; });
        EXPECT_EQ(text, after != nullptr ? after : before);
    }
}

TEST_F(State, QueuesAreSavedAppendedToAndShown) {
    fillWithLetters(3, folder_);
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
        EXPECT_TRUE(contains(fails(words), "no queue"));
    }
    EXPECT_EQ(files::read(queue_), "#EXTM3U\n");
    says({"queue", "save", queue_, "--force"});
    EXPECT_EQ(files::read(queue_).size(), kHeader);
    fs::remove(database_);
    fails({"queue", "random", queue_, "2"});
    EXPECT_EQ(files::read(queue_).size(), kHeader) << "not emptied for want of a database";
}

TEST_F(State, TheIPodIsShown) {
    EXPECT_TRUE(contains(fails({"ipod", "tracks"}), "config restore"));
    says({"config", "restore"});
    EXPECT_TRUE(contains(fails({"ipod", "tracks"}), "zanoipod"));
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
    EXPECT_TRUE(contains(says({"ipod", "songs", "Road.Trip"}), "1:05"));
}

}  // namespace
}  // namespace command_line
