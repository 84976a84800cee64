/* The entries of a playlist: read from its file, or made from songs and paths. */
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

/* A song by its id, or where there is none (0) a web address or the path of a file. */
struct Wanted {
    int id = 0;
    std::string path;  // at most 4095 bytes
};

/* New entries, as often as they are named. Throws Failure for a song that is not there. */
SongList newEntries(const std::vector<Wanted> &wanted);

/* An absolute path without "." and "..", taken out by the text alone, and without / at its end. */
std::string absolutePath(const std::string &path);

}  // namespace vorelix
