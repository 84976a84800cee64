/* The questions of library_bench as they are asked by hand, of one engine: prepared statements
 * through its client library, which fill the same records as the library and link them into lists.
 */
#pragma once

#include <functional>
#include <memory>
#include <random>
#include <set>
#include <string>
#include <vector>

namespace zano::bench {

/* Asks once; the number of rows that came, or the number that was counted. */
using Question = std::function<int()>;

struct Way {
    std::string name;
    Question ask;
};
/* Where there are several, the fastest counts. */
using Ways = std::vector<Way>;

/* What is asked refers to the object, which must live as long. Pages have 50 rows. */
class Hand {
  public:
    Hand() = default;
    virtual ~Hand() = default;
    Hand(const Hand &) = delete;
    Hand &operator=(const Hand &) = delete;

    virtual Ways firstPage() = 0;
    virtual Ways firstPageByArtistDescending() = 0;
    /* From the anchor before the place. */
    virtual Ways deepPage(int place) = 0;
    virtual Ways deepPageByArtistDescending(int place) = 0;
    /* From values that the caller would have to know already. */
    virtual Ways knownPage(int place) = 0;
    virtual Ways knownPageByArtistDescending(int place) = 0;
    virtual Ways search(const std::string &term) = 0;
    virtual Ways countOfSearch(const std::string &term) = 0;
    virtual Ways byIds(const std::vector<long> &ids) = 0;
    /* 100 songs, other ones each time. */
    virtual Ways hundredById(int songs) = 0;
    virtual Ways artists() = 0;
    virtual Ways artistsWithTotal() = 0;
    virtual Ways countOfAll() = 0;
};

/* Different ones, from 1 to `songs`. */
inline std::vector<long> hundredIds(std::mt19937 &random, int songs) {
    std::uniform_int_distribution<long> anyId(1, songs);
    std::set<long> ids;
    while (ids.size() < 100) {
        ids.insert(anyId(random));
    }
    return {ids.begin(), ids.end()};
}

std::unique_ptr<Hand> sqliteHand(const std::string &path);
std::unique_ptr<Hand> postgresqlHand(const std::string &uri);

}  // namespace zano::bench
