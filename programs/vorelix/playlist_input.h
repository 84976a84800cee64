/* What the playlist commands were given: new entries, and positions. */
#pragma once

#include <string>
#include <vector>

#include "playlist_entries.h"

namespace vorelix {

/* The songs of these ids, then the paths. An id may be "-": those on standard input, separated by
 * blanks or commas, or in a document that a listing made with --json. A path is a web address or a
 * file that exists. Throws Failure for a file that is not there, and for an input of something
 * else. */
std::vector<Wanted> wantedEntries(const std::vector<std::string> &ids,
                                  const std::vector<std::string> &paths);

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

}  // namespace vorelix
