#include "playlist_draft.h"

#include <fcntl.h>
#include <strings.h>
#include <sys/stat.h>
#include <unistd.h>
#include <vorelix/playlists/playlist.h>
#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <deque>
#include <filesystem>
#include <optional>
#include <string_view>
#include <thread>

#include "failure.h"
#include "text.h"

namespace vorelix {

namespace {

namespace fs = std::filesystem;

/* Short enough for a name of its own in the folder, with the ending that tells the form. */
std::string draftPathOf(const std::string &playlist) {
    const fs::path path(playlist);
    const std::string ending = ".vorelix" + path.extension().string();
    std::string stem = path.stem();
    stem.resize(std::min(stem.size(), size_t{NAME_MAX} - ending.size() - 1));
    return path.parent_path() / ("." + stem + ending);
}

/* The library's relative path loses a folder with whose whole name the next part of the playlist's
 * own path begins: /music/play/a.mp3 would stand in /music/playlists/x.m3u as ../a.mp3. The path
 * that is right for such an entry; relative paths are written as they are. */
std::optional<std::string> lostFolderPath(std::string_view playlist, std::string_view entry) {
    const auto [here, there] =
        std::mismatch(playlist.begin(), playlist.end(), entry.begin(), entry.end());
    const auto at = static_cast<size_t>(there - entry.begin());
    if (at < 2 || there == entry.end() || *there != '/' || entry[at - 1] == '/') {
        return std::nullopt;
    }
    std::string relative;
    for (auto up = std::count(here, playlist.end(), '/'); up > 0; --up) {
        relative += "../";
    }
    return relative.append(entry.substr(entry.rfind('/', at - 1) + 1));
}

bool isSamePath(const std::string &one, const std::string &other) {
    return one == other || (one.front() == '/' &&
                            fs::path(one).lexically_normal() == fs::path(other).lexically_normal());
}

/* As far as the form keeps it: the tags of what the media database does not know are in m3u. */
bool isKept(const ZANO_MEDIA_INFO &wanted, const ZANO_MEDIA_INFO &written, bool hasTags) {
    const auto areEqual = [](const char *one, const char *other) {
        return std::strcmp(one, other) == 0;
    };
    return isSamePath(wanted.path, written.path) &&
           (!hasTags || wanted.id != 0 || written.id != 0 ||
            (areEqual(wanted.title, written.title) && areEqual(wanted.artist, written.artist) &&
             areEqual(wanted.album, written.album) && areEqual(wanted.genre, written.genre)));
}

std::string reasonOf(int error) {
    return std::strerror(error);
}

}  // namespace

std::string formOf(const std::string &path) {
    const std::string ending = fs::path(path).extension();
    for (const char *form : {"m3u", "pls", "wpl"}) {
        if (!ending.empty() && strcasecmp(ending.c_str() + 1, form) == 0) {
            return form;
        }
    }
    return {};
}

Deadline deadlineOf(int seconds) {
    return std::chrono::steady_clock::now() + std::chrono::seconds(seconds);
}

Draft::Draft(const std::string &playlist, Deadline deadline)
    : playlist_(playlist), path_(draftPathOf(playlist)) {
    constexpr auto kPause = std::chrono::milliseconds(10);
    try {
        do {
            open();
            while (!tryLock()) {
                if (std::chrono::steady_clock::now() >= deadline) {
                    throw Failure("could not change " + printable(playlist_) +
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

Draft::~Draft() {
    if (!isDone_) {
        unlink(path_.c_str());
    }
    close(descriptor_);
}

void Draft::open() {
    if (descriptor_ != -1) {
        close(descriptor_);
    }
    descriptor_ = ::open(path_.c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0666);
    if (descriptor_ == -1) {
        throw Failure("could not change " + printable(playlist_) + ": the draft " +
                      printable(path_) + " cannot be opened: " + reasonOf(errno));
    }
}

bool Draft::tryLock() const {
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

/* Whether what is locked is still the draft. One with contents is what a killed program left: it
 * may be the very file that the playlist is, by another name. */
bool Draft::isUsable() const {
    struct stat locked {};
    struct stat named {};
    if (fstat(descriptor_, &locked) != 0) {
        throwFailure(errno);
    }
    if (stat(path_.c_str(), &named) != 0 || named.st_dev != locked.st_dev ||
        named.st_ino != locked.st_ino) {
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

void Draft::throwFailure(int error) const {
    throw Failure("could not write " + printable(playlist_) + ": " + reasonOf(error) +
                  "; it is as it was");
}

void Draft::write(const Entries &entries, mode_t modeOfNew) const {
    std::deque<ZANO_MEDIA_INFO> moved;
    Entries records = entries;
    for (ZANO_MEDIA_INFO *&record : records) {
        if (const auto path = lostFolderPath(path_, record->path)) {
            moved.push_back(*record);
            setPath(moved.back(), *path);
            record = &moved.back();
        }
    }
    fill(std::move(records));
    takeOwnerAndMode(modeOfNew);
    expectEntries(entries);
    if (fsync(descriptor_) != 0) {
        throwFailure(errno);
    }
}

SongList Draft::tryOut(const Entries &entries) const {
    fill(entries);
    return readEntries(path_);
}

void Draft::fill(Entries records) const {
    records.push_back(nullptr);
    if (ZANOWriteMusicPlaylistWithMediaList(records.data(), path_.c_str()) != 0) {
        throwWhenFull();
        throw Failure("could not write the draft " + printable(path_) +
                      "; see the library's log with --verbose");
    }
}

/* Who may not give the file away keeps it: the mode lets those in who were let in before. */
void Draft::takeOwnerAndMode(mode_t modeOfNew) const {
    struct stat old {};
    if (stat(playlist_.c_str(), &old) != 0) {
        old.st_mode = modeOfNew;
    } else if (fchown(descriptor_, old.st_uid, old.st_gid) != 0 && errno != EPERM) {
        throwFailure(errno);
    }
    if (fchmod(descriptor_, old.st_mode & 0777) != 0) {
        throwFailure(errno);
    }
}

/* The library's writers do not tell of writes that failed; reading back does. */
void Draft::expectEntries(const Entries &entries) const {
    SongList list;
    try {
        list = readEntries(path_);
    } catch (const Failure &) {
        throwWhenFull();
        throw;
    }
    const Entries written = entriesOf(list);
    const bool hasTags = formOf(path_) == "m3u";
    const auto [wanted, other] =
        std::mismatch(entries.begin(), entries.end(), written.begin(), written.end(),
                      [hasTags](const ZANO_MEDIA_INFO *one, const ZANO_MEDIA_INFO *another) {
                          return isKept(*one, *another, hasTags);
                      });
    if (wanted == entries.end() && other == written.end()) {
        return;
    }
    throwWhenFull();
    const std::string which =
        wanted != entries.end() ? "the path " + printable((*wanted)->path) : "one of the paths";
    throw Failure("could not write " + printable(playlist_) + ": " + which +
                  " cannot stand in a playlist of the form " + formOf(path_) +
                  "; leave it out. The file is as it was");
}

/* Throws when no more can be written: then what is missing was not written either. */
void Draft::throwWhenFull() const {
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

void Draft::putAsNew() {
    if (renameat2(AT_FDCWD, path_.c_str(), AT_FDCWD, playlist_.c_str(), RENAME_NOREPLACE) != 0) {
        // Network file systems have no such rename.
        if (errno != EINVAL || link(path_.c_str(), playlist_.c_str()) != 0) {
            throw Failure("could not write " + printable(playlist_) + ": " + reasonOf(errno) +
                              "; --force replaces a file that is there",
                          errno == EEXIST ? FailureKind::kTaken : FailureKind::kOther);
        }
        unlink(path_.c_str());
    }
    settle();
}

void Draft::putInPlace() {
    if (std::rename(path_.c_str(), playlist_.c_str()) != 0) {
        throwFailure(errno);
    }
    settle();
}

/* The rename is on the disk too before the edit counts as done. */
void Draft::settle() {
    isDone_ = true;
    const std::string folder = fs::path(playlist_).parent_path();
    const int descriptor = ::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    const bool isSettled = descriptor != -1 && (fsync(descriptor) == 0 || errno == EINVAL);
    const int error = errno;
    if (descriptor != -1) {
        close(descriptor);
    }
    if (!isSettled) {
        throw Failure("wrote " + printable(playlist_) +
                      ", but it may not survive a power cut: " + reasonOf(error));
    }
}

namespace {

/* What changes when a program writes a file in place or puts another one there. */
struct FileState {
    dev_t device;
    ino_t number;
    off_t size;
    std::int64_t changedNs;
    bool operator==(const FileState &) const = default;
};

FileState stateOf(const std::string &path) {
    struct stat file {};
    if (stat(path.c_str(), &file) != 0 || access(path.c_str(), W_OK) != 0) {
        throw Failure("could not change " + printable(path) + ": " + reasonOf(errno),
                      errno == ENOENT ? FailureKind::kNoFile : FailureKind::kOther);
    }
    constexpr std::int64_t kNsOfSecond = 1'000'000'000;
    return {file.st_dev, file.st_ino, file.st_size,
            file.st_mtim.tv_sec * kNsOfSecond + file.st_mtim.tv_nsec};
}

/* The path that a rename may go to: links stay links. */
std::string fileBehind(const std::string &path) {
    std::error_code error;
    if (!fs::is_symlink(path, error)) {
        return path;
    }
    const fs::path target = fs::canonical(path, error);
    const fs::path folder = fs::path(path).parent_path();
    if (!error && target.parent_path() == fs::canonical(folder, error)) {
        return folder / target.filename();
    }
    throw Failure("could not change " + printable(path) +
                  ": it is a link to another folder, where its relative paths would lead "
                  "elsewhere; name the file itself");
}

void requireForm(const std::string &path) {
    if (formOf(path).empty()) {
        throw Failure("could not change " + printable(path) +
                      ": only m3u, pls and wpl are written; take it over with: vorelix playlist "
                      "import");
    }
}

}  // namespace

bool editPlaylist(const std::string &path, Deadline deadline, const Change &change) {
    requireForm(path);
    const std::string file = fileBehind(path);
    Draft draft(file, deadline);
    while (true) {
        const FileState before = stateOf(file);
        const SongList list = readEntries(file);
        const Entries old = entriesOf(list);
        const Entries entries = change(old);
        if (entries == old) {
            return false;
        }
        draft.write(entries, kSharedMode);
        if (stateOf(file) == before) {
            draft.putInPlace();
            return true;
        }
        if (std::chrono::steady_clock::now() >= deadline) {
            throw Failure("could not change " + printable(path) +
                              ": another program keeps changing it; try again",
                          FailureKind::kBusy);
        }
    }
}

}  // namespace vorelix
