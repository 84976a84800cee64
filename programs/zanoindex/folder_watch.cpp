#include "folder_watch.h"

#include <sys/inotify.h>
#include <sys/stat.h>
#include <sys/vfs.h>
#include <array>
#include <cerrno>
#include <cstring>
#include <system_error>
#include <utility>

namespace zano::index {
namespace {

constexpr std::uint32_t kEvents = IN_CLOSE_WRITE | IN_CREATE | IN_DELETE | IN_MOVED_FROM |
                                  IN_MOVED_TO | IN_DELETE_SELF | IN_MOVE_SELF | IN_ONLYDIR |
                                  IN_DONT_FOLLOW | IN_EXCL_UNLINK;

struct SharedSystem {
    std::uint32_t type;
    const char *name;
};

/* File systems that other machines, or programs behind them, change without this machine's
 * kernel knowing. */
constexpr std::array kSharedSystems = {
    SharedSystem{0x00006969, "NFS"},  SharedSystem{0x0000517B, "SMB"},
    SharedSystem{0xFF534D42, "CIFS"}, SharedSystem{0xFE534D42, "SMB"},
    SharedSystem{0x65735546, "FUSE"}, SharedSystem{0x01021997, "9p"},
    SharedSystem{0x5346414F, "AFS"},  SharedSystem{0x00C36400, "Ceph"},
    SharedSystem{0x73757245, "Coda"}, SharedSystem{0x786F4256, "a virtual machine's host"},
};

/* Null for a file system whose every change the kernel sees. */
const char *sharedSystemName(int descriptor) {
    struct statfs status = {};
    if (fstatfs(descriptor, &status) != 0) {
        return nullptr;
    }
    for (const auto &row : kSharedSystems) {
        if (row.type == static_cast<std::uint32_t>(status.f_type)) {
            return row.name;
        }
    }
    return nullptr;
}

/* A link is whole when it is made; any other new file is not before it is closed. */
bool isWholeWhenCreated(const std::string &path) {
    struct stat status = {};
    return lstat(path.c_str(), &status) == 0 && (S_ISLNK(status.st_mode) || status.st_nlink > 1);
}

std::string reasonOf(int error) {
    if (error == ENOSPC) {
        return "the limit of watched folders is reached; raise it with "
               "'sysctl fs.inotify.max_user_watches=N'";
    }
    return std::strerror(error);
}

}  // namespace

FolderWatch::FolderWatch(Warn warn)
    : inotify_(inotify_init1(IN_CLOEXEC | IN_NONBLOCK)), warn_(std::move(warn)) {
    if (!inotify_) {
        throw std::system_error(errno, std::generic_category(), "watching folders");
    }
}

void FolderWatch::warnOnce(const std::string &path, const std::string &reason) {
    if (warnings_.insert(reason).second) {
        warn_(path, reason);
    }
}

void FolderWatch::add(const std::string &path, int descriptor) {
    if (const char *name = sharedSystemName(descriptor)) {
        warnOnce(path, std::string("lies on ") + name +
                           ", where changes made by other machines cannot be watched; they are "
                           "found by the next scan");
    }
    const int watch = inotify_add_watch(inotify_.get(), path.empty() ? "/" : path.c_str(), kEvents);
    if (watch < 0) {
        if (errno != ENOENT && errno != ENOTDIR) {
            warnOnce(path, "cannot be watched, and further ones neither: " + reasonOf(errno));
        }
        return;
    }
    // A folder that was moved keeps its watch but not its path.
    const auto former = paths_.find(watch);
    if (former != paths_.end()) {
        watches_.erase(former->second);
    }
    paths_[watch] = path;
    watches_[path] = watch;
}

/* Ends the watches of a folder and of those below it. */
void FolderWatch::forget(const std::string &path) {
    const auto below = path + '/';
    auto it = watches_.lower_bound(path);
    while (it != watches_.end() && it->first.compare(0, path.size(), path) == 0) {
        if (it->first != path && it->first.compare(0, below.size(), below) != 0) {
            ++it;
            continue;
        }
        inotify_rm_watch(inotify_.get(), it->second);
        paths_.erase(it->second);
        it = watches_.erase(it);
    }
}

void FolderWatch::handle(const inotify_event &event, FolderChanges &changes) {
    constexpr std::uint32_t kGone = IN_DELETE_SELF | IN_MOVE_SELF | IN_UNMOUNT | IN_IGNORED;
    if ((event.mask & IN_Q_OVERFLOW) != 0) {
        changes.isLossy = true;
        return;
    }
    const auto found = paths_.find(event.wd);
    if (found == paths_.end()) {
        return;
    }
    if ((event.mask & kGone) != 0) {
        handleGone(event.wd, std::string(found->second));
    } else if (event.len > 0 && event.name[0] != '.') {
        handleEntry(event.mask, found->second + '/' + static_cast<const char *>(event.name),
                    changes);
    }
}

/* What a folder held that is gone is no news of its own: its parent tells of a deletion, and an
 * unmounted disk has lost nothing. Another folder may have its path by now. */
void FolderWatch::handleGone(int watch, const std::string &folder) {
    if (watches_[folder] == watch) {
        forget(folder);
    }
    paths_.erase(watch);
}

void FolderWatch::handleEntry(std::uint32_t events, const std::string &path,
                              FolderChanges &changes) {
    const bool isFolder = (events & IN_ISDIR) != 0;
    if (isFolder && (events & (IN_MOVED_FROM | IN_DELETE)) != 0) {
        forget(path);
    }
    const bool isUnfinished = !isFolder && (events & IN_CREATE) != 0;
    if (!isUnfinished || isWholeWhenCreated(path)) {
        changes.paths.insert(path);
    }
}

void FolderWatch::take(FolderChanges &changes) {
    alignas(inotify_event) std::array<char, std::size_t{64} << 10U> bytes;
    for (;;) {
        const auto count = read(inotify_.get(), bytes.data(), bytes.size());
        if (count <= 0) {
            return;
        }
        for (std::size_t at = 0; at < static_cast<std::size_t>(count);) {
            const auto *event = reinterpret_cast<const inotify_event *>(bytes.data() + at);
            handle(*event, changes);
            at += sizeof(inotify_event) + event->len;
        }
    }
}

}  // namespace zano::index
