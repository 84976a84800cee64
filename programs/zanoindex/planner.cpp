#include "planner.h"

#include <cstring>
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

Planner::Planner(Session &session, Options options)
    : session_(session), options_(std::move(options)) {}

void Planner::noteFound(Comparison &comparison) {
    ++comparison.found;
    session_.progress.show(Phase::kLooking, ++session_.summary.files, 0);
}

void Planner::noteKnown(const FoundFile &file, const mediadb::FileStamp &known, PathList &toRead) {
    const bool isTrusted = !options_.rereadAll;
    if (isTrusted && known == file.stamp) {
        ++session_.summary.unchanged;
    } else if (isTrusted && known == faultyStamp(file.stamp)) {
        session_.fileFailed(std::string(file.path), kStillFaulty);
    } else {
        toRead.add(file.path, file.stamp, true);
    }
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

Comparison Planner::compare(const std::string &start, PathList &toRead) {
    Comparison comparison;
    FolderWalker walker(start, options_.onFolder);
    FoundFile file;
    bool hasFile = false;
    const auto advance = [&] {
        hasFile = !session_.stop.isMade() && walker.next(file);
        if (hasFile) {
            noteFound(comparison);
        }
    };
    const auto compareRow = [&](std::string_view path, const mediadb::FileStamp &known) {
        ++comparison.known;
        while (hasFile && file.path < path) {
            toRead.add(file.path, file.stamp, false);
            advance();
        }
        if (hasFile && file.path == path) {
            noteKnown(file, known, toRead);
            advance();
        } else if (walker.isUncertain(path)) {
            ++session_.summary.kept;
        } else {
            comparison.vanished.add(path, known, true);
        }
    };
    advance();
    session_.catalogue.forEachFile(start, compareRow);
    while (hasFile) {
        toRead.add(file.path, file.stamp, false);
        advance();
    }
    comparison.hasStart = walker.hasStart();
    reportProblems(walker);
    return comparison;
}

}  // namespace zano::index
