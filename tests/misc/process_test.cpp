#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>
#include <vorelix/misc/misc.h>

#include <csignal>
#include <cstdio>
#include <string>

#include "support/files.h"

namespace {

int runShell(const std::string &script, int wait) {
    std::string name = "name";
    std::string option = "-c";
    std::string text = script;
    char *const argv[] = {name.data(), option.data(), text.data(), nullptr};
    return ZANOExec("/bin/sh", argv, wait);
}

class Exec : public testing::Test, protected files::Folder {};

TEST_F(Exec, GivesTheStatusOfTheProgram) {
    EXPECT_EQ(runShell("exit 0", 1), 0);
    EXPECT_EQ(runShell("exit 3", 1), 3);
    EXPECT_EQ(runShell("exit 255", -1), 255);
    EXPECT_EQ(runShell("kill -KILL $$", 1), -1);
}

TEST_F(Exec, HandsTheVectorOverAndClosesTheStreams) {
    const std::string file = path("out");
    // The one that the null device is opened with.
    const int next = dup(STDIN_FILENO);
    ASSERT_NE(close(next), -1);
    ASSERT_EQ(runShell("for fd in 0 1 2; do set -- $* $(readlink /proc/$$/fd/$fd); done; "
                       "[ -e /proc/$$/fd/" +
                           std::to_string(next) + " ] && set -- $* open; echo $* $0 >" + file,
                       1),
              0);
    EXPECT_EQ(files::read(file), "/dev/null /dev/null /dev/null name\n");
}

TEST_F(Exec, OfAProgramThatCannotStartTheOutputOfTheCallerIsWrittenOnce) {
    const std::string file = path("out");
    std::FILE *const output = std::fopen(file.c_str(), "w");
    ASSERT_NE(output, nullptr);
    std::fputs("once", output);
    char *const argv[] = {nullptr, nullptr};
    EXPECT_EQ(ZANOExec("/nowhere/no program", argv, 1), 255);
    std::fclose(output);
    EXPECT_EQ(files::read(file), "once");
}

TEST_F(Exec, WithoutWaitingTheProgramRunsOn) {
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

int handledSignal[2];

TEST_F(Exec, ASignalOfTheCallerEndsNoWaitAndAStatusThatIsNotKeptFails) {
    ASSERT_EQ(pipe(handledSignal), 0);
    struct sigaction action {};
    action.sa_handler = [](int) { static_cast<void>(!write(handledSignal[1], "\n", 1)); };
    struct sigaction before {};
    ASSERT_EQ(sigaction(SIGUSR1, &action, &before), 0);
    EXPECT_EQ(runShell("kill -USR1 $PPID; read line </proc/self/fd/" +
                           std::to_string(handledSignal[0]) + "; exit 3",
                       1),
              3);
    ASSERT_EQ(sigaction(SIGUSR1, &before, nullptr), 0);
    close(handledSignal[0]);
    close(handledSignal[1]);

    action.sa_handler = SIG_IGN;
    ASSERT_EQ(sigaction(SIGCHLD, &action, &before), 0);
    EXPECT_EQ(runShell("exit 3", 1), -1);
    ASSERT_EQ(sigaction(SIGCHLD, &before, nullptr), 0);
}

TEST_F(Exec, RestoresTheFlagThatDiscardsStatuses) {
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
