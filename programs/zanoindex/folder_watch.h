/* Watches folders for changes, with inotify. */
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <map>
#include <set>
#include <string>
#include <string_view>

#include "descriptor.h"

struct inotify_event;

namespace zano::index {

/* What changed since it was asked for last. */
struct FolderChanges {
    std::set<std::string> paths;  // files and folders that are new, other, or gone
    bool isLossy = false;         // there was too much: anything may have changed
    bool isEmpty() const { return paths.empty() && !isLossy; }
};

class FolderWatch {
  public:
    /* warn: told in words of folders that cannot be watched, each reason once. Throws
     * std::system_error when the system has no watches at all. */
    using Warn = std::function<void(const std::string &path, const std::string &reason)>;
    explicit FolderWatch(Warn warn);

    /* Watches one folder, not those in it; once more is no harm. descriptor: an open descriptor
     * of it. Files that are being written count as changed when they are closed. */
    void add(const std::string &path, int descriptor);

    /* The number of watched folders. */
    std::size_t size() const { return paths_.size(); }

    /* For poll(): readable when take() has something. */
    int descriptor() const { return inotify_.get(); }

    /* Adds what has happened to changes; does not wait. Folders that were moved away or deleted
     * are watched no longer. */
    void take(FolderChanges &changes);

  private:
    void warnOnce(const std::string &path, const std::string &reason);
    void handle(const inotify_event &event, FolderChanges &changes);
    void handleGone(int watch, const std::string &folder);
    void handleEntry(std::uint32_t events, const std::string &path, FolderChanges &changes);
    void forget(const std::string &path);

    Descriptor inotify_;
    Warn warn_;
    std::map<int, std::string> paths_;    // by watch
    std::map<std::string, int> watches_;  // by path
    std::set<std::string> warnings_;
};

}  // namespace zano::index
