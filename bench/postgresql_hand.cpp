#include <endian.h>
#include <libpq-fe.h>
#include <vorelix/records.h>
#include <zanoplatform/media_database.h>

#include <algorithm>
#include <array>
#include <bit>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <stdexcept>

#include "hand.h"

namespace zano::bench {
namespace {

using Texts = std::vector<std::string>;
using Rows = std::unique_ptr<PGresult, decltype(&PQclear)>;

/* The columns in the order in which record() takes them. */
const std::string kSelect =
    "SELECT id, path, title, album, artist, genre, track, disc, year, duration, bitrate, frequency "
    "FROM zano.songs ";
const std::string kTail = "genre_key, year, path, duration";
const std::string kTitleOrder = "title_key, album_key, disc, track, artist_key, " + kTail;
const std::string kArtistRest = "album_key, disc, track, title_key, " + kTail;

int integer(const PGresult *rows, int row, int column) {
    std::uint32_t value = 0;
    std::memcpy(&value, PQgetvalue(rows, row, column), sizeof value);
    return static_cast<int>(be32toh(value));
}

std::int64_t big(const PGresult *rows, int row, int column) {
    std::uint64_t value = 0;
    std::memcpy(&value, PQgetvalue(rows, row, column), sizeof value);
    return static_cast<std::int64_t>(be64toh(value));
}

void copy(char *field, size_t width, const PGresult *rows, int row, int column) {
    const auto length = std::min(width - 1, static_cast<size_t>(PQgetlength(rows, row, column)));
    std::memcpy(field, PQgetvalue(rows, row, column), length);
}

ZANO_PLAYLIST_REC *record(const PGresult *rows, int row) {
    auto *node = static_cast<ZANO_PLAYLIST_REC *>(std::calloc(1, sizeof(ZANO_PLAYLIST_REC)));
    ZANO_MEDIA_INFO &info = node->info;
    info.id = static_cast<int>(big(rows, row, 0));
    copy(info.path, sizeof info.path, rows, row, 1);
    copy(info.title, sizeof info.title, rows, row, 2);
    copy(info.album, sizeof info.album, rows, row, 3);
    copy(info.artist, sizeof info.artist, rows, row, 4);
    copy(info.genre, sizeof info.genre, rows, row, 5);
    info.track = integer(rows, row, 6);
    info.disc = integer(rows, row, 7);
    info.year = integer(rows, row, 8);
    info.duration = static_cast<float>(std::bit_cast<double>(big(rows, row, 9)));
    info.bitrate = integer(rows, row, 10);
    info.frequency = integer(rows, row, 11);
    return node;
}

ZANO_PLAYLIST_REC *value(const PGresult *rows, int row) {
    auto *node = static_cast<ZANO_PLAYLIST_REC *>(std::calloc(1, sizeof(ZANO_PLAYLIST_REC)));
    copy(node->info.title, sizeof node->info.title, rows, row, 0);
    return node;
}

class PostgresqlHand : public Hand {
  public:
    explicit PostgresqlHand(const std::string &uri)
        : server_(PQconnectdb(uri.c_str()), PQfinish),
          sorting_(PQconnectdb(uri.c_str()), PQfinish),
          scanning_(PQconnectdb(uri.c_str()), PQfinish) {
        set(server_, "SET enable_bitmapscan=off; SET enable_seqscan=off; SET enable_sort=off");
        set(sorting_, "SET enable_seqscan=off; SET enable_indexscan=off");
        set(scanning_, "SET enable_bitmapscan=off");
    }

    Ways firstPage() override { return page(kSelect + "ORDER BY " + kTitleOrder + " LIMIT 50"); }

    Ways firstPageByArtistDescending() override {
        return page(kSelect + "ORDER BY artist_key DESC, " + kArtistRest + " LIMIT 50");
    }

    Ways deepPage(int place) override {
        return page(kPlace + "stored_order=1 AND place=$1::bigint)) " + kSelect + "WHERE (" +
                        kTitleOrder + ") >= (" + ofPlace(kTitleOrder) + ") ORDER BY " +
                        kTitleOrder + " LIMIT 50 OFFSET $2::bigint",
                    {std::to_string(place / 128), std::to_string(place % 128)}, "by anchor");
    }

