/* The next contents of a playlist file, kept beside it until they are complete.
 *
 * The library rewrites a playlist in place: it empties the file, waits for nobody and does not look
 * whether the bytes reached the disk. So vorelix has it write a draft instead, a hidden file in the
 * playlist's folder (".Road.vorelix.m3u" for Road.m3u), reads that back, and renames it. Whatever
 * happens meanwhile, the playlist is the old one or the new one.
 *
 * The draft is the lock too: who has locked it (an open file description lock) may write it and
 * the playlist. The playlist itself is never locked: the library would empty it before it finds
 * that out. What a killed program leaves behind is unlocked, and the next draft takes its place.
 */
#pragma once

#include <sys/types.h>
#include <chrono>
#include <functional>
#include <string>

#include "playlist_entries.h"

namespace vorelix {

/* m3u, pls or wpl, by the ending of a path in letters of either case; "" for another one, which
 * the library would make an empty file of. */
std::string formOf(const std::string &path);

/* The library leaves every playlist to all users of the device, so that every service can edit it.
 */
inline constexpr mode_t kSharedMode = 0666;

/* When a program stops waiting for others. */
using Deadline = std::chrono::steady_clock::time_point;
Deadline deadlineOf(int seconds);

class Draft {
  public:
    /* Waits until nobody else has a draft of the playlist (absolute path). Throws Failure when the
     * deadline passes, and when the folder cannot be written. */
    Draft(const std::string &playlist, Deadline deadline);

    /* Takes the draft away unless it became the playlist. */
    ~Draft();
    Draft(const Draft &) = delete;
    Draft &operator=(const Draft &) = delete;

    /* Writes all entries, reads them back and waits for the disk. Owner and mode become those of
     * the playlist, or the mode `modeOfNew` when there is none. Throws Failure for a full disk, and
     * for an entry that this form of playlist cannot keep. */
    void write(const Entries &entries, mode_t modeOfNew) const;

    /* The entries as they are read from here; their paths may be relative. For write() to follow.
     * Fewer or more of them when some cannot stand in a playlist. Throws Failure. */
    SongList tryOut(const Entries &entries) const;

    /* Make it the playlist, to be called once. The first throws Failure when there is one. */
    void putAsNew();
    void putInPlace();

  private:
    void open();
    bool tryLock() const;
    bool isUsable() const;
    void fill(Entries records) const;
    void takeOwnerAndMode(mode_t modeOfNew) const;
    void expectEntries(const Entries &entries) const;
    void throwWhenFull() const;
    void settle();
    [[noreturn]] void throwFailure(int error) const;

    std::string playlist_;
    std::string path_;
    int descriptor_ = -1;
    bool isDone_ = false;
};

/* Changes what a playlist has. */
using Change = std::function<Entries(const Entries &)>;

/* Reads the playlist, has it changed and puts the outcome in its place, while other edits by this
 * program wait; starts again when another program changed the file meanwhile. `change` may be
 * called several times. False, with the file untouched, when the change left all entries as they
 * were. Throws Failure, with the file untouched, for all that Draft and readEntries cannot do. */
bool editPlaylist(const std::string &path, Deadline deadline, const Change &change);

}  // namespace vorelix
