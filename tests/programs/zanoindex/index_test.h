/* Runs zanoindex as a user would, each test with a folder of music and a database of its own. */
#pragma once

#include <gtest/gtest.h>
#include <vorelix/records.h>
#include <filesystem>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "mediadb/catalogue.h"
#include "mediadb/engine.h"
#include "mediadb/query/columns.h"
#include "support/files.h"
#include "support/json.h"
#include "support/program.h"
#include "support/text.h"

namespace zano::index {

namespace fs = std::filesystem;

using json::parsed;
using program::Ended;
using program::Process;
using text::contains;
using Lines = std::vector<std::string>;

class IndexTest : public testing::Test, protected files::Folder {
  protected:
    IndexTest();

    static std::string sample(const std::string &suffix);

    /* Puts a sample below the music folder; gives its path. */
    std::string add(const std::string &name, const std::string &suffix = "mp3") const;

    std::string music() const { return path("music"); }
    std::string databaseFile() const { return path("media.db"); }
    const std::string &location() const { return location_; }
    std::unique_ptr<mediadb::Engine> engine() const { return mediadb::makeEngine(location()); }

    /* The arguments with the database's in front. */
    std::vector<std::string> argumentsOf(const std::vector<std::string> &arguments) const;
    Ended run(const std::vector<std::string> &arguments) const;
    /* What a run says that has to fail. */
    std::string failsAt(const std::vector<std::string> &arguments) const;
    Ended runFaulty(const std::vector<std::string> &arguments) const;
    /* Runs with --json and gives the summary; the exit code must be the expected one. */
    Json::Value summaryOf(std::vector<std::string> arguments, int status = 0) const;

    /* All songs in order of their paths, each as one line: path below the music folder, title,
     * artist, album, album artist, genre, year, track, disc, with | between. */
    std::vector<std::string> songs() const;
    /* The paths only; and with them the sound: "a.mp3 1.0 s 64000 bit/s 44100 Hz". */
    std::vector<std::string> paths() const;
    std::vector<std::string> sounds() const;

    /* All playlists in order of their paths: "path below the music folder|title|folder". */
    std::vector<std::string> playlists() const;

  private:
    std::vector<std::string> rows(const std::function<std::string(const ZANO_MEDIA_INFO &)> &toLine,
                                  const char *select = nullptr,
                                  mediadb::Table table = mediadb::Table::Songs) const;
    std::string nameOf(const ZANO_MEDIA_INFO &row) const;

    std::string location_;
};

/* "added 1, unchanged 3": what there is of added, updated, unchanged, removed, kept, failed. */
std::string counts(const Json::Value &summary);

}  // namespace zano::index
