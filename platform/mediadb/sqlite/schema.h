/* The tables of the media database in SQLite; docs/media-database.md describes them.
 *
 * The tables themselves always hold the truth. Beside them stands what makes reading fast: the
 * ranks of the songs in the two stored orders, the indexes over them, the search index, the
 * counted artists, albums and genres, and the anchors of deep pages. A first scan builds those
 * at its end and until then state 'ordered' is 0, which tells readers to do without them.
 */
#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "handle.h"

namespace zano::mediadb::sqlite {

/* Written into the file, so that a file of another program is told apart: "Zmdb". */
constexpr int kApplicationId = 0x5A6D6462;
constexpr int kSchemaVersion = 2;

/* Opens for writing. A missing file and its folders are made, an older schema is migrated; a file
 * that is not a media database, or is from a newer version, is left as it is and throws. */
Connection openForWriting(const std::string &path);

/* The same, but a missing file throws and is not made. */
Connection openExistingForWriting(const std::string &path);

/* Opens for reading and nothing else: only SELECT, on this program's tables, with a short list of
 * functions. Throws as above, and when the file is missing. */
Connection openForReading(const std::string &path);

/* The same, but all may be read, and temporary tables be made. */
Connection openWhole(const std::string &path);

/* Of the schema of an existing file. Throws as openForReading(), but not when it is older. */
std::int64_t versionOf(const std::string &path);

/* An order that is read from an index. */
struct StoredOrder {
    OrderTerm leading;
    int number;              // on disk, of its anchors
    std::string_view index;  // "" for the table itself
    std::string_view key;    // the leading column in the index; "" when tail alone decides
    std::string_view tail;   // what decides between equal keys
    bool descending;         // of the index as a whole
};
const std::vector<StoredOrder> &storedOrders();
const StoredOrder *findStoredOrder(const OrderTerm &leading);

/* "key DESC, tail DESC", with a qualifier such as "songs." before each. */
std::string orderText(const StoredOrder &order, std::string_view qualifier);

/* SQL for the ids of all songs in a stored order, from its index. */
std::string orderedIds(const StoredOrder &order);

/* Takes away what a first scan makes at its end: the indexes of the stored orders but that over
 * paths, the search index, the counted values, the anchors. */
void dropOrdersOf(Connection &connection);

/* SQL that makes those indexes. */
std::vector<std::string> createIndexes();

}  // namespace zano::mediadb::sqlite
