/* Brings the catalogue up to date with the disk. */
#pragma once

#include <string>
#include <vector>

#include "folder_walker.h"
#include "path_list.h"
#include "planner.h"
#include "session.h"
#include "tag_phase.h"

namespace zano::index {

struct IndexOptions {
    bool prune = false;      // believe that what is gone is gone
    bool rereadAll = false;  // read every file, changed or not
    TagPhase::Options reading;
    FolderWalker::OnFolder onFolder;  // see FolderWalker
};

/* Folders as rows have them: absolute, without links and dots, none inside another. Those that
 * do not exist are made absolute as far as they do. The root of all is "". */
std::vector<std::string> normalisedFolders(const std::vector<std::string> &folders);

class Indexer {
  public:
    /* Keeps references; one thread. Failures of the database throw mediadb::DatabaseError, after
     * which the batches that were committed stay. */
    Indexer(Session &session, IndexOptions options);

    /* Scans normalised folders (or single files). A folder that is missing, or has lost more
     * than half of its songs, loses no row unless options.prune is set: an unmounted disk looks
     * the same. Counts go to session.summary. */
    void scan(const std::vector<std::string> &folders);

    /* The same for paths that are known to have changed: whatever is gone is removed. */
    void refresh(const std::vector<std::string> &paths);

  private:
    struct Plan {
        PathList toRead;
        std::vector<PathList> vanished;
        std::vector<std::string> newPlaylists;
        std::vector<std::string> vanishedPlaylists;
    };

    void planFolder(const std::string &folder, Plan &plan);
    bool mustKeep(const std::string &folder, const Comparison &comparison);
    void carryOut(const Plan &plan);
    void remove(const PathList &vanished);
    void updatePlaylists(const Plan &plan);
    void finish();

    Session &session_;
    IndexOptions options_;
    Planner planner_;
};

}  // namespace zano::index
