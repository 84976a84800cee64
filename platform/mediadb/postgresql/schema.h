/* The tables of the media database in PostgreSQL, in a schema of their own named "zano";
 * docs/media-database.md describes them. */
#pragma once

#include <functional>
#include <string>
#include <string_view>
#include <vector>

#include "handle.h"

namespace zano::mediadb::postgresql {

constexpr std::int64_t kSchemaVersion = 3;

/* Several programs write at once, perhaps the same songs and always the same counts. So that they
 * never wait for each other in a circle, a batch is written in one go, under a lock on this row,
 * which any engine has. */
constexpr const char *kLockWriting = "SELECT value FROM state WHERE name='generation' FOR UPDATE";
/* How long to wait while another program makes indexes or writes a batch. */
constexpr const char *kPatience = "SET lock_timeout='15min'";

/* Of the schema of a database; 0 when it has none, -1 when that is not of a media database. */
std::int64_t versionOf(Connection &connection);

/* Connects to the primary. Missing tables are made and an older schema is migrated, by one program
 * while others wait; a schema of another program or a newer version is left as it is and throws. */
Connection openForWriting(const std::string &uri);

constexpr int kIndexSteps = 13;
/* Makes those indexes of the songs that are missing, in a transaction. They wait for the end of a
 * first scan, since keeping them up with every song costs several times as much. onStep is called
 * so many times. */
void addIndexes(Connection &connection, const std::function<void()> &onStep);

/* Throws unless the version is the one that this program knows. */
void requireVersion(std::int64_t version);

/* An order that is read from an index, and for which anchors are kept. */
struct StoredOrder {
    OrderTerm leading;
    int number;  // in the database, of its anchors
};
const std::vector<StoredOrder> &storedOrders();
const StoredOrder *findStoredOrder(const OrderTerm &leading);

/* The columns of the index of an order, which are its first; none where that is not to be had. */
std::vector<std::string_view> indexedColumns(Column leading);

/* The columns that decide between songs whose leading column is equal; none for id and path. */
std::vector<std::string_view> tailColumns(Column leading);

/* "artist_key DESC, album_key, disc, ..", with a qualifier before each. */
std::string orderText(const OrderTerm &leading, std::string_view qualifier);

}  // namespace zano::mediadb::postgresql
