/* Runs the built vorelix against a media database of the test's own.
 *
 * The program finds its database in the settings file below the build's root, which all tests
 * share: ctest runs the cases that use this with the resource lock "root". */
#pragma once

#include <gtest/gtest.h>
#include <json/value.h>

#include <filesystem>
#include <map>
#include <string>
#include <vector>

#include "mediadb/catalogue.h"
#include "platform/mediadb/cluster.h"
#include "support/files.h"
#include "support/program.h"
#include "support/text.h"
#include "system_paths_internal.h"

namespace command_line {

using program::Ended;
using program::statusOf;
using text::contains;
using Output = program::Stream;
using Words = std::vector<std::string>;

struct Invocation {
    Words arguments;
    std::map<std::string, std::string> environment = {};  // nothing else is set
    Output output = Output::Kept;
    unsigned short columns = 0;  // of the terminal
    std::string input = {};
    unsigned long fileSizeLimit = 0;  // in bytes, as of a full disk; 0: none
};

Ended run(const Invocation &invocation);

/* Without its output, and without waiting for it. */
pid_t start(const Invocation &invocation);

/* Each test starts without a database and with a setting that names where it would be. */
class CommandLine : public testing::Test {
  protected:
    /* The words stand in front of all that says(), fails() and answerOf() are told. */
    explicit CommandLine(Words front = {});

    /* Makes the database with these songs; their ids count from 1. */
    void fill(const std::vector<zano::mediadb::Song> &songs) const;
    /* With so many songs a, b, ... whose files would be in the folder. */
    void fillWithLetters(int count, const std::filesystem::path &folder) const;

    /* What is printed on standard output; the command has to succeed. */
    std::string says(const Words &words, const std::string &input = "") const;
    /* The error of a command that has to fail, and answers nothing. */
    std::string fails(const Words &words, int status = 1, unsigned long fileSizeLimit = 0) const;
    /* Runs with --json and gives the document; fails the test when there is none. */
    Json::Value answerOf(Words words) const;

  private:
    Words whole(const Words &words) const;

    const Words front_;
    const files::Places places_{ZANO_PATH_CONF};
    files::Folder temporary_;

  protected:
    const std::filesystem::path database_ = temporary_.path("media.db");
    const std::filesystem::path folder_ = database_.parent_path();
    const std::string location_ = zano::mediadb::locationForTest(database_);
};

}  // namespace command_line
