/* Runs the built vorelix against a media database of the test's own.
 *
 * The program finds its database in the settings file below the build's root, which all tests
 * share: ctest runs the cases that use this with the resource lock "root". */
#pragma once

#include <gtest/gtest.h>
#include <json/value.h>
#include <sys/types.h>

#include <filesystem>
#include <map>
#include <string>
#include <vector>

#include "mediadb/catalogue.h"

namespace command_line {

struct Ended {
    int status;  // exit code, or 128 and the number of the signal
    std::string out;
    std::string err;
};

/* What standard output of the program is. */
enum class Output { File, ClosedPipe, Full, Terminal };

struct Invocation {
    std::vector<std::string> arguments;
    std::map<std::string, std::string> environment = {};  // nothing else is set
    Output output = Output::File;
    unsigned short columns = 0;  // of the terminal
    std::string input = {};
    unsigned long fileSizeLimit = 0;  // in bytes, as of a full disk; 0: none
};

Ended run(const Invocation &invocation);

/* Without its output, and without waiting for it. */
pid_t start(const Invocation &invocation);

/* As Ended::status. */
int statusOf(pid_t child);

/* Each test starts without a database and with a setting that names where it would be. */
class CommandLine : public testing::Test {
  protected:
    CommandLine();
    ~CommandLine() override;

    /* Makes the database with these songs; their ids count from 1. */
    void fill(const std::vector<zano::mediadb::Song> &songs) const;

    /* Runs with --json and gives the document; fails the test when there is none. */
    static Json::Value answerOf(std::vector<std::string> arguments);

    std::filesystem::path folder_;
    std::filesystem::path database_;  // a file of SQLite
    std::string location_;
};

}  // namespace command_line
