#include <vorelix/library/musiclib.h>
#include <vorelix/playlists/playlist.h>
#include <zanoplatform/media_database.h>
#include <zanoplatform/sql_escape.h>

#include <array>
#include <cstddef>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string_view>
#include <utility>

#include "bounded_text_internal.h"
#include "media_rows_internal.h"
#include "messages_internal.h"
#include "search_internal.h"

using vorelix::asInt;
using vorelix::BoundedText;
using vorelix::HeapText;
using vorelix::kNodeSize;
using vorelix::LogMessage;
using vorelix::QueryResult;
using vorelix::RecordList;
using namespace vorelix::musiclib;

namespace {

using OrderText = std::array<char, 1024>;
constexpr std::size_t kLookupSize = 8192;

constexpr ConditionFailures kConditionFailures{kListNoConditionAny, kListNoConditionColumn};

/* The condition of a listing; null, and a success, when there is nothing to search for. */
bool searchCondition(int category, const char *keyword, const MusicRoot &root,
                     HeapText &condition) {
    const std::size_t length = std::strlen(keyword);
    const std::size_t quotedSize = 2 * length + 1;
    const std::size_t escapedSize = 2 * quotedSize + 1;
    const HeapText quoted = vorelix::allocateText(quotedSize);
    if (quoted == nullptr) {
        kListNoFirstBuffer(asInt(quotedSize));
        return false;
    }
    const HeapText escaped = vorelix::allocateText(escapedSize);
    if (escaped == nullptr) {
        kListNoSecondBuffer(asInt(escapedSize));
        return false;
    }
    if (ZANODBEscapeString(quoted.get(), keyword, asInt(length)) == -1) {
        kListQuotesNotEscaped();
        return false;
    }
    if (ZANODBEscapeBackslash(escaped.get(), asInt(escapedSize), quoted.get()) == -1) {
        kListBackslashesNotEscaped();
        return false;
    }
    return makeCondition(category, root, escaped.get(), asInt(escapedSize), kConditionFailures,
                         condition);
}

void writeOrder(const char *sortColumn, bool ascending, OrderText &order) {
    const std::string_view column = isEmpty(sortColumn) ? "lower(title)" : sortColumn;
    if (column == "random") {
        std::snprintf(order.data(), order.size(), "RANDOM()");
        return;
    }
    // Intended and kept: a longer term is cut, its direction included.
    BoundedText<32> primary;
    primary.append(column, " ", ascending ? "" : "desc");
    GenerateOrderString(primary.text(), order.data(), asInt(order.size()));
}

RecordList inRowOrder(RecordList list) {
    return RecordList(PlaylistRecReverse(list.release()));
}

bool fetchNodes(MEDIA_DB_RESULT *result, RecordList &list, const LogMessage<int> &failure) {
    if (!vorelix::fetchRows(result, list, [] { return std::malloc(kNodeSize); })) {
        failure(kNodeSize);
        return false;
    }
    return true;
}

/* Ends a lookup of one value: writes its escaped text, cut to the caller's buffer, and closes.
 * Intended and kept: after a failed escape the result stays open, for good. */
int answerEscaped(QueryResult result, const char *value, char *out, int size,
                  const LogMessage<> &failure) {
    std::array<char, kLookupSize> escaped{};
    if (ZANODBEscapeString(escaped.data(), value, asInt(std::strlen(value))) == -1) {
        failure();
        static_cast<void>(result.release());
        return -1;
    }
    std::snprintf(out, size > 0 ? static_cast<std::size_t>(size) : 0, "%s", escaped.data());
    return 0;
}

}  // namespace

int ZANOMusicListAll(ZANO_PLAYLIST_REC **list, int category, const char *keyword,
                     const char *sortColumn, int ascending, int offset, int limit) {
    if (list == nullptr) {
        kListBadParameter();
        return -1;
    }
    *list = nullptr;
    MusicRoot root{};
    if (!readMusicRoot(root, kListNoRoot)) {
        return -1;
    }
    // Intended and kept: without a keyword every song is listed, also outside of the root.
    HeapText condition;
    if (!isEmpty(keyword) && !searchCondition(category, keyword, root, condition)) {
        return -1;
    }
    OrderText order{};
    writeOrder(sortColumn, ascending != 0, order);
    RecordList songs;  // before the result, which is closed first
    QueryResult result(MediaInfoDBOpen(MEDIA_TABLE_SONGS, "*", condition.get(), nullptr,
                                       order.data(), offset, limit, 0));
    // Intended and kept: a failed open is a success with an empty list, and is not logged.
    if (result != nullptr && !fetchNodes(result.get(), songs, kListNoNode)) {
        return -1;
    }
    result.reset();
    *list = inRowOrder(std::move(songs)).release();
    return 0;
}

int ZANOMusicGetPathById(char *out, int size, const char *id) {
    if (out == nullptr || id == nullptr) {
        return -1;
    }
    BoundedText<kLookupSize> condition;
    condition.append(" id=", id, " ");
    QueryResult result(
        MediaInfoDBOpen(MEDIA_TABLE_SONG_PATHS, "*", condition.text(), nullptr, nullptr, 0, 0, 0));
    if (result == nullptr) {
        kPathNoDatabase(condition.text());
        return -1;
    }
    ZANO_MEDIA_INFO song{};
    MediaInfoDBGet(result.get(), &song);  // intended: without a row the path stays empty
    return answerEscaped(std::move(result), song.path, out, size, kPathNotEscaped);
}

int ZANOMusicGetKeyword(int category, char *out, int size, const char *condition) {
    if (out == nullptr || category < kArtist || category > kGenre) {
        return -1;
    }
    // Any column arrives in the record's title.
    BoundedText<kLookupSize> select;
    select.append(" ", columnOf(category), " as title ");
    QueryResult result(
        MediaInfoDBOpen(MEDIA_TABLE_SONGS, select.text(), condition, nullptr, nullptr, 0, 0, 0));
    if (result == nullptr) {
        kKeywordNoDatabase(vorelix::shown(condition));
        return -1;
    }
    ZANO_MEDIA_INFO row{};
    MediaInfoDBGet(result.get(), &row);  // intended: without a row the value is empty
    return answerEscaped(std::move(result), row.title, out, size, kKeywordNotEscaped);
}

int ZANOMusicBrowse(int table, ZANO_PLAYLIST_REC **list, const char *select, const char *condition,
                    const char *distinct, const char *orderBy, int offset, int limit) {
    if (list == nullptr) {
        kBrowseBadParameter();
        return -1;
    }
    *list = nullptr;
    RecordList rows;  // before the result, which is closed first
    QueryResult result(MediaInfoDBOpen(table, select != nullptr ? select : "*", condition, distinct,
                                       orderBy, offset, limit, 0));
    if (result == nullptr) {
        kBrowseNoDatabase(vorelix::shown(condition));
        return -1;
    }
    if (!fetchNodes(result.get(), rows, kBrowseNoNode)) {
        return -1;
    }
    result.reset();
    rows = inRowOrder(std::move(rows));

    const bool everyRow = isEmpty(distinct);
    BoundedText<1024> counted;
    counted.append(everyRow ? "id" : "DISTINCT ", everyRow ? "" : distinct);
    const int total = MediaInfoDBGetCount(table, counted.text(), condition, 0, 0);
    if (total >= 0) {
        *list = rows.release();
    }
    return total;
}
