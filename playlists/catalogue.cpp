#include <unistd.h>
#include <vorelix/library/musiclib.h>
#include <vorelix/playlists/playlist.h>
#include <zanoplatform/error.h>
#include <zanoplatform/media_database.h>
#include <zanoplatform/sql_escape.h>
#include <zanoplatform/strings.h>

#include <array>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <utility>

#include "bounded_text_internal.h"
#include "log_internal.h"
#include "media_rows_internal.h"
#include "music_root_internal.h"
#include "playlists_internal.h"

using vorelix::asInt;
using vorelix::BoundedText;
using vorelix::HeapText;
using vorelix::isEmpty;
using vorelix::LogMessage;
using vorelix::MusicRoot;
using vorelix::QueryResult;
using vorelix::writeText;
using namespace vorelix::playlist;

namespace {

// ZANOPlayListListGetByID
constexpr LogMessage<> kByIdsBadParameter{kUnit, "%s (%d) Bad parameter.", 172};
constexpr LogMessage<int> kByIdsNoCondition{kUnit, "%s (%d) Failed to alloc memory %d", 180};
constexpr LogMessage<int> kByIdsNoNode{kUnit, "%s (%d) Failed to alloc %d", 196};
// ZANOPlaylistPathGet
constexpr LogMessage<> kPathBadParameter{kUnit, "%s (%d) Bad parameter.", 240};
// ZANOPlaylistIDGet
constexpr LogMessage<> kIdBadParameters{kUnit, "%s (%d) Bad parameters.", 290};
constexpr LogMessage<int> kIdNoEscapeBuffer{kUnit, "%s (%d) Failed to alloc(%d)", 297};
constexpr LogMessage<int> kIdNoCondition{kUnit, "%s (%d) Failed to alloc(%d)", 306};
// ZANOPlaylistListAll
constexpr LogMessage<const char *> kListNoRoot{kUnit, "%s:%d Failed to readlink(%s). [%m]", 369};
constexpr LogMessage<int> kListNoNode{kUnit, "%s (%d) Failed to alloc %d", 386};
// ZANOPlaylistTitleGet
constexpr LogMessage<> kTitleBadParameters{kUnit, "%s (%d) Bad parameters.", 518};
// ZANOPlaylistTitleGetByPath
constexpr LogMessage<> kTitleByPathBadParameters{kUnit, "%s:%d Bad parameters.", 562};
constexpr LogMessage<int> kTitleByPathNoEscapeBuffer{kUnit, "%s:%d Failed to calloc(%d) %m", 568};
constexpr LogMessage<const char *> kTitleByPathNotEscaped{kUnit, "%s:%d Failed to escape path [%s]",
                                                          573};
constexpr LogMessage<int> kTitleByPathNoCondition{kUnit, "%s:%d Failed to ZANOStrGet()[0x%04X]",
                                                  578};
constexpr LogMessage<> kTitleByPathNoDatabase{kUnit, "%s:%d Failed to MediaInfoDBOpen()", 585};
constexpr LogMessage<> kTitleByPathNoRow{kUnit, "%s:%d Failed to MediaInfoDBGet()", 590};
// ZANOPlayListUnlink
constexpr LogMessage<> kUnlinkBadParameters{kUnit, "%s (%d) Bad parameters.", 627};

/* The size of a node that the log names, with whatever pointers the node really has. */
constexpr int kLoggedNodeSize = 4616;

struct PutText {
    void operator()(char *text) const { KLIBCStrPut(text); }
};
using PlatformText = std::unique_ptr<char, PutText>;

QueryResult openPlaylists(const char *select, const char *condition) {
    return QueryResult(
        MediaInfoDBOpen(MEDIA_TABLE_PLAYLISTS, select, condition, nullptr, nullptr, 0, 0, 0));
}

/* The first playlist that a condition names; false when there is none. */
bool fetchOne(const char *select, const char *condition, ZANO_MEDIA_INFO &row) {
    const QueryResult result = openPlaylists(select, condition);
    return result != nullptr && MediaInfoDBGet(result.get(), &row) == 0;
}

bool fetchOneById(const char *select, int id, ZANO_MEDIA_INFO &row) {
    std::array<char, 32> condition{};
    std::snprintf(condition.data(), condition.size(), "id = %d", id);
    return fetchOne(select, condition.data(), row);
}

/* Pushes a node for every row at the head of the list, filled by fill(node, row). False when
 * memory ran out. */
template <typename Fill>
bool fetchNodes(MEDIA_DB_RESULT *result, PlaylistList &list, Fill fill) {
    ZANO_MEDIA_INFO row{};
    while (MediaInfoDBGet(result, &row) != -1) {
        if (!pushNode(list)) {
            return false;
        }
        fill(*list, row);
    }
    return true;
}

void fillPath(ZANO_PLAYLIST &node, const ZANO_MEDIA_INFO &row) {
    writeText(node.path, sizeof node.path, row.path);
}

void fillAll(ZANO_PLAYLIST &node, const ZANO_MEDIA_INFO &row) {
    node.id = row.id;
    fillPath(node, row);
    writeText(node.title, sizeof node.title, row.title);
    writeText(node.album, sizeof node.album, row.album);
}

/* The rows of an open result in their order, or of none: intended and kept, a failed open is an
 * empty list. When memory ran out, the lookup by ids closes before it logs and the listing after:
 * `noNode` does either, and the result is closed behind it at the latest. */
template <typename Fill, typename NoNode>
int answerList(QueryResult result, Fill fill, NoNode noNode, ZANO_PLAYLIST **list) {
    PlaylistList playlists;
    if (result != nullptr && !fetchNodes(result.get(), playlists, fill)) {
        noNode(result);
        result.reset();
        return -1;
    }
    *list = PlaylistReverse(playlists.release());
    return 0;
}

/* "path = 'path'", its quotes escaped; null, and logged, when memory ran out. */
HeapText pathCondition(const char *path) {
    const std::size_t length = std::strlen(path);
    const std::size_t escapedSize = 2 * length + 1;
    const HeapText escaped = vorelix::allocateText(escapedSize);
    if (escaped == nullptr) {
        kIdNoEscapeBuffer(asInt(escapedSize));
        return nullptr;
    }
    // When it fails the text stays empty, which is the path of no playlist.
    ZANODBEscapeString(escaped.get(), path, asInt(length));
    const std::size_t size = std::strlen(escaped.get()) + 12;
    HeapText condition = vorelix::allocateText(size);
    if (condition == nullptr) {
        kIdNoCondition(asInt(size));
        return nullptr;
    }
    std::snprintf(condition.get(), size, "path = '%s'", escaped.get());
    return condition;
}

/* As pathCondition(), with a text of the platform and the log lines of the title. */
PlatformText titleCondition(const char *path) {
    const std::size_t length = std::strlen(path);
    const std::size_t escapedSize = 2 * length + 1;
    const HeapText escaped = vorelix::allocateText(escapedSize);
    if (escaped == nullptr) {
        kTitleByPathNoEscapeBuffer(asInt(escapedSize));
        return nullptr;
    }
    if (ZANODBEscapeString(escaped.get(), path, asInt(length)) == -1) {
        kTitleByPathNotEscaped(path);
        return nullptr;
    }
    PlatformText condition(KLIBCStrGet("path = '%s'", escaped.get()));
    if (condition == nullptr) {
        kTitleByPathNoCondition(KLIBCErrGet());
    }
    return condition;
}

}  // namespace

