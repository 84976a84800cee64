/* The next contents of a playlist file.
 *
 * The library rewrites a playlist in place: it empties the file, waits for nobody and does not look
 * whether the bytes reached the disk. So it is made to write a draft, which is read back before it
 * becomes the playlist. The playlist itself is never locked: the library would empty it before it
 * finds that out.
 */
#pragma once

#include <sys/types.h>
#include <functional>
#include <string>

#include "file_draft.h"
#include "playlist_entries.h"

namespace vorelix {

/* m3u, pls or wpl, by the ending of a path in letters of either case; "" for another one, which
 * the library would make an empty file of. */
std::string formOf(const std::string &path);

/* The library leaves every playlist to all users of the device, so that every service can edit it.
 */
inline constexpr mode_t kSharedMode = 0666;

class Draft : public FileDraft {
  public:
    using FileDraft::FileDraft;

    /* Writes all entries, reads them back and completes the draft. Throws Failure for a full disk,
     * and for an entry that this form of playlist cannot keep. */
    void write(const Entries &entries, mode_t modeOfNew) const;

    /* The entries as they are read from here; their paths may be relative. For write() to follow.
     * Fewer or more of them when some cannot stand in a playlist. Throws Failure. */
    SongList tryOut(const Entries &entries) const;

  private:
    void writeRecords(Entries records) const;
    void expectEntries(const Entries &entries) const;
};

/* Changes what a playlist has. */
using Change = std::function<Entries(const Entries &)>;

/* Reads the playlist, has it changed and puts the outcome in its place, while other edits by this
 * program wait; starts again when another program changed the file meanwhile. `change` may be
 * called several times. False, with the file untouched, when the change left all entries as they
 * were. Throws Failure, with the file untouched, for all that Draft and readEntries cannot do. */
bool editPlaylist(const std::string &path, Deadline deadline, const Change &change);

}  // namespace vorelix
