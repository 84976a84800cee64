/* What becomes of playlists, queues, custom keys and settings when a command that changes them is
 * killed, meets a full disk, or is not the only one. */
#include <fcntl.h>
#include <sys/file.h>
#include <sys/wait.h>

#include <algorithm>
#include <chrono>
#include <csignal>
#include <map>
#include <random>
#include <thread>

#include "command_line.h"
#include "support/json.h"

namespace command_line {
namespace {

namespace fs = std::filesystem;

/* The songs a, b, c, a playlist and a queue of the first, one key and the settings' defaults. */
class Changes : public CommandLine {
  protected:
    Changes() {
        fs::create_directories(lists_);
        fs::create_directory_symlink(folder_ / "music", ZANO_PATH_MUSIC_LINK);
        fillWithLetters(3, folder_ / "music");
        for (const Words &words :
             {Words{"playlist", "create", "p", "1"}, Words{"queue", "save", queue_, "1"},
              Words{"config", "restore"}, Words{"keys", "set", "1", "--value", "old"}}) {
            says(words);
        }
    }

    /* A playlist of so many songs, too long to be written in no time. */
    void makeLong(int count) const {
        std::string ids;
        for (int i = 0; i < count; ++i) {
            ids += std::to_string(i % 3 + 1) + "\n";
        }
        says({"playlist", "create", "long", "-"}, ids);
    }

    /* All files that commands change, with what they hold. */
    std::map<std::string, std::string> state() const {
        std::map<std::string, std::string> contents;
        for (const fs::path &folder : {folder_, fs::path(ZANO_PATH_AUDIO_FOLDER)}) {
            for (const auto &each : fs::recursive_directory_iterator(folder)) {
                const std::string path = each.path();
                if (!path.starts_with(database_.string()) && each.is_regular_file()) {
                    contents[path] = files::read(path);
                }
            }
        }
        return contents;
    }

