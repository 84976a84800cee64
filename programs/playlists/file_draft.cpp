#include "file_draft.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>
#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <optional>
#include <thread>

#include "failure.h"
#include "text.h"

namespace vorelix {

namespace {

namespace fs = std::filesystem;

/* Short enough for a name of its own in the folder, with the ending that tells the form. */
std::string draftPathOf(const std::string &file) {
    const fs::path path(file);
    const std::string ending = ".vorelix" + path.extension().string();
    std::string stem = path.stem();
    stem.resize(std::min(stem.size(), size_t{NAME_MAX} - ending.size() - 1));
    return path.parent_path() / ("." + stem + ending);
}

/* What changes when a program writes a file in place or puts another one there. */
struct FileState {
    dev_t device;
    ino_t number;
    off_t size;
    std::int64_t changedNs;
    bool operator==(const FileState &) const = default;
};

/* Null where there is no file. */
std::optional<FileState> stateOf(const std::string &path) {
    struct stat file {};
    if (stat(path.c_str(), &file) != 0) {
        return std::nullopt;
    }
    constexpr std::int64_t kNsOfSecond = 1'000'000'000;
    return FileState{file.st_dev, file.st_ino, file.st_size,
                     file.st_mtim.tv_sec * kNsOfSecond + file.st_mtim.tv_nsec};
}

bool isPast(Deadline deadline) {
    return std::chrono::steady_clock::now() >= deadline;
}

}  // namespace

Deadline deadlineOf(int seconds) {
    return std::chrono::steady_clock::now() + std::chrono::seconds(seconds);
}

std::string reasonOf(int error) {
    return std::strerror(error);
}

std::string withoutLinks(const std::string &path) {
    std::error_code error;
    const fs::path target = fs::canonical(path, error);
    return error ? path : target.string();
}

mode_t modeOfNewFile(mode_t mode) {
    const mode_t mask = umask(0);
    umask(mask);
    return mode & ~mask;
}

FileDraft::FileDraft(const std::string &file, Deadline deadline)
    : file_(file), path_(draftPathOf(file)) {
    try {
        do {
            open();
            while (!tryLock()) {
                if (isPast(deadline)) {
                    throw Failure("could not change " + printable(file_) +
                                      ": another vorelix is changing it; try again, or wait longer "
                                      "with --wait SECONDS",
                                  FailureKind::kBusy);
                }
                std::this_thread::sleep_for(kPause);
            }
        } while (!isUsable());
    } catch (...) {
        close(descriptor_);
        throw;
    }
}

FileDraft::~FileDraft() {
    if (!isDone_ && isNamed()) {
        unlink(path_.c_str());
    }
    close(descriptor_);
}

void FileDraft::open() {
    if (descriptor_ != -1) {
        close(descriptor_);
    }
    descriptor_ = ::open(path_.c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0666);
    if (descriptor_ == -1) {
        throw Failure("could not change " + printable(file_) + ": the draft " + printable(path_) +
                      " cannot be opened: " + reasonOf(errno));
    }
}

bool FileDraft::tryLock() const {
    struct flock lock {};
    lock.l_type = F_WRLCK;
    lock.l_whence = SEEK_SET;
    if (fcntl(descriptor_, F_OFD_SETLK, &lock) == 0) {
        return true;
    }
    if (errno != EAGAIN && errno != EACCES) {
        throwFailure(errno);
    }
    return false;
}

/* Whether what is locked still has the draft's name: the library takes away what it cannot write.
 */
bool FileDraft::isNamed() const {
    struct stat locked {};
    struct stat named {};
    return fstat(descriptor_, &locked) == 0 && stat(path_.c_str(), &named) == 0 &&
           named.st_dev == locked.st_dev && named.st_ino == locked.st_ino;
}

/* A draft with contents is what a killed program left: it may be the very file that the draft is
 * of, by another name. */
bool FileDraft::isUsable() const {
    struct stat locked {};
    if (fstat(descriptor_, &locked) != 0) {
        throwFailure(errno);
    }
    if (!isNamed()) {
        return false;
    }
    if (locked.st_size == 0 && locked.st_nlink == 1) {
        return true;
    }
    if (unlink(path_.c_str()) != 0) {
        throwFailure(errno);
    }
    return false;
}

void FileDraft::throwFailure(int error) const {
    throw Failure("could not write " + printable(file_) + ": " + reasonOf(error) +
                  "; it is as it was");
}

void FileDraft::fill(std::string_view contents) const {
    if (ftruncate(descriptor_, 0) != 0) {
        throwFailure(errno);
    }
    for (off_t end = 0; !contents.empty();) {
        const ssize_t count = pwrite(descriptor_, contents.data(), contents.size(), end);
        if (count < 0) {
            throwFailure(errno);
        }
        contents.remove_prefix(static_cast<size_t>(count));
        end += count;
    }
}

/* Who may not give the file away keeps it: the mode lets those in who were let in before. */
void FileDraft::complete(mode_t modeOfNew) const {
    struct stat old {};
    if (stat(file_.c_str(), &old) != 0) {
        old.st_mode = modeOfNew;
    } else if (fchown(descriptor_, old.st_uid, old.st_gid) != 0 && errno != EPERM) {
        throwFailure(errno);
    }
    if (fchmod(descriptor_, old.st_mode & 0777) != 0 || fsync(descriptor_) != 0) {
        throwFailure(errno);
    }
}

void FileDraft::throwWhenFull() const {
    const std::array<char, 1U << 16> more{};
    const off_t end = lseek(descriptor_, 0, SEEK_END);
    size_t written = 0;
    while (written < more.size()) {
        const ssize_t got = pwrite(descriptor_, more.data(), more.size() - written,
                                   end + static_cast<off_t>(written));
        if (got < 0) {
            throwFailure(errno);
        }
        written += static_cast<size_t>(got);
    }
}

void FileDraft::putAsNew() {
    if (renameat2(AT_FDCWD, path_.c_str(), AT_FDCWD, file_.c_str(), RENAME_NOREPLACE) != 0) {
        // Network file systems have no such rename.
        if (errno != EINVAL || link(path_.c_str(), file_.c_str()) != 0) {
            throw Failure("could not write " + printable(file_) + ": " + reasonOf(errno) +
                              "; --force replaces a file that is there",
                          errno == EEXIST ? FailureKind::kTaken : FailureKind::kOther);
        }
        unlink(path_.c_str());
    }
    settle();
}

void FileDraft::putInPlace() {
    if (std::rename(path_.c_str(), file_.c_str()) != 0) {
        throwFailure(errno);
    }
    settle();
}

/* The rename is on the disk too before the edit counts as done. */
void FileDraft::settle() {
    isDone_ = true;
    const std::string folder = fs::path(file_).parent_path();
    const int descriptor = ::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    const bool isSettled = descriptor != -1 && (fsync(descriptor) == 0 || errno == EINVAL);
    const int error = errno;
    if (descriptor != -1) {
        close(descriptor);
    }
    if (!isSettled) {
        throw Failure("wrote " + printable(file_) +
                      ", but it may not survive a power cut: " + reasonOf(error));
    }
}

bool FileDraft::replace(Deadline deadline, const std::function<bool()> &write) {
    while (true) {
        const std::optional<FileState> before = stateOf(file_);
        if (!write()) {
            return false;
        }
        if (stateOf(file_) == before) {
            putInPlace();
            return true;
        }
        if (isPast(deadline)) {
            throw Failure("could not change " + printable(file_) +
                              ": another program keeps changing it; try again",
                          FailureKind::kBusy);
        }
    }
}

}  // namespace vorelix
