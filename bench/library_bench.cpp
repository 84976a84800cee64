/* usage: library_bench LOCATION [Google Benchmark's options]
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
#include <memory>
#include <random>

#include "hand.h"
#include "report.h"
#include "root.h"

namespace zano::bench {
namespace {

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

void add(const std::string &name, const Question &library, const Ways &byHand, int rows) {
    add(name + "/library", library, rows);
    for (const Way &way : byHand) {
        add(name + "/raw" + (way.name.empty() ? "" : " (" + way.name + ")"), way.ask, rows);
    }
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

int artists() {
    ZANO_PLAYLIST_REC *values = nullptr;
    ZANOMusicBrowse(0, &values, " artist as title ", nullptr, "artist", "lower(artist)", 0, 50);
    return released(values);
}

struct Term {
    const char *text;
    const char *kind;
};

void addPages(Hand &hand, int songs) {
    const int half = songs / 2;
    const auto deep = [half] { return listed(nullptr, nullptr, true, half, 50); };
    const auto byArtist = [](int offset) {
        return [offset] { return listed(nullptr, "lower(artist)", false, offset, 50); };
    };
    add(
        "first page", [] { return listed(nullptr, nullptr, true, 0, 50); }, hand.firstPage(), 50);
    add("page at half depth", deep, hand.deepPage(half), 50);
    add("page at half depth, against a place known beforehand", deep, hand.knownPage(half), 50);
    const int last = songs - 50;
    add(
        "last page", [last] { return listed(nullptr, nullptr, true, last, 50); },
        hand.deepPage(last), 50);
    add("first page by artist, descending", byArtist(0), hand.firstPageByArtistDescending(), 50);
    add("page at half depth by artist, descending", byArtist(half),
        hand.deepPageByArtistDescending(half), 50);
    add("page at half depth by artist, descending, against a place known beforehand",
        byArtist(half), hand.knownPageByArtistDescending(half), 50);
}

void addSearches(Hand &hand) {
    static constexpr std::array kTerms = {
        Term{"j", "none"},        Term{"jj", "none"},      Term{"jjj", "none"},
        Term{"jjjjjjjj", "none"}, Term{"z", "few"},        Term{"zy", "few"},
        Term{"zyz", "few"},       Term{"zyzzyvas", "few"}, Term{"q", "1 in 200"},
        Term{"qu", "1 in 200"},   Term{"qui", "1 in 200"}, Term{"quixotic", "1 in 200"},
        Term{"w", "half"},        Term{"wa", "half"},      Term{"wav", "half"},
        Term{"wavelike", "half"}};
    for (const Term &term : kTerms) {
        const std::string what = std::string("\"") + term.text + "\" (" + term.kind + ")";
        const int all = counted(term.text);
        add(
            "search " + what, [term] { return listed(term.text, nullptr, true, 0, 50); },
            hand.search(term.text), std::min(50, all));
        add(
            "count " + what, [term] { return counted(term.text); }, hand.countOfSearch(term.text),
            all);
    }
}

void addOthers(Hand &hand, int songs) {
    std::mt19937 random(1);
    std::uniform_int_distribution<long> anyId(1, songs);
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
    add(
        "random 100", [] { return listed(nullptr, "random", true, 0, 100); },
        hand.hundredById(songs), 100);
    add(
        "1000 by id",
        [list] {
            ZANO_PLAYLIST_REC *rows = nullptr;
            ZANOMusicListGetByID(&rows, list.c_str());
            return released(rows);
        },
        hand.byIds(thousand), static_cast<int>(thousand.size()));
    add("first page of artists", artists, hand.artists(), 50);
    add(
        "first page of artists, with total",
        [] {
            return MediaInfoDBGetCount(0, "DISTINCT artist", nullptr, 0, 0) > 0 ? artists() : -1;
        },
        hand.artistsWithTotal(), 50);
    add(
        "count of all", [] { return counted(nullptr); }, hand.countOfAll(), songs);
}

std::unique_ptr<Hand> handOf(const std::string &location) {
    constexpr std::string_view kSqlite = "sqlite:";
    return location.compare(0, kSqlite.size(), kSqlite) == 0
               ? sqliteHand(location.substr(kSqlite.size()))
               : postgresqlHand(location);
}

}  // namespace
}  // namespace zano::bench

int main(int argc, char **argv) {
    std::unique_ptr<zano::bench::Hand> hand;
    return zano::bench::runComparison(argc, argv, "library_bench",
                                      [&hand](const std::string &location) {
                                          zano::bench::prepareRoot(location);
                                          hand = zano::bench::handOf(location);
                                          const int songs = zano::bench::counted(nullptr);
                                          zano::bench::addPages(*hand, songs);
                                          zano::bench::addSearches(*hand);
                                          zano::bench::addOthers(*hand, songs);
                                      });
}
