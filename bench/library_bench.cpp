/* usage: library_bench CATALOGUE [Google Benchmark's options]
 *
 * Asks the library what a web front asks, over a catalogue made by generate_catalogue, beside the
 * best statements that can be written by hand for the same rows, and prints the ratios. The setting
 * and the music link that the library reads are written below the build's own root.
 */
#include <benchmark/benchmark.h>
#include <vorelix/vorelix.h>
#include <zanoplatform/media_database.h>

#include <algorithm>
#include <array>
#include <cstdio>
#include <functional>
#include <optional>
#include <random>

#include "raw.h"
#include "report.h"
#include "root.h"

namespace zano::bench {
namespace {

using Question = std::function<int()>;

/* Every way to ask must give the same number of rows, or times mean nothing. */
void add(const std::string &name, const Question &question, int rows) {
    benchmark::RegisterBenchmark(name.c_str(), [question, rows](benchmark::State &state) {
        for (auto _ : state) {
            const int got = question();
            if (got != rows) {
                state.SkipWithError(
                    ("gave " + std::to_string(got) + " rows and not " + std::to_string(rows))
                        .c_str());
                return;
            }
        }
    });
}

int released(ZANO_PLAYLIST_REC *list) {
    const auto count = static_cast<int>(ZANOPlaylistRecCount(list));
    ZANOPlaylistRecFree(list);
    return count;
}

int listed(const char *keyword, const char *sort, bool ascending, int offset, int limit,
           int category = 1) {
    ZANO_PLAYLIST_REC *list = nullptr;
    ZANOMusicListAll(&list, category, keyword, sort, ascending ? 1 : 0, offset, limit);
    return released(list);
}

int counted(const char *keyword) {
    int count = -1;
    ZANOPageTotalRowCount(1, 1, keyword, &count);
    return count;
}

struct Term {
    const char *text;
    const char *kind;
};

class Questions {
  public:
    explicit Questions(const std::string &path) : raw_(path) {}

    void addAll() {
        songs_ = counted(nullptr);
        addPages();
        addSearches();
        addOthers();
    }

  private:
    int prepare(const std::string &sql) { return raw_.prepare(sql); }

    void addPages() {
        const std::string select = "SELECT " + Raw::kColumns + " FROM songs ";
        const int first = prepare(select + "INDEXED BY songs_by_rank ORDER BY rank LIMIT 50");
        add(
            "first page/library", [] { return listed(nullptr, nullptr, true, 0, 50); }, 50);
        add(
            "first page/raw", [this, first] { return raw_.rows(first, {}, {}); }, 50);

        const int half = songs_ / 2;
        const int deep = prepare(select +
                                 "INDEXED BY songs_by_rank WHERE rank>=?1 "
                                 "ORDER BY rank LIMIT 50");
        const long rank = raw_.number(
            prepare("SELECT rank FROM songs ORDER BY rank LIMIT 1 OFFSET " + std::to_string(half)),
            {});
        add(
            "page at half depth/library",
            [half] { return listed(nullptr, nullptr, true, half, 50); }, 50);
        const int byAnchor =
            prepare(select +
                    "INDEXED BY songs_by_rank WHERE rank>=(SELECT rank FROM songs WHERE id=(SELECT "
                    "song FROM "
                    "anchors WHERE stored_order=1 AND place=?1)) ORDER BY rank LIMIT 50 OFFSET ?2");
        add(
            "page at half depth/raw (by anchor)",
            [this, byAnchor, half] {
                return raw_.rows(byAnchor, {}, {half / 128, half % 128});
            },
            50);
        add(
            "page at half depth, against a place known beforehand/library",
            [half] { return listed(nullptr, nullptr, true, half, 50); }, 50);
        add(
            "page at half depth, against a place known beforehand/raw",
            [this, deep, rank] { return raw_.rows(deep, {}, {rank}); }, 50);

        const int byArtist = prepare(select +
                                     "INDEXED BY songs_by_artist_down "
                                     "ORDER BY artist_key DESC, tail_rank_down DESC LIMIT 50");
        add(
            "first page by artist, descending/library",
            [] { return listed(nullptr, "lower(artist)", false, 0, 50); }, 50);
        add(
            "first page by artist, descending/raw",
            [this, byArtist] { return raw_.rows(byArtist, {}, {}); }, 50);
        const int artistDeep =
            prepare(select +
                    "INDEXED BY songs_by_artist_down WHERE (artist_key, tail_rank_down)<="
                    "(?1, ?2) ORDER BY artist_key DESC, tail_rank_down DESC LIMIT 50");
        const int artistByAnchor = prepare(
            select +
            "INDEXED BY songs_by_artist_down WHERE (artist_key, tail_rank_down)<=(SELECT "
            "artist_key, tail_rank_down FROM songs WHERE id=(SELECT song FROM anchors WHERE "
            "stored_order=6 AND place=?1)) ORDER BY artist_key DESC, tail_rank_down DESC "
            "LIMIT 50 OFFSET ?2");
        add(
            "page at half depth by artist, descending/library",
            [half] { return listed(nullptr, "lower(artist)", false, half, 50); }, 50);
        add(
            "page at half depth by artist, descending/raw (by anchor)",
            [this, artistByAnchor, half] {
                return raw_.rows(artistByAnchor, {}, {half / 128, half % 128});
            },
            50);
        const std::string at =
            " FROM songs INDEXED BY songs_by_artist_down ORDER BY artist_key DESC, "
            "tail_rank_down DESC LIMIT 1 OFFSET " +
            std::to_string(half);
        const std::string key = raw_.text(prepare("SELECT artist_key" + at));
        const long tail = raw_.number(prepare("SELECT tail_rank_down" + at), {});
        add(
            "page at half depth by artist, descending, against a place known beforehand/library",
            [half] { return listed(nullptr, "lower(artist)", false, half, 50); }, 50);
        add(
            "page at half depth by artist, descending, against a place known beforehand/raw (place "
            "known)",
            [this, artistDeep, key, tail] { return raw_.rows(artistDeep, {key}, {tail}); }, 50);
    }

