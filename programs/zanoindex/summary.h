/* What a scan came to. */
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "mediadb/catalogue.h"

namespace zano::index {

/* A file or folder and what was wrong with it. */
struct Problem {
    std::string path;  // bytes
    std::string reason;
};

struct Summary {
    std::int64_t files = 0;  // audio files found
    std::int64_t added = 0;
    std::int64_t updated = 0;
    std::int64_t unchanged = 0;
    std::int64_t removed = 0;  // rows of files that are gone
    std::int64_t kept = 0;     // rows whose file was not found, and that stay nevertheless
    std::int64_t playlistsAdded = 0;
    std::int64_t playlistsRemoved = 0;
    std::vector<Problem> failed;
    std::vector<mediadb::Notice> notices;  // those that were consumed
    std::vector<Problem> folders;  // those that were not looked at in whole, or lost too much
    double seconds = 0;
    bool isStopped = false;
};

/* One line for people: "40 files in 0.3 s: 40 added, 0 updated, 0 unchanged, 0 removed". */
std::string summaryText(const Summary &summary);

/* One JSON object on one line, without the line's end. Paths that are not UTF-8 are written as
 * the text they would be read as, with their bytes in "pathBytes", percent-encoded. */
std::string summaryJson(const Summary &summary);

}  // namespace zano::index