int ZANOPlayListListGetByID(ZANO_PLAYLIST **list, const char *ids) {
    if (list != nullptr) {
        *list = nullptr;
    }
    if (list == nullptr || isEmpty(ids)) {
        kByIdsBadParameter();
        return -1;
    }
    const std::size_t size = 2 * std::strlen(ids) + 33;
    const HeapText condition = vorelix::allocateText(size);
    if (condition == nullptr) {
        kByIdsNoCondition(asInt(size));
        return -1;
    }
    // Not escaped, for it is a list; what is no list of ids makes the open fail.
    std::snprintf(condition.get(), size, "id in (%s)", ids);
    const auto closedAndLogged = [](QueryResult &result) {
        result.reset();
        kByIdsNoNode(kLoggedNodeSize);
    };
    return answerList(openPlaylists("path", condition.get()), fillPath, closedAndLogged, list);
}

int ZANOPlaylistPathGet(int id, char *out, int size) {
    if (id <= 0 || out == nullptr) {
        kPathBadParameter();
        return -1;
    }
    ZANO_MEDIA_INFO row{};
    if (!fetchOneById("path", id, row)) {
        return -1;
    }
    writeText(out, size, row.path);
    return 0;
}

int ZANOPlaylistIDGet(const char *path, char *out, int size) {
    if (isEmpty(path) || out == nullptr) {
        kIdBadParameters();
        return -1;
    }
    const HeapText condition = pathCondition(path);
    ZANO_MEDIA_INFO row{};
    if (condition == nullptr || !fetchOne("id", condition.get(), row)) {
        return -1;
    }
    // Through 32 bits, so that the text does not depend on the width of long.
    std::snprintf(out, size > 0 ? static_cast<std::size_t>(size) : 0, "%lu",
                  static_cast<unsigned long>(static_cast<std::uint32_t>(row.id)));
    return 0;
}