    /* Three plans by hand: the search index in its own order, the search index and a sort, and
     * the walk of the order with a filter. The fastest counts. */
    void addSearches() {
        static constexpr std::array kTerms = {
            Term{"j", "none"},        Term{"jj", "none"},      Term{"jjj", "none"},
            Term{"jjjjjjjj", "none"}, Term{"z", "few"},        Term{"zy", "few"},
            Term{"zyz", "few"},       Term{"zyzzyvas", "few"}, Term{"q", "1 in 200"},
            Term{"qu", "1 in 200"},   Term{"qui", "1 in 200"}, Term{"quixotic", "1 in 200"},
            Term{"w", "half"},        Term{"wa", "half"},      Term{"wav", "half"},
            Term{"wavelike", "half"}};
        const std::string indexed = "SELECT " + Raw::kColumns +
                                    " FROM grams CROSS JOIN songs ON songs.rank=grams.rowid WHERE "
                                    "grams MATCH ?1 AND instr(title_key, ?2)>0 ORDER BY ";
        const int stream = prepare(indexed + "grams.rowid LIMIT 50");
        const int sort = prepare(indexed + "+songs.rank LIMIT 50");
        const int walk =
            prepare("SELECT " + Raw::kColumns +
                    " FROM songs INDEXED BY songs_by_rank WHERE instr(title_key, ?1)>0 "
                    "ORDER BY rank LIMIT 50");
        const int countGrams = prepare("SELECT count(*) FROM grams WHERE grams MATCH ?1");
        const int countJoin = prepare(
            "SELECT count(*) FROM grams CROSS JOIN songs ON songs.rank=grams.rowid WHERE grams "
            "MATCH ?1 AND instr(title_key, ?2)>0");
        const int countScan = prepare("SELECT count(*) FROM songs WHERE instr(title_key, ?1)>0");
        for (const Term &term : kTerms) {
            const std::string text = term.text;
            const std::string match = matchOf(text);
            const int rows = std::min(50, counted(term.text));
            const std::string page = "search \"" + text + "\" (" + term.kind + ")";
            add(
                page + "/library", [term] { return listed(term.text, nullptr, true, 0, 50); },
                rows);
            add(
                page + "/raw stream",
                [=, this] {
                    return raw_.rows(stream, {match, text}, {});
                },
                rows);
            add(
                page + "/raw sort",
                [=, this] {
                    return raw_.rows(sort, {match, text}, {});
                },
                rows);
            add(
                page + "/raw walk", [=, this] { return raw_.rows(walk, {text}, {}); }, rows);

            const int all = counted(term.text);
            const std::string count = "count \"" + text + "\" (" + term.kind + ")";
            add(
                count + "/library", [term] { return counted(term.text); }, all);
            if (text.size() <= 3) {
                add(
                    count + "/raw index",
                    [=, this] { return static_cast<int>(raw_.number(countGrams, {match})); }, all);
            }
            add(
                count + "/raw join",
                [=, this] {
                    return static_cast<int>(raw_.number(countJoin, {match, text}));
                },
                all);
            add(
                count + "/raw scan",
                [=, this] { return static_cast<int>(raw_.number(countScan, {text})); }, all);
        }
    }