    const files::Places places_{ZANO_PATH_MUSIC_LINK, ZANO_PATH_AUDIO_FOLDER};
    const fs::path lists_ = folder_ / "music/playlists";
    const std::string queue_ = folder_ / "q.queue";
};

TEST_F(Changes, ThatAreKilledAreDoneOrNot) {
    using std::chrono::microseconds;
    makeLong(1000);
    const struct {
        Words words;
        fs::path file;
        fs::path draft;
    } cases[] = {
        {{"playlist", "append", "long", "2"}, lists_ / "long.m3u", lists_ / ".long.vorelix.m3u"},
        {{"keys", "set", "1", "--value", std::string(100000, 'x')},
         ZANO_PATH_CUSTOM_KEYS,
         ZANO_PATH_AUDIO_FOLDER "/.custom_key.vorelix.json"},
    };
    for (const auto &each : cases) {
        const std::string before = files::read(each.file);
        const fs::path old = each.file.string() + ".old";
        fs::create_hard_link(each.file, old);
        const auto begun = std::chrono::steady_clock::now();
        says(each.words);
        const auto whole =
            std::chrono::duration_cast<microseconds>(std::chrono::steady_clock::now() - begun);
        EXPECT_TRUE(files::read(old) == before) << "written in place";
        fs::remove(old);
        const auto done = state();
        std::mt19937 random(4711);
        int killed = 0;
        for (int round = 0; round < 50; ++round) {
            files::write(each.file, before);
            const pid_t child = start({each.words});
            while (!fs::exists(each.draft) && waitpid(child, nullptr, WNOHANG | WNOWAIT) == 0) {
            }
            const auto most = static_cast<unsigned long>(whole.count() / 4 + 1);
            std::this_thread::sleep_for(microseconds(random() % most));
            kill(child, SIGKILL);
            killed += statusOf(child) == 128 + SIGKILL ? 1 : 0;
            const std::string after = files::read(each.file);
            ASSERT_TRUE(after == before || after == done.at(each.file)) << after.substr(0, 1000);
        }
        EXPECT_GT(killed, 0);
        files::write(each.file, before);
        says(each.words);
        EXPECT_TRUE(state() == done) << "what killed ones left is gone";
    }
}

TEST_F(Changes, OnAFullDiskAreNone) {
    makeLong(10000);
    Words songs = {"queue", "append", queue_};
    songs.insert(songs.end(), 10, "2");
    const std::string unchanged = "File too large; it is as it was";
    const struct {
        Words words;
        unsigned long limit;
        std::string error;
    } cases[] = {
        {{"playlist", "append", "long", "1"}, 65536, unchanged},
        {{"playlist", "remove", "long", "1"}, 65536, unchanged},
        {{"playlist", "export", "long", "--to", folder_ / "x.wpl"}, 65536, unchanged},
        {{"playlist", "import", lists_ / "long.m3u", "--name", "new", "--form", "pls"},
         65536,
         unchanged},
        {songs, 65536, "it is as it was"},
        {{"keys", "set", "1", "--value", std::string(100000, 'x')}, 4096, "it is as it was"},
        {{"config", "set", "a", "b"}, 50, "could not set a"},
    };
    for (const auto &each : cases) {
        const auto before = state();
        EXPECT_TRUE(contains(fails(each.words, 1, each.limit), each.error)) << each.words[1];
        EXPECT_TRUE(state() == before) << each.words[1];
    }
    EXPECT_EQ(answerOf({"playlist", "list"})["total"], 2);
    fs::remove(ZANO_PATH_AUDIO_CONF);
    const auto without = state();
    fails({"config", "restore"}, 1, 50);
    EXPECT_TRUE(state() == without) << "no part of the defaults";
}

TEST_F(Changes, AtOnceAreAllMade) {
    constexpr int kCalls = 40;
    constexpr int kSongs = 13;  // of a call that appends to the playlist
    const auto before = state();
    const std::string writer = "2 or 3";
    const std::string call = "another one in each call";
    Words append = {"playlist", "append", "p"};
    append.insert(append.end(), kSongs, writer);
    const Words commands[] = {append,
                              {"queue", "append", queue_, writer},
                              {"config", "set", call, "x"},
                              {"keys", "set", writer, "--value", call}};
    process::runAtOnce(8, [&](int number) {
        int failures = 0;
        for (int i = 0; i < kCalls; ++i) {
            Words words = commands[number / 2];
            std::replace(words.begin(), words.end(), writer, std::to_string(2 + number % 2));
            std::replace(words.begin(), words.end(), call, std::to_string(1000 * number + i));
            words.insert(words.end(), {"--wait", "300"});
            failures += run({words}).status == 0 ? 0 : 1;
        }
        return failures;
    });
    const std::pair<Words, int> lists[] = {{{"playlist", "show", "p"}, kCalls * kSongs},
                                           {{"queue", "show", queue_}, kCalls}};
    for (const auto &[shown, songs] : lists) {
        Words all = shown;
        all.insert(all.end(), {"--limit", "2000"});
        const std::string titles = json::titlesOf(answerOf(all)["entries"]);
        EXPECT_EQ(std::count(titles.begin(), titles.end(), 'b'), songs) << shown[0];
        EXPECT_EQ(std::count(titles.begin(), titles.end(), 'c'), songs) << shown[0];
    }
    EXPECT_EQ(answerOf({"config", "get"})["settings"].size(), 5U + 2 * kCalls);
    EXPECT_EQ(answerOf({"keys", "get", "2"})["keys"][0]["value"],
              std::to_string(6000 + kCalls - 1));
    EXPECT_EQ(answerOf({"keys", "get", "3"})["keys"][0]["value"],
              std::to_string(7000 + kCalls - 1));
    EXPECT_EQ(state().size(), before.size()) << "nothing else is left";
}

TEST_F(Changes, WaitForAnotherProgram) {
    const int draft = open((lists_ / ".p.vorelix.m3u").c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0666);
    struct flock lock {};
    lock.l_type = F_WRLCK;
    ASSERT_EQ(fcntl(draft, F_OFD_SETLK, &lock), 0);
    const int queue = open(queue_.c_str(), O_RDONLY | O_CLOEXEC);
    ASSERT_EQ(flock(queue, LOCK_EX), 0);
    const auto before = state();
    const std::pair<Words, const char *> cases[] = {
        {{"playlist", "append", "p", "2"}, "another vorelix is changing it"},
        {{"playlist", "delete", "p"}, "another vorelix is changing it"},
        {{"playlist", "create", "p", "--force"}, "another vorelix is changing it"},
        {{"queue", "append", queue_, "2"}, "locked"},
        {{"queue", "save", queue_, "2"}, "locked"},
        {{"queue", "show", queue_}, "locked"},
        {{"queue", "random", queue_, "1"}, "locked"},
    };
    for (const auto &[words, error] : cases) {
        Words impatient = words;
        impatient.insert(impatient.end(), {"--wait", "0"});
        EXPECT_TRUE(contains(fails(impatient), error));
        EXPECT_TRUE(state() == before) << words[1];
    }
    const pid_t ofPlaylist = start({{"playlist", "append", "p", "2", "--wait", "300"}});
    const pid_t ofQueue = start({{"queue", "append", queue_, "2", "--wait", "300"}});
    while (!fs::exists(folder_ / ".q.vorelix.queue")) {
    }
    close(draft);
    close(queue);
    EXPECT_EQ(statusOf(ofPlaylist), 0);
    EXPECT_EQ(statusOf(ofQueue), 0);
    EXPECT_EQ(answerOf({"playlist", "show", "p"})["total"], 2);
    EXPECT_EQ(answerOf({"queue", "show", queue_})["total"], 2);
}

}  // namespace
}  // namespace command_line
