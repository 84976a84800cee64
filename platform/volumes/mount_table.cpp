#include "mount_table.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <unistd.h>
#include <zanoplatform/volumes.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>
#include <cstdlib>
#include <filesystem>
#include <vector>

namespace zano::volumes {
namespace {

constexpr auto kNone = std::string_view::npos;

/* A device of the mapper may stand on another, and that on a third. */
constexpr int kMaxDepth = 8;

/* A playlist's worth of folders. */
constexpr std::size_t kMaxFolders = 4096;
/* So many looks at files cost about what a look at their folder does. */
constexpr int kManyFiles = 16;

constexpr std::array<std::string_view, 16> kNetworkFileSystems = {
    "9p",          "afs",       "ceph",          "cifs",
    "davfs",       "fuse.ceph", "fuse.davfs2",   "fuse.glusterfs",
    "fuse.rclone", "fuse.s3fs", "fuse.smbnetfs", "fuse.sshfs",
    "nfs",         "nfs4",      "smb3",          "smbfs"};

class ProcessMounts : public MountSource {
  public:
    ProcessMounts() : descriptor_(open("/proc/self/mountinfo", O_RDONLY | O_CLOEXEC)) {}
    ~ProcessMounts() override {
        if (descriptor_ != -1) {
            close(descriptor_);
        }
    }
    ProcessMounts(const ProcessMounts &) = delete;
    ProcessMounts &operator=(const ProcessMounts &) = delete;

    bool hasChanged() override {
        pollfd watched{descriptor_, POLLPRI, 0};
        return !isRead_ || poll(&watched, 1, 0) != 0;
    }

    std::optional<std::string> contents() override {
        isRead_ = false;
        std::string text;
        std::array<char, 16384> part;
        if (lseek(descriptor_, 0, SEEK_SET) == -1) {
            return std::nullopt;
        }
        for (;;) {
            const ssize_t taken = read(descriptor_, part.data(), part.size());
            if (taken == -1 && errno == EINTR) {
                continue;
            }
            if (taken == -1) {
                return std::nullopt;
            }
            if (taken == 0) {
                isRead_ = true;
                return text;
            }
            text.append(part.data(), static_cast<std::size_t>(taken));
        }
    }

