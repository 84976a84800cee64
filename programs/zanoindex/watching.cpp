#include "watching.h"

#include <poll.h>
#include <array>
#include <chrono>

namespace zano::index {
namespace {

using Clock = std::chrono::steady_clock;

/* Copying an album makes many changes; they are indexed together once it has been quiet for
 * this long, or after the longest delay when it never is. */
constexpr std::chrono::milliseconds kQuiet(300);
constexpr std::chrono::seconds kLongestDelay(5);

/* true when something happened, false after a quiet time; waits for ever when isIdle. */
bool waitForChange(const FolderWatch &watch, const StopRequest &stop, bool isIdle) {
    std::array<pollfd, 2> sources = {pollfd{watch.descriptor(), POLLIN, 0},
                                     pollfd{stop.descriptor(), POLLIN, 0}};
    const int timeout = isIdle ? -1 : static_cast<int>(kQuiet.count());
    return poll(sources.data(), sources.size(), timeout) != 0;
}

/* Without those that lie below another. */
std::vector<std::string> outermost(const std::set<std::string> &paths) {
    std::vector<std::string> result;
    for (const auto &path : paths) {
        auto parent = path.substr(0, path.rfind('/'));
        while (!parent.empty() && !paths.contains(parent)) {
            parent.resize(parent.rfind('/'));
        }
        if (parent.empty()) {
            result.push_back(path);
        }
    }
    return result;
}

/* Collects until it is quiet. Empty after a stop request, or when nothing is watched. */
FolderChanges nextChanges(FolderWatch &watch, const StopRequest &stop) {
    FolderChanges changes;
    Clock::time_point first;
    while (!stop.isMade() && watch.size() > 0) {
        const bool wasEmpty = changes.isEmpty();
        const bool hasMore = waitForChange(watch, stop, wasEmpty);
        watch.take(changes);
        if (wasEmpty) {
            first = Clock::now();
        }
        if (!changes.isEmpty() && (!hasMore || Clock::now() - first > kLongestDelay)) {
            return changes;
        }
    }
    return stop.isMade() ? FolderChanges() : changes;
}

bool hasNews(const Summary &summary) {
    return summary.added + summary.updated + summary.removed + summary.playlistsAdded +
                   summary.playlistsRemoved >
               0 ||
           !summary.failed.empty() || !summary.folders.empty();
}

}  // namespace

bool followChanges(FolderWatch &watch, Session &session, Indexer &indexer,
                   const std::vector<std::string> &folders, const std::function<void()> &onChange) {
    for (;;) {
        const auto changes = nextChanges(watch, session.stop);
        if (changes.isEmpty()) {
            return session.stop.isMade();
        }
        session.summary = Summary();
        if (changes.isLossy) {
            session.progress.message("too much changed at once; all is scanned again");
            indexer.scan(folders);
        } else {
            indexer.refresh(outermost(changes.paths));
        }
        if (hasNews(session.summary)) {
            onChange();
        }
    }
}

}  // namespace zano::index
