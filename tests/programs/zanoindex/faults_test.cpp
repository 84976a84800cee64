#include <poll.h>
#include <sys/inotify.h>
#include <unistd.h>
#include <algorithm>
#include <array>
#include <csignal>
#include <regex>

#include "index_test.h"

namespace zano::index {
namespace {

/* What a run does to folders, seen from outside. */
class Observer {
  public:
    Observer() : inotify_(inotify_init1(IN_CLOEXEC | IN_NONBLOCK)) {}
    Observer(const Observer &) = delete;
    Observer &operator=(const Observer &) = delete;
    ~Observer() { close(inotify_); }

    void watch(const fs::path &folder, std::uint32_t events) const {
        EXPECT_GE(inotify_add_watch(inotify_, folder.c_str(), events), 0);
    }

    /* Waits for so many events; the number seen, which is less when the process ended before. */
    int await(int events, const Process &process) {
        int seen = take();
        while (seen < events) {
            std::array<pollfd, 2> sources = {pollfd{inotify_, POLLIN, 0},
                                             pollfd{process.output(), POLLIN, 0}};
            EXPECT_GT(poll(sources.data(), sources.size(), 60'000), 0) << "nothing happens";
            if (sources[0].revents == 0) {
                return seen;  // only the end of the output is left
            }
            seen += take();
        }
        return seen;
    }

    int take() const {
        alignas(inotify_event) std::array<char, 65536> bytes;
        int count = 0;
        const auto size = read(inotify_, bytes.data(), bytes.size());
        for (ssize_t at = 0; at < size; ++count) {
            at += static_cast<ssize_t>(
                sizeof(inotify_event) +
                reinterpret_cast<const inotify_event *>(bytes.data() + at)->len);
        }
        return count;
    }

  private:
    int inotify_;
};

class FaultsTest : public IndexTest {
  protected:
    FaultsTest() {
        // The sanitizers' reports of crashes on purpose would take longer than a file may.
        setenv("ASAN_OPTIONS", "symbolize=0", 1);
        setenv("TERM", "xterm", 1);
    }

    std::unique_ptr<Process> startFaulty(const Lines &arguments,
                                         program::Stream errors = program::Stream::Kept) const {
        return std::make_unique<Process>(program::Start{
            .path = ZANOINDEX_FAULTY, .argv = argumentsOf(arguments), .errors = errors});
    }
    void check() const { EXPECT_NO_THROW(mediadb::openCatalogue(location())->check()); }
};

struct Fault {
    const char *name;
    const char *reason;  // as a regular expression
    bool isListed;
};

/* The sanitizers have limits of their own in the place of the system's: a reader beyond them looks
 * crashed, or is too slow to get there. */
#ifdef ZANOINDEX_SANITIZED
constexpr const char *kOutOfMemory = "the tag reader (crashed \\(exit code 1\\)|ran out of time)";
#else
constexpr const char *kOutOfMemory = "the tag reader ran out of memory";
#endif

constexpr std::array kFaults = {
    Fault{"babble.mp3", "the tag reader crashed \\(its answer made no sense\\)", true},
    Fault{"crash.mp3", "the tag reader crashed \\(.*\\)", true},
    Fault{"greedy.mp3", kOutOfMemory, true},
    Fault{"hang.mp3", "the tag reader ran out of time", true},
    Fault{"huge.mp3", kOutOfMemory, true},
    Fault{"leave.mp3", "the tag reader crashed \\(exit code 3\\)", true},
    Fault{"stall.mp3", "the disk did not answer in time", false},
    Fault{"throw.mp3", "the tag reader crashed \\(a size from a damaged file\\)", true},
};

TEST_F(FaultsTest, FilesThatStopTheReaderCostThemselvesOnly) {
    Lines listed;
    for (const auto &fault : kFaults) {
        // with good ones in front of it and behind it in the line
        for (const char *prefix : {"", "a", "z"}) {
            const auto name = std::string(prefix) + fault.name;
            add(name);
            if (*prefix != '\0' || fault.isListed) {
                listed.push_back(name + (*prefix == '\0' ? "|" : "|S"));
            }
        }
    }
    std::sort(listed.begin(), listed.end());

    const auto ended = runFaulty({"-j2", music()});
    EXPECT_EQ(ended.status, 0) << ended.err;
    for (const auto &fault : kFaults) {
        const std::regex line("zanoindex: cannot read " + music() + "/" + fault.name + ": " +
                              fault.reason + "\n");
        EXPECT_TRUE(std::regex_search(ended.err, line)) << fault.name << "\n" << ended.err;
    }
    auto lines = songs();
    ASSERT_EQ(lines.size(), listed.size());
    for (std::size_t i = 0; i < lines.size(); ++i) {
        EXPECT_TRUE(lines[i].starts_with(listed[i])) << lines[i] << " is not " << listed[i];
    }
    EXPECT_EQ(lines[8], "babble.mp3|babble|||||0|0|0") << "listed by its name";

    // Not read again, but named again; the one that only waited is read again.
    const auto again = runFaulty({"-j2", "--json", music()});
    const auto summary = parsed(again.out);
    EXPECT_EQ(counts(summary), "unchanged 16, failed 8");
    for (const auto &failed : summary["failed"]) {
        const auto reason = failed["reason"].asString();
        const bool isStall = failed["path"].asString().ends_with("/stall.mp3");
        EXPECT_EQ(reason.find("has not changed since") == std::string::npos, isStall) << reason;
    }
    EXPECT_EQ(songs(), lines);

    // By a reader that can read them, on demand.
    EXPECT_EQ(summaryOf({"--reread", music()})["failed"].size(), 0U);
    EXPECT_EQ(songs().size(), 24U);
    check();
}

/* Twenty runs are killed at moments spread over all that an undisturbed one does: files read,
 * the database written. Half of them start from a catalogue of an earlier state of the folder. */
TEST_F(FaultsTest, KilledAtAnyMoment) {
    constexpr int kMoments = 20;
    for (int i = 0; i < 60; ++i) {
        add("old/" + std::to_string(i) + ".ogg", "ogg");
        add("kept/" + std::to_string(i) + ".mp3");
    }
    runFaulty({music()});
    const auto earlier = path("earlier.db");
    fs::copy_file(databaseFile(), earlier);
    for (int i = 0; i < 40; ++i) {
        fs::remove(music() + "/old/" + std::to_string(i) + ".ogg");
        add("kept/" + std::to_string(i) + ".mp3", "flac");
        add("new/" + std::to_string(i) + ".opus", "opus");
    }

    const auto start = [&](bool isFirst) {
        for (const char *suffix : {"", "-wal", "-shm"}) {
            fs::remove(databaseFile() + suffix);
        }
        if (!isFirst) {
            fs::copy_file(earlier, databaseFile());
        }
    };
    const auto observe = [&](Observer &observer) {
        for (const auto &folder : fs::directory_iterator(music())) {
            observer.watch(folder.path(), IN_CLOSE_NOWRITE);
        }
        observer.watch(path(""), IN_MODIFY | IN_CREATE | IN_DELETE);
    };

    std::array<int, 2> eventsOfAll{};
    Lines expected;
    for (const bool isFirst : {false, true}) {
        start(isFirst);
        Observer observer;
        observe(observer);
        const auto process = startFaulty({music()});
        eventsOfAll[isFirst ? 1 : 0] = observer.await(1'000'000, *process);
        EXPECT_EQ(process->wait().status, 0);
        expected = songs();
        EXPECT_EQ(expected.size(), 120U);
    }

    int killed = 0;
    for (int moment = 0; killed < kMoments; ++moment) {
        ASSERT_LT(moment, 4 * kMoments) << "most runs end before they are killed";
        const bool isFirst = moment % 2 == 0;
        const int events = 1 + eventsOfAll[isFirst ? 1 : 0] * (moment % kMoments) / kMoments;
        SCOPED_TRACE(testing::Message() << "killed after " << events << " events");
        start(isFirst);
        Observer observer;
        observe(observer);
        const auto process = startFaulty({music()});
        observer.await(events, *process);
        kill(process->pid(), SIGKILL);
        killed += process->wait().status == 128 + SIGKILL ? 1 : 0;
        check();
        EXPECT_EQ(runFaulty({"-q", music()}).status, 0);
        EXPECT_EQ(songs(), expected);
        check();
    }
}

TEST_F(FaultsTest, CtrlCEndsCleanly) {
    for (int i = 0; i < 25; ++i) {
        add("a" + std::to_string(i) + ".mp3");
    }
    for (int i = 0; i < 9; ++i) {
        add("stall" + std::to_string(i) + ".mp3");
    }
    for (const int signal : {SIGINT, SIGTERM}) {
        fs::remove(databaseFile());
        Observer observer;
        observer.watch(music(), IN_CLOSE_NOWRITE);
        const auto process = startFaulty({"-j1", "--json", music()});
        // all good files, and one that waits; the folder itself is closed, too
        observer.await(27, *process);
        kill(process->pid(), signal);
        const auto ended = process->wait();
        EXPECT_EQ(ended.status, 128 + signal) << ended.err;
        EXPECT_TRUE(contains(ended.err, "stopped"));
        const auto summary = parsed(ended.out);
        EXPECT_TRUE(summary["stopped"].asBool());
        EXPECT_EQ(summary["added"].asUInt(), paths().size());
        check();
    }
    EXPECT_EQ(summaryOf({music()})["failed"].size(), 0U);
    EXPECT_EQ(paths().size(), 34U);
}

TEST_F(FaultsTest, NoReaderOutlivesAKilledIndexer) {
    add("stall.mp3");
    Observer observer;
    observer.watch(music(), IN_OPEN);
    const auto process = startFaulty({music()});
    observer.await(2, *process);  // the folder, then the file
    kill(process->pid(), SIGKILL);
    // The reader holds the other end of the output, too, so this ends when both have.
    EXPECT_EQ(process->wait().status, 128 + SIGKILL);
}

TEST_F(FaultsTest, BarOnATerminal) {
    add("a.mp3");
    add("stall.mp3");
    const auto ended = startFaulty({music()}, program::Stream::Terminal)->wait();
    EXPECT_TRUE(contains(ended.err, "\r\033[K["));
    EXPECT_TRUE(contains(ended.err, "reading tags: 1 of 2 files"));
    EXPECT_TRUE(ended.out.starts_with("2 files in ")) << ended.out;
}

}  // namespace
}  // namespace zano::index
