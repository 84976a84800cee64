/* Commands, and work in processes of its own, that tests run. */
#pragma once

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cstdio>
#include <functional>
#include <string>
#include <vector>

namespace process {

struct Outcome {
    int status;        // of the exit
    std::string text;  // what went to standard output
};

/* Runs a command of the shell to its end. */
inline Outcome run(const std::string &command) {
    std::FILE *const output = popen(command.c_str(), "r");
    std::string text;
    std::array<char, 4096> part{};
    for (size_t size = 1; size > 0;) {
        size = std::fread(part.data(), 1, part.size(), output);
        text.append(part.data(), size);
    }
    return {WEXITSTATUS(pclose(output)), text};
}

/* What a command writes that has to succeed. */
inline std::string textOf(const std::string &command) {
    const Outcome outcome = run(command);
    EXPECT_EQ(outcome.status, 0) << command << '\n' << outcome.text;
    return outcome.text;
}

/* Waits for a child: its exit code, or 128 and the number of the signal. */
inline int statusOf(pid_t child) {
    int status = 0;
    EXPECT_EQ(waitpid(child, &status, 0), child);
    return WIFSIGNALED(status) ? 128 + WTERMSIG(status) : WEXITSTATUS(status);
}

/* A child whose exit code is the result of the work; 99 when that throws. */
inline pid_t start(const std::function<int()> &work) {
    const pid_t child = fork();
    if (child == 0) {
        try {
            _exit(work());
        } catch (const std::exception &error) {
            std::fprintf(stderr, "%s\n", error.what());
            _exit(99);
        }
    }
    return child;
}

/* The work in so many children at once, which are told their numbers; each has to give 0. */
inline void runAtOnce(int count, const std::function<int(int number)> &work) {
    std::vector<pid_t> children;
    for (int number = 0; number < count; ++number) {
        children.push_back(start([&] { return work(number); }));
    }
    for (const pid_t child : children) {
        EXPECT_EQ(statusOf(child), 0);
    }
}

}  // namespace process
