/* Finds out what a scan has to do: compares the disk with the catalogue, both in byte order of
 * the paths, in one go and without holding either in memory. */
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "folder_walker.h"
#include "mediadb/catalogue.h"
#include "path_list.h"
#include "session.h"

namespace zano::index {

/* Marks the stamp of a file that stops the tag reader: its row is made from its name alone, and
 * it is not tried again before it changes. */
mediadb::FileStamp faultyStamp(mediadb::FileStamp stamp);

/* One folder, compared. */
struct Comparison {
    bool hasStart = false;
    std::int64_t found = 0;  // files on the disk
    std::int64_t known = 0;  // rows of the catalogue
    PathList vanished;       // the rows without a file
    bool hasPlaylists = false;
    std::vector<std::string> newPlaylists;       // without a row
    std::vector<std::string> vanishedPlaylists;  // rows without a file
};

class Planner {
  public:
    struct Options {
        bool rereadAll = false;
        FolderWalker::OnFolder onFolder;
    };

    Planner(Session &session, Options options);

    /* Compares what is at or below a path. New and changed files go to toRead; counts and
     * problems to the session's summary. Rows that may still have their file, because a folder
     * could not be read, count as kept. A stop request ends it early, and the result is then
     * not to be used. */
    Comparison compare(const std::string &start, PathList &toRead);

  private:
    class Merge;

    void comparePlaylists(const std::string &start, const FolderWalker &walker,
                          Comparison &comparison);
    void reportProblems(const FolderWalker &walker);

    Session &session_;
    Options options_;
};

}  // namespace zano::index