  private:
    int descriptor_;
    bool isRead_ = false;
};

std::string_view takeWord(std::string_view &text) {
    const std::string_view word = text.substr(0, text.find(' '));
    text.remove_prefix(std::min(word.size() + 1, text.size()));
    return word;
}

/* With \040 and the like, by which the kernel writes blanks, read. */
std::string unescaped(std::string_view text) {
    std::string plain;
    const auto isOctal = [](char c) { return c >= '0' && c <= '7'; };
    while (!text.empty()) {
        const bool isEscape = text.size() >= 4 && text[0] == '\\' && isOctal(text[1]) &&
                              isOctal(text[2]) && isOctal(text[3]);
        const int value = isEscape ? (text[1] - '0') * 64 + (text[2] - '0') * 8 + text[3] - '0' : 0;
        plain.push_back(isEscape ? static_cast<char>(value) : text.front());
        text.remove_prefix(isEscape ? 4 : 1);
    }
    return plain;
}

struct FreeText {
    void operator()(char *text) const { std::free(text); }
};

std::optional<std::string> realPath(const std::string &path) {
    const std::unique_ptr<char, FreeText> text(realpath(path.c_str(), nullptr));
    return text ? std::optional<std::string>(text.get()) : std::nullopt;
}

/* Without the last step; "/" at the end. */
std::string parentOf(const std::string &path) {
    const std::size_t name = path.find_last_not_of('/');
    const std::size_t slash = name == kNone ? kNone : path.rfind('/', name);
    const std::size_t end = slash == kNone ? kNone : path.find_last_not_of('/', slash);
    return end == kNone ? "/" : path.substr(0, end + 1);
}

/* Of a path that does not exist, that of the nearest parent that does. */
std::string nearestRealPath(std::string path) {
    auto real = realPath(path);
    while (!real && path != "/") {
        path = parentOf(path);
        real = realPath(path);
    }
    return real.value_or("/");
}

bool isLink(const std::string &path) {
    char target = 0;
    return readlink(path.c_str(), &target, 1) != -1;
}

/* The names of the links in a folder. */
std::unordered_set<std::string> linksIn(const std::string &folder) {
    namespace fs = std::filesystem;
    std::unordered_set<std::string> names;
    std::error_code failed;  // there are none in a folder that is not there
    for (fs::directory_iterator at(folder, failed), end; !failed && at != end;
         at.increment(failed)) {
        std::error_code unknown;
        if (at->is_symlink(unknown)) {
            names.insert(at->path().filename().string());
        }
    }
    return names;
}

}  // namespace

std::unique_ptr<MountSource> processMounts() {
    return std::make_unique<ProcessMounts>();
}

std::optional<Volume> MountTable::volumeOf(const std::string &path) {
    const std::lock_guard lock(mutex_);
    if (!refresh()) {
        return std::nullopt;
    }
    Mounts::value_type *found =
        isPlain(path) ? mountOfPlain(path) : mountAbove(nearestRealPath(path));
    if (found == nullptr) {
        return std::nullopt;
    }
    auto &[mountPoint, mount] = *found;
    if (mount.type == 0) {
        mount.type = typeOf(mount);
    }
    return Volume{mountPoint, mount.type};
}

/* "/." and the like name another folder than the one that they stand in. */
bool MountTable::isPlain(std::string_view path) {
    return path.back() != '/' && !path.ends_with("/.") && !path.ends_with("/..");
}

MountTable::Mounts::value_type *MountTable::mountOfPlain(const std::string &path) {
    const std::size_t slash = path.rfind('/');
    const std::string name = path.substr(slash + 1);
    Folder &folder = folderOf(path.substr(0, slash));
    if (isLinkIn(folder, path, name)) {
        return mountAbove(nearestRealPath(path));
    }
    if (!folder.isThere) {
        return folder.mount;
    }
    const auto onItself = mounts_.find(folder.realPath + "/" + name);
    return onItself != mounts_.end() ? &*onItself : folder.mount;
}

MountTable::Folder &MountTable::folderOf(const std::string &path) {
    const auto [known, isNew] = folders_.try_emplace(path);
    Folder &folder = known->second;
    if (isNew) {
        const auto real = realPath(path.empty() ? "/" : path);
        folder.isThere = real.has_value();
        folder.mount = mountAbove(real ? *real : nearestRealPath(path));
        folder.realPath = real && *real != "/" ? *real : "";
    }
    return folder;
}

/* Asked about many files of a folder, its links are listed once instead of looked for each time. */
bool MountTable::isLinkIn(Folder &folder, const std::string &path, const std::string &name) {
    if (++folder.timesAsked < kManyFiles) {
        return isLink(path);
    }
    if (folder.timesAsked == kManyFiles) {
        folder.links = linksIn(path.substr(0, path.size() - name.size()));
    }
    return folder.links.count(name) != 0;
}

bool MountTable::refresh() {
    const auto now = std::chrono::steady_clock::now();
    if (now < foldersEnd_ && folders_.size() < kMaxFolders) {
        return true;
    }
    folders_.clear();
    foldersEnd_ = now + folderLifetime_;
    if (!source_->hasChanged()) {
        return true;
    }
    mounts_.clear();
    const auto text = source_->contents();
    std::string_view rest = text ? *text : std::string_view();
    while (!rest.empty()) {
        const std::string_view line = rest.substr(0, rest.find('\n'));
        addMount(line);
        rest.remove_prefix(std::min(line.size() + 1, rest.size()));
    }
    foldersEnd_ = text ? foldersEnd_ : std::chrono::steady_clock::time_point();
    return text.has_value();
}

/* "36 35 98:0 /root /mnt rw,noatime master:1 - ext3 /dev/root rw". A later mount on the same
 * point hides the earlier one. */
void MountTable::addMount(std::string_view line) {
    takeWord(line);
    takeWord(line);
    const std::string_view device = takeWord(line);
    takeWord(line);
    const std::string_view mountPoint = takeWord(line);
    const std::size_t separator = line.find(" - ");
    if (separator == kNone || mountPoint.empty()) {
        return;
    }
    line.remove_prefix(separator + 3);
    Mount &mount = mounts_[unescaped(mountPoint)];
    mount = {std::string(device), std::string(takeWord(line)), {}, 0};
    mount.source = unescaped(takeWord(line));
}

MountTable::Mounts::value_type *MountTable::mountAbove(std::string realPath) {
    for (;;) {
        const auto found = mounts_.find(realPath);
        if (found != mounts_.end()) {
            return &*found;
        }
        if (realPath == "/") {
            return nullptr;
        }
        realPath = parentOf(realPath);
    }
}

int MountTable::typeOf(const Mount &mount) const {
    if (std::find(kNetworkFileSystems.begin(), kNetworkFileSystems.end(), mount.fileSystem) !=
        kNetworkFileSystems.end()) {
        return VOLUME_TYPE_NETWORK;
    }
    std::string device = mount.device;
    struct stat source {};
    /* File systems over several devices have a number that is no device's. */
    if (device.substr(0, 2) == "0:" && stat(mount.source.c_str(), &source) == 0 &&
        S_ISBLK(source.st_mode)) {
        device =
            std::to_string(major(source.st_rdev)) + ":" + std::to_string(minor(source.st_rdev));
    }
    return isOnUsb(blockDevices_ + "/" + device, kMaxDepth) ? VOLUME_TYPE_USB
                                                            : VOLUME_TYPE_INTERNAL;
}

/* Encrypted and joined devices stand on others, which the folder "slaves" links to. */
bool MountTable::isOnUsb(const std::string &device, int depth) const {
    const auto real = realPath(device);
    if (!real || depth == 0) {
        return false;
    }
    if (real->find("/usb") != std::string::npos) {
        return true;
    }
    std::error_code failed;  // most devices have no such folder
    for (std::filesystem::directory_iterator at(*real + "/slaves", failed), end;
         !failed && at != end; at.increment(failed)) {
        if (isOnUsb(at->path().string(), depth - 1)) {
            return true;
        }
    }
    return false;
}

}  // namespace zano::volumes
