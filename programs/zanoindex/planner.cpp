#include "planner.h"

#include <algorithm>
#include <cstring>
#include <iterator>
#include <utility>

#include "text.h"

namespace zano::index {
namespace {

constexpr const char *kStillFaulty =
    "it stopped the tag reader before and has not changed since (--reread tries it again)";

}  // namespace

mediadb::FileStamp faultyStamp(mediadb::FileStamp stamp) {
    // Times before 1970 are not what a change time is in practice, so nothing is mistaken.
    stamp.changed = ~stamp.changed;
    return stamp;
}

/* The walk of the disk, which follows the rows of the catalogue. */
class Planner::Merge {
  public:
    Merge(Planner &planner, FolderWalker &walker, PathList &toRead)
        : session_(planner.session_),
          rereadAll_(planner.options_.rereadAll),
          walker_(walker),
          toRead_(toRead) {
        advance();
    }

    void takeRow(std::string_view path, const mediadb::FileStamp &known) {
        ++result_.known;
        while (hasFile_ && file_.path < path) {
            takeNewFile();
        }
        if (hasFile_ && file_.path == path) {
            takeKnownFile(known);
        } else if (walker_.isUncertain(path)) {
            ++session_.summary.kept;
        } else {
            result_.vanished.add(path, known, true);
        }
    }

    Comparison takeRest() {
        while (hasFile_) {
            takeNewFile();
        }
        result_.hasStart = walker_.hasStart();
        return std::move(result_);
    }

  private:
    void advance() {
        hasFile_ = !session_.stop.isMade() && walker_.next(file_);
        if (hasFile_) {
            ++result_.found;
            session_.progress.show(Phase::kLooking, ++session_.summary.files, 0);
        }
    }

    void takeNewFile() {
        toRead_.add(file_.path, file_.stamp, false);
        advance();
    }

    void takeKnownFile(const mediadb::FileStamp &known) {
        if (!rereadAll_ && known == file_.stamp) {
            ++session_.summary.unchanged;
        } else if (!rereadAll_ && known == faultyStamp(file_.stamp)) {
            session_.fileFailed(std::string(file_.path), kStillFaulty);
        } else {
            toRead_.add(file_.path, file_.stamp, true);
        }
        advance();
    }

    Session &session_;
    bool rereadAll_;
    FolderWalker &walker_;
    PathList &toRead_;
    Comparison result_;
    FoundFile file_;
    bool hasFile_ = false;
};

Planner::Planner(Session &session, Options options)
    : session_(session), options_(std::move(options)) {}

Comparison Planner::compare(const std::string &start, PathList &toRead) {
    FolderWalker walker(start, options_.onFolder);
    Merge merge(*this, walker, toRead);
    session_.catalogue.forEachFile(start,
                                   [&](std::string_view path, const mediadb::FileStamp &known) {
                                       merge.takeRow(path, known);
                                   });
    auto comparison = merge.takeRest();
    comparePlaylists(start, walker, comparison);
    reportProblems(walker);
    return comparison;
}

void Planner::comparePlaylists(const std::string &start, const FolderWalker &walker,
                               Comparison &comparison) {
    std::vector<std::string> found = walker.playlists();
    std::sort(found.begin(), found.end());
    const std::vector<std::string> known = session_.catalogue.playlists(start);
    std::vector<std::string> gone;
    std::set_difference(found.begin(), found.end(), known.begin(), known.end(),
                        std::back_inserter(comparison.newPlaylists));
    std::set_difference(known.begin(), known.end(), found.begin(), found.end(),
                        std::back_inserter(gone));
    std::copy_if(gone.begin(), gone.end(), std::back_inserter(comparison.vanishedPlaylists),
                 [&walker](const std::string &path) { return !walker.isUncertain(path); });
    comparison.hasPlaylists = !found.empty();
}

void Planner::reportProblems(const FolderWalker &walker) {
    for (const auto &failure : walker.failures()) {
        session_.folderFailed(failure.path, std::string("cannot be looked at: ") +
                                                std::strerror(failure.error) +
                                                "; songs known from there are kept");
    }
    if (walker.skippedLinks() > 0) {
        session_.progress.message(std::to_string(walker.skippedLinks()) +
                                  " links to folders were not followed, the first is " +
                                  printable(walker.firstSkippedLink()) +
                                  "; name the folders they lead to as well to index them");
    }
}

}  // namespace zano::index
