/* The file of a player's queue.
 *
 * The library empties a queue before it finds out that it is locked, and deletes it when it cannot
 * be written. So a draft is saved, and becomes the queue when nobody else has that locked: what
 * the library refuses at once is waited for here. Paths are absolute. */
#pragma once

#include <vorelix/player/audiofile.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "file_draft.h"

namespace vorelix {

using Queue = std::unique_ptr<PlaylistInfo>;

/* A queue in memory with copies of these songs behind its own. */
void appendSongs(PlaylistInfo &queue, const std::vector<ZANO_MEDIA_INFO *> &songs);

/* `count` songs from `start`, from 0; all with a count of 0, none with one below. Their texts may
 * lack an end. Throws Failure for a file that is not there or cannot be read, and when it is locked
 * until the deadline passes. */
Queue readQueue(const std::string &path, int start, int count, Deadline deadline);

/* The bytes behind the last song. A file that is not there and an empty one have none; throws
 * Failure for what is no file. */
long long trailingBytesOf(const std::string &path);

/* Puts what make() gives in the place of the file, or makes it. Throws Failure, with the file as
 * it was, for a full disk, and when others use it until the deadline passes. make() may be called
 * several times. */
void replaceQueue(const std::string &path, Deadline deadline, const std::function<Queue()> &make);

}  // namespace vorelix
