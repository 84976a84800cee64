/* Runs zanoindex as a user would, each test with a folder of music and a database of its own. */
#pragma once

#include <gtest/gtest.h>
#include <json/value.h>
#include <sys/types.h>
#include <vorelix/records.h>
#include <filesystem>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "mediadb/catalogue.h"
#include "mediadb/engine.h"
#include "mediadb/query/columns.h"

namespace zano::index {

namespace fs = std::filesystem;

struct Ended {
    int status = 0;  // exit code, or 128 and the number of the signal
    std::string out;
    std::string err;
    long peakKilobytes = 0;  // of the largest of all processes up to now
};

/* A process; killed if it is still there at the end. */
class Process {
  public:
    enum class Errors { kFile, kTerminal };

    /* argv[0] may be other than the program. */
    Process(const std::string &program, const std::vector<std::string> &argv,
            Errors errors = Errors::kFile, bool mayReadEverything = true);
    Process(const Process &) = delete;
    Process &operator=(const Process &) = delete;
    ~Process();

    pid_t pid() const { return pid_; }
    /* For poll(): hung up when the process has ended. */
    int output() const { return output_; }
    /* The next line of standard output; fails the test when none comes within a minute. */
    std::string readLine();
    Ended wait();

  private:
    bool readMore();

    pid_t pid_ = -1;
    int output_ = -1;
    int errors_ = -1;
    bool isTerminal_ = false;
    std::string out_;
};

class IndexTest : public testing::Test {
  protected:
    IndexTest();
    ~IndexTest() override;

    static std::string sample(const std::string &suffix);

    /* Puts a sample below the music folder; gives its path. */
    std::string add(const std::string &name, const std::string &suffix = "mp3") const;
    static void write(const fs::path &path, const std::string &content);
    static std::string contentOf(const fs::path &path);

    std::string music() const { return folder_ / "music"; }
    fs::path databaseFile() const { return folder_ / "media.db"; }
    const std::string &location() const { return location_; }
    std::unique_ptr<mediadb::Engine> engine() const { return mediadb::makeEngine(location()); }

    /* The arguments with the database's in front. */
    std::vector<std::string> argumentsOf(const std::vector<std::string> &arguments) const;
    Ended run(const std::vector<std::string> &arguments) const;
    Ended runFaulty(const std::vector<std::string> &arguments) const;
    /* Runs with --json and gives the summary; the exit code must be the expected one. */
    Json::Value summaryOf(std::vector<std::string> arguments, int status = 0) const;
    static Json::Value parsed(const std::string &line);

    /* All songs in order of their paths, each as one line: path below the music folder, title,
     * artist, album, album artist, genre, year, track, disc, with | between. */
    std::vector<std::string> songs() const;
    /* The paths only; and with them the sound: "a.mp3 1.0 s 64000 bit/s 44100 Hz". */
    std::vector<std::string> paths() const;
    std::vector<std::string> sounds() const;

    /* All playlists in order of their paths: "path below the music folder|title|folder". */
    std::vector<std::string> playlists() const;

    fs::path folder_;

  private:
    std::vector<std::string> rows(const std::function<std::string(const ZANO_MEDIA_INFO &)> &toLine,
                                  const char *select = nullptr,
                                  mediadb::Table table = mediadb::Table::Songs) const;
    std::string nameOf(const ZANO_MEDIA_INFO &row) const;

    std::string location_;
};

/* "added 1, updated 0, unchanged 3, removed 0, kept 0, failed 0" */
std::string counts(const Json::Value &summary);

}  // namespace zano::index
