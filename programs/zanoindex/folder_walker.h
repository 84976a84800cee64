/* The audio files below a folder, in byte order of their paths, and its playlists.
 *
 * Names that begin with a dot are left out, as is what they hold. Links to files are followed;
 * links to folders are not (so there is no loop and no song twice) but counted. Paths are bytes;
 * those too long for a row of the database are failures. */
#pragma once

#include <sys/stat.h>
#include <cstddef>
#include <functional>
#include <string>
#include <string_view>
#include <unordered_set>
#include <vector>

#include "mediadb/catalogue.h"

namespace zano::index {

struct FoundFile {
    std::string_view path;  // valid until the next call of next()
    mediadb::FileStamp stamp;
};

/* A folder, or a file, of which the system did not say what it is. */
struct WalkFailure {
    std::string path;
    int error = 0;  // an errno value
};

class FolderWalker {
  public:
    /* Called for each folder before its entries are read, with its open descriptor. */
    using OnFolder = std::function<void(const std::string &path, int descriptor)>;

    /* start: an absolute path without a trailing '/' ("" is the root of all): a folder, or one
     * file. That it does not exist is no failure; there is nothing then. */
    explicit FolderWalker(std::string start, OnFolder onFolder = {});

    /* false when there is no more. */
    bool next(FoundFile &file);

    /* Whether start was there when it was looked at. */
    bool hasStart() const { return hasStart_; }

    /* The playlist files met up to now, in no order. */
    const std::vector<std::string> &playlists() const { return playlists_; }

    /* What could not be looked at up to now. */
    const std::vector<WalkFailure> &failures() const { return failures_; }
    /* true for a path at or below a failure: whether it exists is not known. */
    bool isUncertain(std::string_view path) const;

    /* Links to folders, which were not followed; and the first of them. */
    std::size_t skippedLinks() const { return skippedLinks_; }
    const std::string &firstSkippedLink() const { return firstSkippedLink_; }

  private:
    struct Entry {
        std::size_t nameAt = 0;
        std::size_t nameSize = 0;  // of a folder with its '/'
        mediadb::FileStamp stamp;
    };
    /* One open folder on the way to the current file. */
    struct Level {
        std::size_t pathSize = 0;
        std::string names;
        std::vector<Entry> entries;
        std::size_t at = 0;

        std::string_view name(const Entry &entry) const {
            return std::string_view(names).substr(entry.nameAt, entry.nameSize);
        }
    };

    void begin();
    void enter();
    void readEntries(int descriptor);
    bool addEntry(Level &level, int descriptor, std::string_view name, unsigned char type);
    bool addTarget(Level &level, std::string_view name, const struct stat &status, bool isLink);
    void add(Level &level, std::string_view name, const mediadb::FileStamp &stamp);
    bool isWithinBounds(std::size_t pathSize, std::string_view name);
    void fail(std::string path, int error);
    Level &pushLevel();

    std::string path_;
    OnFolder onFolder_;
    bool hasBegun_ = false;
    bool hasStart_ = false;
    std::vector<Level> levels_;  // those beyond depth_ wait to be used again
    std::size_t depth_ = 0;
    std::vector<std::string> playlists_;
    std::vector<WalkFailure> failures_;
    std::unordered_set<std::string> failed_;
    std::size_t skippedLinks_ = 0;
    std::string firstSkippedLink_;
};

}  // namespace zano::index
