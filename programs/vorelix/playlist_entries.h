/* The entries of a playlist: read from its file, made from songs and paths, named by positions. */
#pragma once

#include <vorelix/records.h>
#include <string>
#include <vector>

#include "songs.h"

namespace vorelix {

/* Entries in their order. The records belong to the lists that they came from. */
using Entries = std::vector<ZANO_MEDIA_INFO *>;

/* The entries of any playlist file (absolute path) with ids and tags; null for none. Throws
 * Failure when it cannot be read or is no playlist. */
SongList readEntries(const std::string &path);

Entries entriesOf(const SongList &list);

/* A path of at most 4095 bytes. */
void setPath(ZANO_MEDIA_INFO &entry, const std::string &path);

/* How many of them the media database knows. */
int knownAmong(const Entries &entries);

/* New entries: the songs of these ids, as often as they are named, then the paths. An id may be
 * "-": those on standard input, separated by blanks or commas, or in a document that a listing
 * made with --json. A path is a web address or a file that exists. Throws Failure for a song or a
 * file that is not there. */
SongList newEntries(const std::vector<std::string> &ids, const std::vector<std::string> &paths);

/* From one position to another one, both counted from 1. kEnd is the last, or where something is
 * put, behind the last. */
struct PositionRange {
    int first;
    int last;
};
inline constexpr int kEnd = 0;

/* Reads "4", "2-7", "end", "3-end"; false for anything else. */
bool readRange(const std::string &text, PositionRange &range);

/* The indexes, from 0, of ranges that readRange takes, in the order they are named. Throws Failure
 * for a position that a playlist of `total` entries does not have. */
std::vector<size_t> indexesOf(const std::vector<std::string> &ranges, size_t total);

/* The index, from 0, at which something is put: position 1 to `last`. Throws Failure for another.
 */
size_t destinationOf(const std::string &position, size_t last);

/* An absolute path without "." and "..", taken out by the text alone. */
std::string absolutePath(const std::string &path);

}  // namespace vorelix
