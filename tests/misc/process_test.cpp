#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>
#include <vorelix/misc/misc.h>

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <iterator>
#include <string>

namespace {

int runShell(const std::string &script, int wait) {
    std::string name = "name";
    std::string option = "-c";
    std::string text = script;
    char *const argv[] = {name.data(), option.data(), text.data(), nullptr};
    return ZANOExec("/bin/sh", argv, wait);
}

/* A file of its own, removed at the end. */
class TemporaryFile {
  public:
    TemporaryFile() { close(mkstemp(path_.data())); }
    ~TemporaryFile() { unlink(path_.c_str()); }
    TemporaryFile(const TemporaryFile &) = delete;
    TemporaryFile &operator=(const TemporaryFile &) = delete;
    const std::string &path() const { return path_; }
    std::string content() const {
        std::ifstream file(path_);
        return {std::istreambuf_iterator<char>(file), {}};
    }

  private:
    std::string path_ = testing::TempDir() + "exec_XXXXXX";
};

TEST(Exec, GivesTheStatusOfTheProgram) {
    EXPECT_EQ(runShell("exit 0", 1), 0);
    EXPECT_EQ(runShell("exit 3", 1), 3);
    EXPECT_EQ(runShell("exit 255", -1), 255);
    EXPECT_EQ(runShell("kill -KILL $$", 1), -1);
}

TEST(Exec, HandsTheVectorOverAndClosesTheStreams) {
    const TemporaryFile file;
    ASSERT_EQ(
        runShell("for fd in 0 1 2; do set -- $* $(readlink /proc/$$/fd/$fd); done; echo $* $0 >" +
                     file.path(),
                 1),
        0);
    EXPECT_EQ(file.content(), "/dev/null /dev/null /dev/null name\n");
}

TEST(Exec, OfAProgramThatCannotStartTheOutputOfTheCallerIsWrittenOnce) {
    const TemporaryFile file;
    std::FILE *const output = std::fopen(file.path().c_str(), "w");
    ASSERT_NE(output, nullptr);
    std::fputs("once", output);
    char *const argv[] = {nullptr, nullptr};
    EXPECT_EQ(ZANOExec("/nowhere/no program", argv, 1), 255);
    std::fclose(output);
    EXPECT_EQ(file.content(), "once");
}

TEST(Exec, WithoutWaitingTheProgramRunsOn) {
    int ends[2];
    ASSERT_EQ(pipe(ends), 0);
    // The program reads from the pipe and so ends after the call only.
    EXPECT_EQ(runShell("read line </proc/self/fd/" + std::to_string(ends[0]) + "; exit 7", 0), 0);
    ASSERT_EQ(write(ends[1], "go\n", 3), 3);
    int status = 0;
    EXPECT_GT(wait(&status), 0);
    EXPECT_EQ(WEXITSTATUS(status), 7);
    close(ends[0]);
    close(ends[1]);
}

TEST(Exec, RestoresTheFlagThatDiscardsStatuses) {
    struct sigaction before {};
    ASSERT_EQ(sigaction(SIGCHLD, nullptr, &before), 0);
    for (const int flags : {0, SA_NOCLDWAIT, SA_NOCLDWAIT | SA_RESTART}) {
        struct sigaction action = before;
        action.sa_flags = flags;
        ASSERT_EQ(sigaction(SIGCHLD, &action, nullptr), 0);
        EXPECT_EQ(runShell("exit 3", 1), 3) << flags;
        struct sigaction after {};
        ASSERT_EQ(sigaction(SIGCHLD, nullptr, &after), 0);
        EXPECT_EQ(after.sa_flags & (SA_NOCLDWAIT | SA_RESTART), flags);
    }
    sigaction(SIGCHLD, &before, nullptr);
}

}  // namespace
