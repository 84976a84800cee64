/* Programs that tests run. */
#pragma once

#include <gtest/gtest.h>
#include <sys/wait.h>

#include <array>
#include <cstdio>
#include <string>

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

}  // namespace process
