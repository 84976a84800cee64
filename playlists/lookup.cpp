#include <vorelix/playlists/playlist.h>
#include <zanoplatform/media_database.h>
#include <zanoplatform/strings.h>

#include <array>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <optional>

#include "log_internal.h"
#include "media_rows_internal.h"
#include "playlists_internal.h"

using vorelix::asInt;
using vorelix::HeapText;
using vorelix::kNodeSize;
using vorelix::LogMessage;
using vorelix::QueryResult;
using vorelix::RecordList;
using vorelix::playlist::kUnit;
using vorelix::playlist::StringList;

namespace {

constexpr LogMessage<> kBadParameter{kUnit, "%s (%d) Bad parameter.", 97};
constexpr LogMessage<int> kNoCondition{kUnit, "%s (%d) Failed to alloc memory %d", 104};
constexpr LogMessage<const char *> kNoDatabase{kUnit, "%s (%d) Failed to open media database (%s).",
                                               113};
constexpr LogMessage<int> kNoNode{kUnit, "%s (%d) Failed to alloc %d", 121};

constexpr int kIdListCapacity = 1024;

/* Fetched nodes in short lists by their id, so that finding one does not walk them all. Nodes
 * of one id share a list and keep their order. Without memory of its own: it cannot fail. */
class NodesById {
  public:
    /* Takes over the nodes of a list; *fetched is null then. */
    explicit NodesById(ZANO_PLAYLIST_REC **fetched) {
        // From the last to the first, for each is pushed at the head of its list.
        ZANO_PLAYLIST_REC *node = PlaylistRecReverse(*fetched);
        *fetched = nullptr;
        while (node != nullptr) {
            ZANO_PLAYLIST_REC *const rest = node->next;
            push(listOf(static_cast<std::uint32_t>(node->info.id)), node);
            node = rest;
        }
    }

    /* The list that holds every node of an id, if there is any. */
    ZANO_PLAYLIST_REC **listOf(std::uint32_t id) { return &lists_[(id * kSpread) >> kShift]; }

    /* Gives what was not taken back into *rest, in no order. */
    void giveBack(ZANO_PLAYLIST_REC **rest) {
        for (ZANO_PLAYLIST_REC *&list : lists_) {
            while (list != nullptr) {
                ZANO_PLAYLIST_REC *const node = list;
                list = node->next;
                push(rest, node);
            }
        }
    }

  private:
    static constexpr unsigned kBits = 12;
    static constexpr unsigned kShift = std::numeric_limits<std::uint32_t>::digits - kBits;
    // 2^32 divided by the golden ratio: ids in a row, or in steps, fall into different lists.
    static constexpr std::uint32_t kSpread = 2654435769U;

    static void push(ZANO_PLAYLIST_REC **list, ZANO_PLAYLIST_REC *node) {
        node->next = *list;
        *list = node;
    }

    std::array<ZANO_PLAYLIST_REC *, std::size_t{1} << kBits> lists_{};
};

/* Unlinks the first node with an id and returns it; null when there is none. */
ZANO_PLAYLIST_REC *PlaylistTakeById(ZANO_PLAYLIST_REC **list, std::uint32_t id) {
    for (; *list != nullptr; list = &(*list)->next) {
        ZANO_PLAYLIST_REC *const node = *list;
        if (static_cast<std::uint32_t>(node->info.id) == id) {
            *list = node->next;
            return node;
        }
    }
    return nullptr;
}

/* The id that a whole item spells, nothing when something stands behind its digits. Blanks and a
 * sign in front are read over, no digits at all are 0, and a number beyond 32 bits is the
 * largest one: the same wherever the library runs, whatever the width of long. */
std::optional<std::uint32_t> readId(const char *item) {
    constexpr long long kLargest = std::numeric_limits<std::uint32_t>::max();
    char *end = nullptr;
    const long long id = std::strtoll(item, &end, 10);
    if (*end != '\0') {
        return std::nullopt;
    }
    return static_cast<std::uint32_t>(-kLargest <= id && id <= kLargest ? id : kLargest);
}

/* Moves the nodes of *fetched that the ids name into a list in the order of the ids. */
ZANO_PLAYLIST_REC *PlaylistOrderByIdList(ZANO_PLAYLIST_REC **fetched, const char *ids) {
    StringList items(KLIBCSzListAlloc(kIdListCapacity));
    if (items == nullptr) {
        // Intended and kept: without memory for the ids the caller gets an empty list.
        return nullptr;
    }
    PSZLIST split = items.release();
    const int count = KLIBCStrSep(ids, ",", &split);
    items.reset(split);

    NodesById nodes(fetched);
    ZANO_PLAYLIST_REC *ordered = nullptr;
    ZANO_PLAYLIST_REC **tail = &ordered;
    for (int index = 0; index < count; ++index) {
        const char *const item = KLIBCSzListGet(items.get(), index);
        const auto id = item != nullptr ? readId(item) : std::nullopt;
        ZANO_PLAYLIST_REC *const node = id ? PlaylistTakeById(nodes.listOf(*id), *id) : nullptr;
        if (node != nullptr) {
            node->next = nullptr;
            *tail = node;
            tail = &node->next;
        }
    }
    nodes.giveBack(fetched);
    return ordered;
}

/* "id in (ids)"; null when memory ran out. */
HeapText idCondition(const char *ids) {
    const std::size_t size = std::strlen(ids) + 32;
    HeapText condition = vorelix::allocateText(size);
    if (condition == nullptr) {
        kNoCondition(asInt(size));
        return nullptr;
    }
    // Not escaped, for it is a list; what is no list of ids makes the open fail.
    std::snprintf(condition.get(), size, "id in (%s)", ids);
    return condition;
}

}  // namespace

int ZANOMusicListGetByID(ZANO_PLAYLIST_REC **list, const char *ids) {
    if (list != nullptr) {
        *list = nullptr;
    }
    if (list == nullptr || ids == nullptr || *ids == '\0') {
        kBadParameter();
        return -1;
    }
    const HeapText condition = idCondition(ids);
    if (condition == nullptr) {
        return -1;
    }
    RecordList fetched;  // before the result, which is closed first
    QueryResult result(
        MediaInfoDBOpen(MEDIA_TABLE_SONGS, "*", condition.get(), nullptr, nullptr, 0, 0, 0));
    if (result == nullptr) {
        kNoDatabase(condition.get());
        return -1;
    }
    if (!vorelix::fetchRows(result.get(), fetched, [] { return std::calloc(1, kNodeSize); })) {
        kNoNode(kNodeSize);
        return -1;
    }
    result.reset();
    ZANO_PLAYLIST_REC *rest = fetched.release();
    *list = PlaylistOrderByIdList(&rest, ids);
    fetched.reset(rest);
    return 0;
}