    Ways deepPageByArtistDescending(int place) override {
        return page(kPlace + "stored_order=6 AND place=$1::bigint)) (" + kSelect +
                        "WHERE artist_key=" + ofPlace("artist_key") + " AND (" + kArtistRest +
                        ") >= (" + ofPlace(kArtistRest) + ") ORDER BY " + kArtistRest +
                        " LIMIT 178) UNION ALL (" + kSelect + "WHERE artist_key<" +
                        ofPlace("artist_key") + " ORDER BY artist_key DESC, " + kArtistRest +
                        " LIMIT 178) LIMIT 50 OFFSET $2::bigint",
                    {std::to_string(place / 128), std::to_string(place % 128)}, "by anchor");
    }

    Ways knownPage(int place) override {
        const Texts at = valuesAt(kTitleOrder, kTitleOrder, place);
        return page(
            kSelect + "WHERE (" + kTitleOrder +
                ") >= ($1,$2,$3::int,$4::int,$5,$6,$7::int,$8::bytea,$9::float8) ORDER BY " +
                kTitleOrder + " LIMIT 50",
            at, "place known");
    }

    Ways knownPageByArtistDescending(int place) override {
        const std::string order = "artist_key DESC, " + kArtistRest;
        const Texts at = valuesAt("artist_key, " + kArtistRest, order, place);
        return page("(" + kSelect + "WHERE artist_key=$1 AND (" + kArtistRest +
                        ") >= ($2,$3::int,$4::int,$5,$6,$7::int,$8::bytea,$9::float8) ORDER BY " +
                        kArtistRest + " LIMIT 50) UNION ALL (" + kSelect +
                        "WHERE artist_key<$1 ORDER BY " + order + " LIMIT 50) LIMIT 50",
                    at, "place known");
    }

    /* The trigram index and a sort, a scan and a sort, and the walk of the order with a filter: of
     * its rows, and of its index alone. */
    Ways search(const std::string &term) override {
        const std::string sql =
            kSelect + "WHERE title_key LIKE $1 ORDER BY " + kTitleOrder + " LIMIT 50";
        const Texts texts = {"%" + term + "%"};
        Ways ways = {way("walk", server_, sql, texts, record),
                     way("walk of the index", server_, kOfKeys, texts, record),
                     way("scan", scanning_, sql, texts, record)};
        if (term.size() >= 3) {
            ways.push_back(way("trigrams", sorting_, sql, texts, record));
        }
        return ways;
    }

    Ways countOfSearch(const std::string &term) override {
        const std::string sql = "SELECT count(*) FROM zano.songs WHERE title_key LIKE $1";
        const Texts texts = {"%" + term + "%"};
        Ways ways = {counting("index", server_, sql, texts),
                     counting("scan", scanning_, sql, texts)};
        if (term.size() >= 3) {
            ways.push_back(counting("trigrams", sorting_, sql, texts));
        }
        return ways;
    }

    Ways byIds(const std::vector<long> &ids) override {
        const std::string name = prepare(server_, kByIds);
        return {{"", [=, this] { return listed(server_, name, {arrayOf(ids)}, record); }}};
    }

    Ways hundredById(int songs) override {
        const std::string name = prepare(server_, kByIds);
        return {{"100 by id", [this, name, songs, random = std::mt19937(1)]() mutable {
                     const auto ids = hundredIds(random, songs);
                     return listed(server_, name, {arrayOf(ids)}, record);
                 }}};
    }

    Ways artists() override { return {way("", server_, kArtists, {}, value)}; }

    Ways artistsWithTotal() override {
        const Way total =
            counting("", server_, "SELECT value FROM zano.state WHERE name='artists'", {});
        const Way page = way("", server_, kArtists, {}, value);
        return {{"", [=] {
                     total.ask();
                     return page.ask();
                 }}};
    }

    Ways countOfAll() override {
        return {counting("", server_, "SELECT value FROM zano.state WHERE name='songs'", {})};
    }

  private:
    using Server = std::unique_ptr<PGconn, decltype(&PQfinish)>;
    using MakeRecord = ZANO_PLAYLIST_REC *(*)(const PGresult *, int);

    static void check(bool isRight, const Server &server) {
        if (!isRight) {
            throw std::runtime_error(PQerrorMessage(server.get()));
        }
    }

    static void set(const Server &server, const std::string &settings) {
        const Rows done(PQexec(server.get(), ("SET jit=off; " + settings).c_str()), PQclear);
        check(PQresultStatus(done.get()) == PGRES_COMMAND_OK, server);
    }

