#include "check.h"

#include <zanoplatform/error.h>

#include "../query/statements.h"
#include "plan.h"
#include "schema.h"
#include "text/fold.h"

namespace zano::mediadb::postgresql {
namespace {

[[noreturn]] void damaged(const std::string &how) {
    throw DatabaseError(KLIB_ERR_DATABASE_FAILED, "the media database is damaged: " + how);
}

std::int64_t state(Connection &connection, std::string_view name) {
    Sql sql = newSql("SELECT value FROM state WHERE name=");
    return connection.integer(sql.bind(std::string(name)));
}

/* SQL that counts the rows that only one of two queries gives; they have no row twice. */
Sql differencesOf(const std::string &one, const std::string &other, std::string_view columns) {
    Sql sql = newSql("SELECT count(*) FROM (");
    sql.add(one).add(") AS one FULL JOIN (").add(other).add(") AS other USING (").add(columns);
    return sql.add(") WHERE one IS NULL OR other IS NULL");
}

void checkFacets(Connection &connection) {
    for (const Facet &facet : facets()) {
        const ColumnInfo &info = columnInfo(facet.column);
        const std::string kept =
            "SELECT key, name, songs FROM facets WHERE facet=" + std::to_string(facet.number);
        std::string real = "SELECT ";
        real.append(info.key).append(" AS key, ").append(info.name);
        real.append(" AS name, count(*) AS songs FROM songs GROUP BY 1, 2");
        if (connection.integer(differencesOf(kept, real, "key, name, songs")) != 0 ||
            connection.integer(newSql("SELECT count(*) FROM (").add(kept).add(") AS kept")) !=
                state(connection, facet.state)) {
            damaged("the " + std::string(facet.state) + " on record are not those of the songs");
        }
    }
}

/* The keys are what searches and orders go by. The first half of the columns are texts, the others
 * their keys. */
void checkKeys(Connection &connection, const char *sql, int texts) {
    connection.run(std::string("DECLARE keys NO SCROLL CURSOR FOR ") + sql);
    const auto next = [&] { return connection.runOnce("FETCH 2000 FROM keys"); };
    for (Result rows = next(); rows.size() > 0; rows = next()) {
        for (int i = 0; i < rows.size(); ++i) {
            for (int column = 0; column < texts; ++column) {
                if (foldedKey(rows[i].text(column)) != rows[i].text(column + texts)) {
                    damaged("\"" + std::string(rows[i].text(column)) +
                            "\" has a key that is not its own");
                }
            }
        }
    }
    connection.run(std::string("CLOSE keys"));
}

void checkAnchors(Connection &connection) {
    for (const StoredOrder &order : storedOrders()) {
        const std::string number = std::to_string(order.number);
        Sql real = newSql("SELECT at/").add(std::to_string(kAnchorDistance));
        real.add(" AS place, id AS song FROM (SELECT id, row_number() OVER (ORDER BY ");
        real.add(orderText(order.leading, "")).add(")-1 AS at FROM songs) AS places WHERE at%");
        real.add(std::to_string(kAnchorDistance)).add("=0");
        if (connection.integer(
                differencesOf("SELECT place, song FROM anchors WHERE stored_order=" + number,
                              real.text(), "place, song")) != 0) {
            damaged("an anchor is not at its place in order " + number);
        }
    }
}

}  // namespace

void checkDatabase(Connection &connection) {
    if (connection.integer(newSql("SELECT count(*) FROM songs")) != state(connection, "songs")) {
        damaged("the number of songs is not the one on record");
    }
    checkFacets(connection);
    checkKeys(connection,
              "SELECT path, title, album, artist, genre, album_artist, path_key, title_key, "
              "album_key, artist_key, genre_key, album_artist_key FROM songs",
              6);
    checkKeys(connection,
              "SELECT path, title, album, path_key, title_key, album_key FROM playlists", 3);
    if (state(connection, "anchored") == state(connection, "generation")) {
        checkAnchors(connection);
    }
}

}  // namespace zano::mediadb::postgresql
