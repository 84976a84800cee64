
#include "hand.h"
#include "raw.h"

namespace zano::bench {
namespace {

std::string matchOf(const std::string &text) {
    std::string match;
    if (text.size() < 3) {
        return match.append("\"\x01").append(text).append("\" *");
    }
    for (size_t i = 0; i + 3 <= text.size(); ++i) {
        match.append(i == 0 ? "" : " AND ").append("\"\x01").append(text, i, 3).append("\"");
    }
    return match;
}

class SqliteHand : public Hand {
  public:
    explicit SqliteHand(const std::string &path) : raw_(path) {
        const std::string indexed = kSelect +
                                    "FROM grams CROSS JOIN songs ON songs.rank=grams.rowid WHERE "
                                    "grams MATCH ?1 AND instr(title_key, ?2)>0 ORDER BY ";
        stream_ = prepare(indexed + "grams.rowid LIMIT 50");
        sort_ = prepare(indexed + "+songs.rank LIMIT 50");
        walk_ = prepare(kSelect +
                        "FROM songs INDEXED BY songs_by_rank WHERE instr(title_key, ?1)>0 "
                        "ORDER BY rank LIMIT 50");
        countGrams_ = prepare("SELECT count(*) FROM grams WHERE grams MATCH ?1");
        countJoin_ = prepare(
            "SELECT count(*) FROM grams CROSS JOIN songs ON songs.rank=grams.rowid WHERE grams "
            "MATCH ?1 AND instr(title_key, ?2)>0");
        countScan_ = prepare("SELECT count(*) FROM songs WHERE instr(title_key, ?1)>0");
        byId_ = prepare(kSelect + "FROM songs WHERE id=?1");
        artists_ = prepare("SELECT name FROM facets WHERE facet=1 ORDER BY key, name LIMIT 50");
        artistCount_ = prepare("SELECT value FROM state WHERE name='artists'");
    }

    Ways firstPage() override {
        return page("", kSelect + "FROM songs INDEXED BY songs_by_rank ORDER BY rank LIMIT 50");
    }

    Ways firstPageByArtistDescending() override {
        return page("", kSelect +
                            "FROM songs INDEXED BY songs_by_artist_down ORDER BY artist_key DESC, "
                            "tail_rank_down DESC LIMIT 50");
    }

    Ways deepPage(int place) override {
        return page("by anchor",
                    kSelect +
                        "FROM songs INDEXED BY songs_by_rank WHERE rank>=(SELECT rank FROM songs "
                        "WHERE id=(SELECT song FROM anchors WHERE stored_order=1 AND place=?1)) "
                        "ORDER BY rank LIMIT 50 OFFSET ?2",
                    {}, {place / 128, place % 128});
    }

    Ways deepPageByArtistDescending(int place) override {
        return page(
            "by anchor",
            kSelect +
                "FROM songs INDEXED BY songs_by_artist_down WHERE (artist_key, tail_rank_down)<="
                "(SELECT artist_key, tail_rank_down FROM songs WHERE id=(SELECT song FROM anchors "
                "WHERE stored_order=6 AND place=?1)) ORDER BY artist_key DESC, tail_rank_down DESC "
                "LIMIT 50 OFFSET ?2",
            {}, {place / 128, place % 128});
    }

    Ways knownPage(int place) override {
        const long rank = raw_.number(
            prepare("SELECT rank FROM songs ORDER BY rank LIMIT 1 OFFSET " + std::to_string(place)),
            {});
        return page(
            "place known",
            kSelect + "FROM songs INDEXED BY songs_by_rank WHERE rank>=?1 ORDER BY rank LIMIT 50",
            {}, {rank});
    }

    Ways knownPageByArtistDescending(int place) override {
        const std::string at =
            " FROM songs INDEXED BY songs_by_artist_down ORDER BY artist_key DESC, "
            "tail_rank_down DESC LIMIT 1 OFFSET " +
            std::to_string(place);
        const std::string key = raw_.text(prepare("SELECT artist_key" + at));
        const long tail = raw_.number(prepare("SELECT tail_rank_down" + at), {});
        return page("place known",
                    kSelect +
                        "FROM songs INDEXED BY songs_by_artist_down WHERE (artist_key, "
                        "tail_rank_down)<=(?1, ?2) ORDER BY artist_key DESC, tail_rank_down DESC "
                        "LIMIT 50",
                    {key}, {tail});
    }

    /* The search index in its own order, the search index and a sort, and the walk of the order
     * with a filter. */
    Ways search(const std::string &term) override {
        const std::string match = matchOf(term);
        return {{"stream",
                 [=, this] {
                     return raw_.rows(stream_, {match, term}, {});
                 }},
                {"sort",
                 [=, this] {
                     return raw_.rows(sort_, {match, term}, {});
                 }},
                {"walk", [=, this] { return raw_.rows(walk_, {term}, {}); }}};
    }

    Ways countOfSearch(const std::string &term) override {
        const std::string match = matchOf(term);
        Ways ways = {{"join",
                      [=, this] {
                          return number(countJoin_, {match, term});
                      }},
                     {"scan", [=, this] { return number(countScan_, {term}); }}};
        if (term.size() <= 3) {
            ways.push_back({"index", [=, this] { return number(countGrams_, {match}); }});
        }
        return ways;
    }

    Ways byIds(const std::vector<long> &ids) override {
        return {{"", [=, this] { return raw_.rowsById(byId_, ids); }}};
    }

    Ways hundredById(int songs) override {
        return {{"100 by id", [this, songs, random = std::mt19937(1)]() mutable {
                     const auto ids = hundredIds(random, songs);
                     return raw_.rowsById(byId_, ids);
                 }}};
    }

    Ways artists() override {
        return {{"", [this] { return raw_.values(artists_); }}};
    }

    Ways artistsWithTotal() override {
        return {{"", [this] {
                     raw_.number(artistCount_, {});
                     return raw_.values(artists_);
                 }}};
    }

    Ways countOfAll() override {
        const int total = prepare("SELECT value FROM state WHERE name='songs'");
        return {{"", [=, this] { return number(total, {}); }}};
    }

  private:
    int prepare(const std::string &sql) { return raw_.prepare(sql); }

    int number(int statement, const std::vector<std::string> &texts) {
        return static_cast<int>(raw_.number(statement, texts));
    }

    Ways page(const std::string &name, const std::string &sql,
              const std::vector<std::string> &texts = {}, const std::vector<long> &numbers = {}) {
        const int statement = prepare(sql);
        return {{name, [=, this] { return raw_.rows(statement, texts, numbers); }}};
    }

    inline static const std::string kSelect = "SELECT " + Raw::kColumns + " ";

    Raw raw_;
    int stream_ = 0, sort_ = 0, walk_ = 0;
    int countGrams_ = 0, countJoin_ = 0, countScan_ = 0;
    int byId_ = 0, artists_ = 0, artistCount_ = 0;
};

}  // namespace

std::unique_ptr<Hand> sqliteHand(const std::string &path) {
    return std::make_unique<SqliteHand>(path);
}

}  // namespace zano::bench
