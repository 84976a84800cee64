#include "queue_file.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <new>
#include <thread>

#include "descriptor_internal.h"
#include "failure.h"
#include "text.h"

namespace vorelix {

namespace {

constexpr mode_t kNewFileMode = 0644;

[[noreturn]] void throwUnreadable(const std::string &path, const std::string &reason) {
    throw Failure("could not read " + printable(path) + ": " + reason);
}

/* A pause in waiting for a lock. */
void pauseUntil(Deadline deadline, const std::string &path) {
    if (std::chrono::steady_clock::now() >= deadline) {
        throw Failure("could not use " + printable(path) +
                          ": another program has locked it; try again, or wait longer with --wait "
                          "SECONDS",
                      FailureKind::kBusy);
    }
    std::this_thread::sleep_for(kPause);
}

void requireReadable(const std::string &path) {
    if (access(path.c_str(), R_OK) != 0) {
        throwUnreadable(path, reasonOf(errno));
    }
    trailingBytesOf(path);
}

/* The queue as the library locks it; a descriptor of nothing where there is none. */
std::unique_ptr<Descriptor> lockQueue(const std::string &path, Deadline deadline) {
    auto file = std::make_unique<Descriptor>(open(path.c_str(), O_RDONLY | O_CLOEXEC));
    if (file->number() == -1) {
        if (errno != ENOENT) {
            throwUnreadable(path, reasonOf(errno));
        }
        return file;
    }
    while (flock(file->number(), LOCK_EX | LOCK_NB) != 0) {
        if (errno != EWOULDBLOCK) {
            throwUnreadable(path, reasonOf(errno));
        }
        pauseUntil(deadline, path);
    }
    return file;
}

void save(PlaylistInfo &queue, const FileDraft &draft) {
    queue.playerInfo->total = static_cast<int>(queue.songs.size());
    if (AudioFile::PlaylistFileSave(draft.path().c_str(), &queue) != 0) {
        draft.throwWhenFull();
        throw Failure("could not write the draft " + printable(draft.path()) +
                      "; see the library's log with --verbose");
    }
    draft.complete(modeOfNewFile(kNewFileMode));
}

}  // namespace

void appendSongs(PlaylistInfo &queue, const std::vector<ZANO_MEDIA_INFO *> &songs) {
    for (const ZANO_MEDIA_INFO *song : songs) {
        queue.songs.push_back(nullptr);
        queue.songs.back() = static_cast<ZANO_MEDIA_INFO *>(std::malloc(sizeof(ZANO_MEDIA_INFO)));
        if (queue.songs.back() == nullptr) {
            throw std::bad_alloc();
        }
        *queue.songs.back() = *song;
    }
}

Queue readQueue(const std::string &path, int start, int count, Deadline deadline) {
    while (true) {
        requireReadable(path);
        Queue queue(AudioFile::PlaylistFileLoad(path.c_str(), start, count));
        if (queue != nullptr) {
            return queue;
        }
        pauseUntil(deadline, path);
    }
}

long long trailingBytesOf(const std::string &path) {
    struct stat file {};
    if (stat(path.c_str(), &file) != 0) {
        return 0;
    }
    if (!S_ISREG(file.st_mode)) {
        throwUnreadable(path, "it is no file");
    }
    constexpr off_t kHeader = sizeof(PlayerInfo);
    return file.st_size < kHeader
               ? file.st_size
               : (file.st_size - kHeader) % static_cast<off_t>(sizeof(ZANO_MEDIA_INFO));
}

void replaceQueue(const std::string &path, Deadline deadline, const std::function<Queue()> &make) {
    const std::string file = withoutLinks(path);
    FileDraft draft(file, deadline);
    std::unique_ptr<Descriptor> lock;
    draft.replace(deadline, [&] {
        lock.reset();
        save(*make(), draft);
        lock = lockQueue(file, deadline);
        return true;
    });
}

}  // namespace vorelix
