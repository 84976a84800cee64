#include "folder_walker.h"

#include <dirent.h>
#include <fcntl.h>
#include <algorithm>
#include <cerrno>
#include <climits>
#include <cstring>
#include <memory>
#include <utility>

#include "descriptor.h"
#include "formats.h"

namespace zano::index {
namespace {

/* A row holds this much, and so do the calls that open files. */
constexpr std::size_t kMaxPathBytes = PATH_MAX - 1;

struct CloseFolder {
    void operator()(DIR *folder) const { closedir(folder); }
};
using Folder = std::unique_ptr<DIR, CloseFolder>;

std::int64_t nanoseconds(const timespec &time) {
    return std::int64_t{time.tv_sec} * 1'000'000'000 + time.tv_nsec;
}

mediadb::FileStamp stampOf(const struct stat &status) {
    return {status.st_size, nanoseconds(status.st_mtim), nanoseconds(status.st_ctim)};
}

/* Errors that say that there is no such file, rather than that nobody knows. */
bool isAbsence(int error) {
    return error == ENOENT || error == ENOTDIR || error == ELOOP;
}

bool isHidden(std::string_view name) {
    return name.front() == '.';
}

}  // namespace

FolderWalker::FolderWalker(std::string start, OnFolder onFolder)
    : path_(std::move(start)), onFolder_(std::move(onFolder)) {}

bool FolderWalker::next(FoundFile &file) {
    if (!hasBegun_) {
        begin();
    }
    while (depth_ > 0) {
        Level &level = levels_[depth_ - 1];
        path_.resize(level.pathSize);
        if (level.at == level.entries.size()) {
            --depth_;
            continue;
        }
        const Entry &entry = level.entries[level.at++];
        path_.append(level.name(entry));
        if (path_.back() != '/') {
            file = {path_, entry.stamp};
            return true;
        }
        path_.pop_back();
        enter();
    }
    return false;
}

bool FolderWalker::isUncertain(std::string_view path) const {
    if (failed_.empty()) {
        return false;
    }
    while (!path.empty() && !failed_.contains(std::string(path))) {
        path = path.substr(0, path.rfind('/'));
    }
    return failed_.contains(std::string(path));
}

void FolderWalker::begin() {
    hasBegun_ = true;
    struct stat status = {};
    if (path_.empty() || (lstat(path_.c_str(), &status) == 0 && S_ISDIR(status.st_mode))) {
        enter();
        hasStart_ = depth_ > 0 || !failures_.empty();
        return;
    }
    // One file: as if it were all that its folder holds.
    const bool isLink = S_ISLNK(status.st_mode);
    const auto name = path_.substr(path_.rfind('/') + 1);
    if (isHidden(name) || stat(path_.c_str(), &status) != 0) {
        return;
    }
    path_.resize(path_.size() - name.size());
    hasStart_ = addTarget(pushLevel(), name, status, isLink);
}

FolderWalker::Level &FolderWalker::pushLevel() {
    if (levels_.size() == depth_) {
        levels_.emplace_back();
    }
    Level &level = levels_[depth_++];
    level.pathSize = path_.size();
    level.names.clear();
    level.entries.clear();
    level.at = 0;
    return level;
}

void FolderWalker::enter() {
    // By its path, not by its parent's descriptor: a deep tree would use them all up.
    Descriptor folder(open(path_.empty() ? "/" : path_.c_str(),
                           O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC | O_NONBLOCK));
    if (!folder) {
        if (!isAbsence(errno)) {
            fail(path_, errno);
        }
        return;
    }
    if (onFolder_) {
        onFolder_(path_, folder.get());
    }
    readEntries(folder.release());
}

/* Takes over the descriptor. */
void FolderWalker::readEntries(int descriptor) {
    const Folder folder(fdopendir(descriptor));
    if (!folder) {
        const Descriptor closing(descriptor);
        fail(path_, errno);
        return;
    }
    const auto folderPath = path_;
    path_.push_back('/');
    Level &level = pushLevel();
    errno = 0;
    while (const auto *entry = readdir(folder.get())) {
        if (!isHidden(entry->d_name) &&
            !addEntry(level, descriptor, entry->d_name, entry->d_type)) {
            break;
        }
        errno = 0;
    }
    if (errno != 0) {
        fail(folderPath, errno);
    }
    std::sort(level.entries.begin(), level.entries.end(),
              [&](const Entry &a, const Entry &b) { return level.name(a) < level.name(b); });
}

/* false, with errno set, when nothing can be learned of the entries of this folder. */
bool FolderWalker::addEntry(Level &level, int descriptor, std::string_view name,
                            unsigned char type) {
    const bool isWanted = formatOfName(name) != Format::kNone || isPlaylistName(name);
    const bool canMatter = type == DT_LNK || type == DT_UNKNOWN || (type == DT_REG && isWanted);
    if (type == DT_DIR) {
        add(level, std::string(name) + '/', {});
    }
    if (!canMatter) {
        return true;
    }
    struct stat status = {};
    bool isLink = type == DT_LNK;
    if (type == DT_UNKNOWN && fstatat(descriptor, name.data(), &status, AT_SYMLINK_NOFOLLOW) == 0) {
        isLink = S_ISLNK(status.st_mode);
    }
    if (fstatat(descriptor, name.data(), &status, 0) == 0) {
        addTarget(level, name, status, isLink);
    } else if (errno == EACCES && !isLink) {
        return false;
    } else if (!isAbsence(errno) && isWanted) {
        fail(path_ + std::string(name), errno);
    }
    return true;
}

bool FolderWalker::addTarget(Level &level, std::string_view name, const struct stat &status,
                             bool isLink) {
    if (S_ISDIR(status.st_mode) && isLink) {
        if (skippedLinks_++ == 0) {
            firstSkippedLink_ = path_ + std::string(name);
        }
        return false;
    }
    if (S_ISDIR(status.st_mode)) {
        add(level, std::string(name) + '/', {});
        return true;
    }
    if (S_ISREG(status.st_mode) && isPlaylistName(name)) {
        if (isWithinBounds(path_.size(), name)) {
            playlists_.push_back(path_ + std::string(name));
        }
        return true;
    }
    if (!S_ISREG(status.st_mode) || formatOfName(name) == Format::kNone) {
        return false;
    }
    add(level, name, stampOf(status));
    return true;
}

void FolderWalker::add(Level &level, std::string_view name, const mediadb::FileStamp &stamp) {
    if (!isWithinBounds(level.pathSize, name)) {
        return;
    }
    level.entries.push_back({level.names.size(), name.size(), stamp});
    level.names.append(name);
}

bool FolderWalker::isWithinBounds(std::size_t pathSize, std::string_view name) {
    const bool isWithin = pathSize + name.size() <= kMaxPathBytes;
    if (!isWithin) {
        fail(path_ + std::string(name), ENAMETOOLONG);
    }
    return isWithin;
}

void FolderWalker::fail(std::string path, int error) {
    failed_.insert(path);
    failures_.push_back({std::move(path), error});
}

}  // namespace zano::index
