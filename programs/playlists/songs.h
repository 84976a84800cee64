/* What the commands ask the library for.
 *
 * Everything goes through ZANOMusicBrowse and ZANOMusicListGetByID. ZANOMusicListAll and
 * ZANOPageTotalRowCount would mislead a user in two ways: without a keyword the total leaves out
 * the songs that are not below the music root though the listing has them, and the % and _ of a
 * keyword are wildcards that a caller cannot escape. Here a keyword is taken literally, and every
 * listing and total covers all indexed songs.
 */
#pragma once

#include <vorelix/records.h>
#include <memory>
#include <string>
#include <vector>

namespace vorelix {

struct FreeRecords {
    void operator()(ZANO_PLAYLIST_REC *list) const;
};
using SongList = std::unique_ptr<ZANO_PLAYLIST_REC, FreeRecords>;

/* A column that has exactly this text. */
struct Exact {
    const char *column;
    std::string text;
};

/* Songs that have `keyword` in a column, in any case and with any accents; all when it is
 * empty. `in` is one of searchableNames(). */
struct Filter {
    std::string keyword;
    std::string in = "any";
    std::vector<Exact> exact;  // all of these too
    std::string folder;        // and only below this one; "": wherever they stand
};

/* `by` is one of sortNames(). */
struct Order {
    std::string by = "title";
    bool descending = false;
};

struct Span {
    int offset = 0;
    int limit = 50;
};

/* A part of the songs or values, and the number of all of them. */
struct Listing {
    SongList songs;
    int total;
};

/* A text as it stands between the quotes of a pattern, taken literally. */
std::string literalPattern(const std::string &text);

std::vector<std::string> searchableNames();
std::vector<std::string> sortNames();

/* Each throws Failure when the library cannot answer. */
Listing listSongs(const Filter &filter, const Order &order, const Span &span);
int countSongs(const Filter &filter);

/* The distinct values of the column artist, album or genre, each in the title of a record. The
 * filter is applied to the songs. Order::by counts for nothing. */
Listing listValues(const std::string &column, const Filter &filter, const Order &order,
                   const Span &span);

/* The songs of these ids that exist, in this order, each once. */
SongList songsById(const std::vector<int> &ids);

}  // namespace vorelix
