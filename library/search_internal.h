/* The condition of a search, which listing and counting build alike. */
#pragma once

#include "bounded_text_internal.h"
#include "log_internal.h"
#include "media_rows_internal.h"
#include "music_root_internal.h"

namespace vorelix::musiclib {

using vorelix::isEmpty;
using vorelix::MusicRoot;

/* Search categories. Every other code searches a column without a name: the database refuses
 * that condition, which is how an unknown code is answered. Intended and kept. */
enum Category { kNoSearch = 0, kTitle = 1, kArtist = 2, kAlbum = 3, kGenre = 4, kAnyColumn = 5 };

/* The column of a category, "" when it has none. */
const char *columnOf(int category);

/* The messages of a condition that memory did not suffice for. */
struct ConditionFailures {
    const LogMessage<int> &any;
    const LogMessage<int> &column;
};

/* Sets condition for songs below the root whose column of the category, or any of the four,
 * contains the escaped keyword; null for kNoSearch. The root is put in as it is. False, and the
 * failure logged with bufferSize, when memory ran out. */
bool makeCondition(int category, const MusicRoot &root, const char *escapedKeyword, int bufferSize,
                   const ConditionFailures &failures, HeapText &condition);

}  // namespace vorelix::musiclib
