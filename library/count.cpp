#include <vorelix/library/musiclib.h>
#include <zanoplatform/media_database.h>
#include <zanoplatform/sql_escape.h>

#include <cstddef>
#include <cstring>

#include "bounded_text_internal.h"
#include "messages_internal.h"
#include "search_internal.h"

using vorelix::HeapText;
using vorelix::QueryResult;
using namespace vorelix::musiclib;

namespace {

constexpr ConditionFailures kConditionFailures{kCountNoConditionAny, kCountNoConditionColumn};

/* Intended and kept: unlike the listing's keyword, this one has its quotes escaped and its
 * backslashes not. */
bool searchCondition(int category, const char *keyword, const MusicRoot &root,
                     HeapText &condition) {
    const std::size_t length = std::strlen(keyword);
    const std::size_t size = 2 * length + 1;
    const HeapText escaped = vorelix::allocateText(size);
    if (escaped == nullptr) {
        kCountNoBuffer(vorelix::asInt(size));
        return false;
    }
    if (ZANODBEscapeString(escaped.get(), keyword, vorelix::asInt(length)) == -1) {
        kCountNotEscaped();
        return false;
    }
    return makeCondition(category, root, escaped.get(), vorelix::asInt(size), kConditionFailures,
                         condition);
}

int countRows(int table, const char *condition, int *count) {
    const QueryResult result(MediaInfoDBOpen(table, "*", condition, nullptr, nullptr, 0, 0, 0));
    if (result != nullptr) {
        *count = result->rowCount;
    }
    // Intended and kept: a failed open is a success that leaves the caller's count alone.
    return 0;
}

}  // namespace

int ZANOPageTotalRowCount(int songs, int category, const char *keyword, int *count) {
    if (count == nullptr) {
        return -1;
    }
    MusicRoot root{};
    if (!readMusicRoot(root, kCountNoRoot)) {
        return -1;
    }
    if (songs == 0 || isEmpty(keyword)) {
        vorelix::BoundedText<4096> condition;
        condition.append("path like '", root.data(), "/%'");
        return countRows(songs == 0 ? MEDIA_TABLE_PLAYLISTS : MEDIA_TABLE_SONGS, condition.text(),
                         count);
    }
    HeapText condition;
    if (!searchCondition(category, keyword, root, condition)) {
        return -1;
    }
    return countRows(MEDIA_TABLE_SONGS, condition.get(), count);
}