int ZANOPlaylistTotalGet() {
    return MediaInfoDBGetCount(MEDIA_TABLE_PLAYLISTS, "*", nullptr, 0, 0);
}

int ZANOPlaylistListAll(ZANO_PLAYLIST **list, int offset, int limit, int folderFilter) {
    if (list == nullptr) {
        return -1;
    }
    *list = nullptr;
    // Intended and kept: the last word is cut off, and the album ascends because that is what an
    // order without a direction does.
    BoundedText<32> order;
    order.append("lower(title) asc, lower(album) asc");
    MusicRoot root{};
    if (!readMusicRoot(root, kListNoRoot)) {
        return -1;
    }
    BoundedText<512> condition;
    condition.append("path like '", root.data(), "/%'",
                     folderFilter != 0 ? " and album ilike 'playlists'" : "");
    QueryResult result(MediaInfoDBOpen(MEDIA_TABLE_PLAYLISTS, "*", condition.text(), nullptr,
                                       order.text(), offset, limit, 1));
    const auto logged = [](QueryResult &) { kListNoNode(kLoggedNodeSize); };
    return answerList(std::move(result), fillAll, logged, list);
}

int ZANOPlaylistTitleGet(const char *id, char *out, int size) {
    if (id == nullptr || out == nullptr) {
        kTitleBadParameters();
        return -1;
    }
    ZANO_MEDIA_INFO row{};
    if (fetchOneById("title", playlistId(id), row)) {
        writeText(out, size, row.title);
    }
    // Intended and kept: an id without a playlist is a success that leaves the text alone.
    return 0;
}

int ZANOPlaylistTitleGetByPath(const char *path, char *out, int size) {
    if (isEmpty(path) || out == nullptr) {
        kTitleByPathBadParameters();
        return -1;
    }
    const PlatformText condition = titleCondition(path);
    if (condition == nullptr) {
        return -1;
    }
    const QueryResult result = openPlaylists("title", condition.get());
    if (result == nullptr) {
        kTitleByPathNoDatabase();
        return -1;
    }
    ZANO_MEDIA_INFO row{};
    if (MediaInfoDBGet(result.get(), &row) == -1) {
        kTitleByPathNoRow();
        return -1;
    }
    writeText(out, size, row.title);
    return 0;
}

int ZANOPlayListUnlink(const ZANO_PLAYLIST *list) {
    if (list == nullptr) {
        kUnlinkBadParameters();
        return -1;
    }
    for (; list != nullptr; list = list->next) {
        // A file that is gone already still has a row to be removed.
        unlink(list->path);
        ZANOPlaylistDBDelete(list->path);
    }
    return 0;
}
