/* What every query of the media database needs: owners of the platform's handles and of malloc'd
 * blocks, and the loop that turns rows into a list. */
#pragma once

#include <vorelix/records.h>
#include <zanoplatform/media_database.h>

#include <climits>
#include <cstddef>
#include <cstdlib>
#include <memory>

namespace vorelix {

/* An open result of the media database. */
struct CloseResult {
    void operator()(MEDIA_DB_RESULT *result) const { MediaInfoDBClose(result); }
};
using QueryResult = std::unique_ptr<MEDIA_DB_RESULT, CloseResult>;

/* A whole track list by its head. */
struct FreeRecords {
    void operator()(ZANO_PLAYLIST_REC *list) const { ZANOPlaylistRecFree(list); }
};
using RecordList = std::unique_ptr<ZANO_PLAYLIST_REC, FreeRecords>;

/* A text from malloc, calloc or the platform. */
struct FreeText {
    void operator()(char *text) const { std::free(text); }
};
using HeapText = std::unique_ptr<char, FreeText>;

/* A size as platform and log count it; what is larger counts as INT_MAX. */
inline int asInt(std::size_t size) {
    return size < INT_MAX ? static_cast<int>(size) : INT_MAX;
}

/* A zero-filled buffer; null when memory ran out or when its size is more than an int holds. */
inline HeapText allocateText(std::size_t size) {
    return HeapText(size <= INT_MAX ? static_cast<char *>(std::calloc(size, 1)) : nullptr);
}

inline constexpr int kNodeSize = sizeof(ZANO_PLAYLIST_REC);

/* Pushes every row that is left at the head of *list, so that the last row comes first. A node
 * is what allocateNode() returns: a malloc'd block of kNodeSize bytes or null. False when it
 * was null although a row was left; the list then holds the rows read before.
 *
 * The database writes each row into its node, whole by its interface: a copy of 7 KB for each
 * would cost as much as reading it. */
template <typename Allocate>
bool fetchRows(MEDIA_DB_RESULT *result, RecordList &list, Allocate allocateNode) {
    for (;;) {
        auto *node = static_cast<ZANO_PLAYLIST_REC *>(allocateNode());
        ZANO_MEDIA_INFO rowWithoutNode;
        if (MediaInfoDBGet(result, node != nullptr ? &node->info : &rowWithoutNode) == -1) {
            std::free(node);
            return true;
        }
        if (node == nullptr) {
            return false;
        }
        node->next = list.release();
        list.reset(node);
    }
}

}  // namespace vorelix
