#include "check.h"

#include <zanoplatform/error.h>

#include <utility>

#include "../catalogue.h"
#include "../query/statements.h"
#include "grams.h"
#include "plan.h"
#include "ranks.h"
#include "schema.h"
#include "short_counts.h"
#include "text/fold.h"

namespace zano::mediadb::sqlite {
namespace {

[[noreturn]] void damaged(const std::string &how) {
    throw DatabaseError(KLIB_ERR_DATABASE_FAILED, "the media database is damaged: " + how);
}

std::int64_t state(Connection &connection, std::string_view name) {
    Statement row = connection.prepare("SELECT value FROM state WHERE name=?1");
    row.bind(1, name);
    return row.step() ? row.integer(0) : 0;
}

void checkFile(Connection &connection) {
    Statement result = connection.prepare("PRAGMA integrity_check");
    if (result.step() && result.text(0) != "ok") {
        damaged(std::string(result.text(0)));
    }
}

/* The first half of the columns are texts, the others their keys. */
void checkKeys(Connection &connection, const char *sql, int texts) {
    Statement rows = connection.prepare(sql);
    while (rows.step()) {
        for (int column = 0; column < texts; ++column) {
            if (foldedKey(rows.text(column)) != rows.text(column + texts)) {
                damaged("\"" + std::string(rows.text(column)) + "\" has a key that is not its own");
            }
        }
    }
}

void checkOrder(Connection &connection, const RankedOrder &order) {
    const std::string column(order.column);
    if (connection.integer("SELECT count(*) FROM songs WHERE " + column + " IS NULL") != 0) {
        damaged("a song has no " + column);
    }
    Statement rows = connection.prepare("SELECT " + std::string(songKeyColumns()) +
                                        " FROM songs ORDER BY " + column);
    SongKey previous;
    bool isFirst = true;
    while (rows.step()) {
        SongKey key = readSongKey(rows, 0);
        if (!isFirst && !order.isBefore(previous, key)) {
            damaged("song " + std::to_string(key.id) + " is out of order by " + column);
        }
        previous = std::move(key);
        isFirst = false;
    }
}

/* SQL that counts the rows that only one of two queries gives. */
std::string differencesOf(const std::string &one, const std::string &other) {
    std::string sql = "SELECT (SELECT count(*) FROM (";
    sql.append(one).append(" EXCEPT ").append(other);
    sql.append(")) + (SELECT count(*) FROM (");
    sql.append(other).append(" EXCEPT ").append(one).append("))");
    return sql;
}

void checkFacets(Connection &connection) {
    for (const Facet &facet : facets()) {
        const ColumnInfo &info = columnInfo(facet.column);
        const std::string number = std::to_string(facet.number);
        const std::string kept = "SELECT key, name, songs FROM facets WHERE facet=" + number;
        std::string real = "SELECT ";
        real.append(info.key).append(", ").append(info.name);
        real.append(", count(*) FROM songs GROUP BY 1, 2");
        if (connection.integer(differencesOf(kept, real)) != 0 ||
            connection.integer("SELECT count(*) FROM facets WHERE facet=" + number) !=
                state(connection, facet.state)) {
            damaged("the " + std::string(facet.state) + " on record are not those of the songs");
        }
    }
}

void checkAnchors(Connection &connection) {
    Statement anchors =
        connection.prepare("SELECT place, song FROM anchors WHERE stored_order=?1 ORDER BY place");
    for (const StoredOrder &order : storedOrders()) {
        Statement songs = connection.prepare(orderedIds(order));
        anchors.bind(1, order.number);
        for (std::int64_t at = 0; songs.step(); ++at) {
            if (at % kAnchorDistance == 0 &&
                (!anchors.step() || anchors.integer(0) != at / kAnchorDistance ||
                 anchors.integer(1) != songs.integer(0))) {
                damaged("an anchor is not at its place in order " + std::to_string(order.number));
            }
        }
        anchors.reset();
    }
}

/* FTS5 looks into its own tables only where it may write, so it is given a copy of them. */
void checkInsideOfGrams(Connection &connection, const std::string &options) {
    connection.run("CREATE VIRTUAL TABLE temp.same_grams USING fts5(" + options + ")");
    for (const std::string table : {"grams_data", "grams_idx", "grams_config"}) {
        std::string fill = "DELETE FROM temp.same_";
        fill.append(table).append("; INSERT INTO temp.same_").append(table);
        connection.run(fill.append(" SELECT * FROM main.").append(table));
    }
    try {
        connection.run("INSERT INTO temp.same_grams(same_grams) VALUES('integrity-check')");
    } catch (const DatabaseError &error) {
        damaged(std::string("its search index: ") + error.what());
    }
}

/* Builds the index once more beside the real one and compares their words, which both give in one
 * order. */
void checkGrams(Connection &connection) {
    const std::string options = "document, content='', detail=none, columnsize=0, tokenize='" +
                                std::string(kGramTokenizer) + "'";
    checkInsideOfGrams(connection, options);
    connection.run("CREATE VIRTUAL TABLE temp.other_grams USING fts5(" + options + ")");
    connection.run("CREATE VIRTUAL TABLE temp.kept USING fts5vocab(main, grams, instance)");
    connection.run("CREATE VIRTUAL TABLE temp.real USING fts5vocab(temp, other_grams, instance)");
    Statement rows = connection.prepare(
        "SELECT rank, title_key, artist_key, album_key, genre_key FROM songs ORDER BY 1");
    Statement add =
        connection.prepare("INSERT INTO temp.other_grams(rowid, document) VALUES(?1, ?2)");
    while (rows.step()) {
        const std::string document =
            gramDocument(rows.text(1), rows.text(2), rows.text(3), rows.text(4));
        add.bind(1, rows.integer(0)).bind(2, std::string_view(document)).run();
    }
    Statement kept = connection.prepare("SELECT term, doc FROM temp.kept");
    Statement real = connection.prepare("SELECT term, doc FROM temp.real");
    bool isThere = true;
    while (isThere) {
        isThere = real.step();
        if (kept.step() != isThere ||
            (isThere && (kept.text(0) != real.text(0) || kept.integer(1) != real.integer(1)))) {
            damaged("the search index is not that of the songs");
        }
    }
}

}  // namespace

void checkDatabase(Connection &connection) {
    checkFile(connection);
    if (connection.integer("SELECT count(*) FROM songs") != state(connection, "songs")) {
        damaged("the number of songs is not the one on record");
    }
    checkKeys(connection,
              "SELECT title, album, artist, genre, title_key, album_key, artist_key, genre_key "
              "FROM songs",
              4);
    checkKeys(connection, "SELECT title, album, title_key, album_key FROM playlists", 2);
    if (state(connection, "ordered") == 0) {
        return;
    }
    checkOrder(connection, tailOrder());
    checkOrder(connection, titleOrder());
    checkFacets(connection);
    checkGrams(connection);
    if (!countShort(connection).areIn(connection)) {
        damaged("its counts of one and two characters are not those of the songs");
    }
    if (state(connection, "anchored") == state(connection, "generation")) {
        checkAnchors(connection);
    }
}

}  // namespace zano::mediadb::sqlite
