#include "indexer.h"

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstring>
#include <filesystem>
#include <utility>

#include "text.h"

namespace zano::index {
namespace {

constexpr std::size_t kBatchRemovals = 5000;

std::string songs(std::int64_t count) {
    return std::to_string(count) + (count == 1 ? " song" : " songs");
}

std::string normalised(const std::string &folder) {
    auto path = std::filesystem::weakly_canonical(std::filesystem::absolute(folder)).string();
    while (!path.empty() && path.back() == '/') {
        path.pop_back();
    }
    return path;
}

void append(std::vector<std::string> &all, const std::vector<std::string> &more) {
    all.insert(all.end(), more.begin(), more.end());
}

bool isBelow(const std::string &path, const std::string &folder) {
    return path.size() > folder.size() && path[folder.size()] == '/' &&
           path.compare(0, folder.size(), folder) == 0;
}

/* Adds the time from its making to its end to the summary. */
class Stopwatch {
  public:
    explicit Stopwatch(Session &session) : session_(session) {}
    Stopwatch(const Stopwatch &) = delete;
    Stopwatch &operator=(const Stopwatch &) = delete;
    ~Stopwatch() {
        const std::chrono::duration<double> passed = std::chrono::steady_clock::now() - start_;
        session_.summary.seconds += passed.count();
        session_.summary.isStopped = session_.stop.isMade();
    }

  private:
    Session &session_;
    std::chrono::steady_clock::time_point start_ = std::chrono::steady_clock::now();
};

}  // namespace

std::vector<std::string> normalisedFolders(const std::vector<std::string> &folders) {
    std::vector<std::string> paths;
    std::transform(folders.begin(), folders.end(), std::back_inserter(paths), normalised);
    std::sort(paths.begin(), paths.end());
    paths.erase(std::unique(paths.begin(), paths.end()), paths.end());
    const auto all = paths;
    std::erase_if(paths, [&](const std::string &path) {
        return std::any_of(all.begin(), all.end(),
                           [&](const std::string &other) { return isBelow(path, other); });
    });
    return paths;
}

Indexer::Indexer(Session &session, IndexOptions options)
    : session_(session),
      options_(std::move(options)),
      planner_(session, {options_.rereadAll, options_.onFolder}) {}

void Indexer::scan(const std::vector<std::string> &folders) {
    const Stopwatch stopwatch(session_);
    Plan plan;
    for (const auto &folder : folders) {
        planFolder(folder, plan);
    }
    carryOut(plan);
}

void Indexer::refresh(const std::vector<std::string> &paths) {
    const Stopwatch stopwatch(session_);
    Plan plan;
    for (const auto &path : paths) {
        auto comparison = planner_.compare(path, plan.toRead);
        plan.vanished.push_back(std::move(comparison.vanished));
        append(plan.newPlaylists, comparison.newPlaylists);
        append(plan.vanishedPlaylists, comparison.vanishedPlaylists);
    }
    carryOut(plan);
}

void Indexer::planFolder(const std::string &folder, Plan &plan) {
    auto comparison = planner_.compare(folder, plan.toRead);
    if (session_.stop.isMade()) {
        return;
    }
    append(plan.newPlaylists, comparison.newPlaylists);
    const bool isEmpty = comparison.found == 0 && !comparison.hasPlaylists;
    if (mustKeep(folder, comparison)) {
        session_.summary.kept += static_cast<std::int64_t>(comparison.vanished.size());
    } else {
        plan.vanished.push_back(std::move(comparison.vanished));
        if (!isEmpty || options_.prune) {
            append(plan.vanishedPlaylists, comparison.vanishedPlaylists);
        }
    }
}

/* Says why, when it is so. */
bool Indexer::mustKeep(const std::string &folder, const Comparison &comparison) {
    const auto gone = static_cast<std::int64_t>(comparison.vanished.size());
    if (!comparison.hasStart && comparison.known == 0) {
        struct stat status = {};
        const bool exists = lstat(folder.c_str(), &status) == 0;
        session_.folderFailed(folder, exists ? "neither a folder nor a file of audio or a playlist"
                                             : std::strerror(errno));
        return false;
    }
    if (options_.prune || gone * 2 <= comparison.known) {
        return false;
    }
    std::string reason = "more than half of its songs are gone (" + std::to_string(gone) + " of " +
                         songs(comparison.known) + ")";
    if (!comparison.hasStart) {
        reason = "it is missing";
    } else if (comparison.found == 0) {
        reason = "it holds no audio files any more";
    }
    session_.folderFailed(folder, reason + ", so " + songs(gone) +
                                      " that were not found stay listed; if a disk is not "
                                      "mounted, mount it and run again, or run again with "
                                      "--prune to remove them");
    return true;
}

void Indexer::carryOut(const Plan &plan) {
    if (session_.stop.isMade()) {
        return;
    }
    for (const auto &vanished : plan.vanished) {
        remove(vanished);
    }
    updatePlaylists(plan);
    if (!plan.toRead.isEmpty()) {
        TagPhase(session_, plan.toRead, options_.reading).run();
    }
    finish();
}

void Indexer::remove(const PathList &vanished) {
    PathList::Reader reader(vanished);
    auto file = reader.next();
    while (file && !session_.stop.isMade()) {
        Batch batch(session_.catalogue);
        std::int64_t removed = 0;
        for (std::size_t i = 0; file && i < kBatchRemovals; ++i, file = reader.next()) {
            removed += session_.catalogue.removeSong(file->path) ? 1 : 0;
        }
        batch.commit();
        session_.summary.removed += removed;
    }
}

/* A playlist is named by its file; its entries are read when it is asked for. */
void Indexer::updatePlaylists(const Plan &plan) {
    if (session_.stop.isMade() || (plan.newPlaylists.empty() && plan.vanishedPlaylists.empty())) {
        return;
    }
    Batch batch(session_.catalogue);
    for (const auto &path : plan.newPlaylists) {
        const auto folder = std::string_view(path).substr(0, path.rfind('/'));
        session_.catalogue.addPlaylist(
            {path, titleOfPath(path), storableText(folder.substr(folder.rfind('/') + 1))});
    }
    for (const auto &path : plan.vanishedPlaylists) {
        session_.catalogue.removePlaylist(path);
    }
    batch.commit();
    session_.summary.playlistsAdded += static_cast<std::int64_t>(plan.newPlaylists.size());
    session_.summary.playlistsRemoved += static_cast<std::int64_t>(plan.vanishedPlaylists.size());
}

/* Also after a scan that found nothing new: an earlier one may have been killed before this. */
void Indexer::finish() {
    if (!session_.stop.isMade()) {
        session_.catalogue.finish(
            [&](int done, int total) { session_.progress.show(Phase::kIndexing, done, total); });
    }
    session_.progress.clear();
}

}  // namespace zano::index