    static std::string matchOf(const std::string &text) {
        std::string match;
        if (text.size() < 3) {
            return match.append("\"\x01").append(text).append("\" *");
        }
        for (size_t i = 0; i + 3 <= text.size(); ++i) {
            match.append(i == 0 ? "" : " AND ").append("\"\x01").append(text, i, 3).append("\"");
        }
        return match;
    }

    void addOthers() {
        const int byId = prepare("SELECT " + Raw::kColumns + " FROM songs WHERE id=?1");
        std::mt19937 random(1);
        std::uniform_int_distribution<long> anyId(1, songs_);
        std::vector<long> thousand;
        for (int i = 0; i < 1000; ++i) {
            thousand.push_back(anyId(random));
        }
        std::sort(thousand.begin(), thousand.end());
        thousand.erase(std::unique(thousand.begin(), thousand.end()), thousand.end());
        std::shuffle(thousand.begin(), thousand.end(), random);
        std::string list;
        for (const long id : thousand) {
            list += (list.empty() ? "" : ",") + std::to_string(id);
        }
        const auto all = static_cast<int>(thousand.size());
        add(
            "random 100/library", [] { return listed(nullptr, "random", true, 0, 100); }, 100);
        add(
            "random 100/raw (100 by id)",
            [this, byId, anyId, random]() mutable {
                std::vector<long> hundred;
                for (int i = 0; i < 100; ++i) {
                    hundred.push_back(anyId(random));
                }
                return raw_.rowsById(byId, hundred);
            },
            100);
        add(
            "1000 by id/library",
            [list] {
                ZANO_PLAYLIST_REC *songs = nullptr;
                ZANOMusicListGetByID(&songs, list.c_str());
                return released(songs);
            },
            all);
        add(
            "1000 by id/raw", [=, this] { return raw_.rowsById(byId, thousand); }, all);

        const int artists =
            prepare("SELECT name FROM facets WHERE facet=1 ORDER BY key, name LIMIT 50");
        const int artistCount = prepare("SELECT value FROM state WHERE name='artists'");
        add(
            "first page of artists, with total/library",
            [] {
                ZANO_PLAYLIST_REC *values = nullptr;
                ZANOMusicBrowse(0, &values, " artist as title ", nullptr, "artist", "lower(artist)",
                                0, 50);
                return released(values);
            },
            50);
        add(
            "first page of artists, with total/raw",
            [=, this] {
                raw_.number(artistCount, {});
                return raw_.values(artists);
            },
            50);
        const int total = prepare("SELECT value FROM state WHERE name='songs'");
        add(
            "count of all/library", [] { return counted(nullptr); }, songs_);
        add(
            "count of all/raw", [=, this] { return static_cast<int>(raw_.number(total, {})); },
            songs_);
    }

    Raw raw_;
    int songs_ = 0;
};

}  // namespace
}  // namespace zano::bench

int main(int argc, char **argv) {
    std::optional<zano::bench::Questions> questions;
    return zano::bench::runComparison(argc, argv, "library_bench",
                                      [&questions](const std::string &catalogue) {
                                          zano::bench::prepareRoot(catalogue);
                                          questions.emplace(catalogue);
                                          questions->addAll();
                                      });
}