    std::string prepare(const Server &server, const std::string &sql) {
        const std::string name = "s" + std::to_string(++names_);
        const Rows done(PQprepare(server.get(), name.c_str(), sql.c_str(), 0, nullptr), PQclear);
        check(PQresultStatus(done.get()) == PGRES_COMMAND_OK, server);
        return name;
    }

    static Rows run(const Server &server, const std::string &name, const Texts &texts,
                    int format = 1) {
        std::array<const char *, 16> values{};
        std::transform(texts.begin(), texts.end(), values.begin(),
                       [](const std::string &text) { return text.c_str(); });
        Rows rows(PQexecPrepared(server.get(), name.c_str(), static_cast<int>(texts.size()),
                                 values.data(), nullptr, nullptr, format),
                  PQclear);
        check(PQresultStatus(rows.get()) == PGRES_TUPLES_OK, server);
        return rows;
    }

    static int listed(const Server &server, const std::string &name, const Texts &texts,
                      MakeRecord make) {
        const Rows rows = run(server, name, texts);
        ZANO_PLAYLIST_REC *list = nullptr;
        ZANO_PLAYLIST_REC **tail = &list;
        const int count = PQntuples(rows.get());
        for (int row = 0; row < count; ++row) {
            *tail = make(rows.get(), row);
            tail = &(*tail)->next;
        }
        ZANOPlaylistRecFree(list);
        return count;
    }

    Way way(const std::string &name, const Server &server, const std::string &sql,
            const Texts &texts, MakeRecord make) {
        const std::string statement = prepare(server, sql);
        return {name, [=, &server] { return listed(server, statement, texts, make); }};
    }

    Way counting(const std::string &name, const Server &server, const std::string &sql,
                 const Texts &texts) {
        const std::string statement = prepare(server, sql);
        return {name, [=, &server] {
                    return static_cast<int>(big(run(server, statement, texts).get(), 0, 0));
                }};
    }

    Ways page(const std::string &sql, const Texts &texts = {}, const std::string &name = "") {
        return {way(name, server_, sql, texts, record)};
    }

    /* The values of the song at a place of an order. */
    Texts valuesAt(const std::string &columns, const std::string &order, int place) {
        const std::string sql = "SELECT " + columns + " FROM zano.songs ORDER BY " + order +
                                " LIMIT 1 OFFSET " + std::to_string(place);
        const Rows row = run(server_, prepare(server_, sql), {}, 0);
        Texts texts;
        for (int i = 0; i < PQnfields(row.get()); ++i) {
            texts.emplace_back(PQgetvalue(row.get(), 0, i));
        }
        return texts;
    }

    /* "(SELECT disc FROM place), .." */
    static std::string ofPlace(const std::string &columns) {
        std::string from = "(SELECT " + columns;
        for (size_t at = from.find(", "); at != std::string::npos; at = from.find(", ", at + 22)) {
            from.replace(at, 2, " FROM place), (SELECT ");
        }
        return from + " FROM place)";
    }

    static std::string arrayOf(const std::vector<long> &ids) {
        std::string text;
        for (const long id : ids) {
            text.append(text.empty() ? "{" : ",").append(std::to_string(id));
        }
        return text + "}";
    }

    inline static const std::string kPlace =
        "WITH place AS MATERIALIZED (SELECT * FROM zano.songs WHERE id=(SELECT song FROM "
        "zano.anchors WHERE ";
    inline static const std::string kOfKeys =
        kSelect +
        "JOIN (SELECT DISTINCT title_key, album_key, disc, track FROM (SELECT title_key, "
        "album_key, disc, track FROM zano.songs WHERE title_key LIKE $1 ORDER BY "
        "title_key, album_key, disc, track LIMIT 50) AS keys) AS keys USING(title_key, "
        "album_key, disc, track) ORDER BY " +
        kTitleOrder + " LIMIT 50";
    inline static const std::string kByIds = kSelect + "WHERE id=ANY($1::bigint[])";
    inline static const std::string kArtists =
        "SELECT name FROM zano.facets WHERE facet=1 ORDER BY key, name LIMIT 50";

    Server server_, sorting_, scanning_;
    int names_ = 0;
};

}  // namespace

std::unique_ptr<Hand> postgresqlHand(const std::string &uri) {
    return std::make_unique<PostgresqlHand>(uri);
}

}  // namespace zano::bench
