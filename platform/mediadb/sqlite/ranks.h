/* Ranks: numbers whose order is the order of the songs, with gaps so that songs can be added.
 *
 * Two orders are stored so: the tie-breaks (column tail_rank), and the default order by title
 * (column rank). All other orders follow from a leading column and tail_rank, so their indexes
 * have two small columns; and a search can be answered in page order, since the search index
 * goes by rank. A new song takes the middle of its gap; where a gap is used up, the songs around
 * it are spread anew.
 */
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "handle.h"

namespace zano::mediadb::sqlite {

/* What the place of a song depends on. */
struct SongKey {
    std::int64_t id = 0;
    std::string albumKey;
    int disc = 0;
    int track = 0;
    std::string titleKey;
    std::string artistKey;
    std::string genreKey;
    int year = 0;
    std::string path;
    double duration = 0;
    std::int64_t tailRank = 0;
};

struct RankedOrder {
    std::string_view column;
    std::int64_t distance;  // between neighbours that are ranked at once
    bool (*isBefore)(const SongKey &, const SongKey &);
};
const RankedOrder &tailOrder();
const RankedOrder &titleOrder();

/* Gives every song its rank in both orders. */
void rankAll(Connection &connection);

class Ranking {
  public:
    Ranking(Connection &connection, const RankedOrder &order);

    /* Ranks songs that have none, among those that have. Calls `moved` with the id and former
     * rank of each song that had to make room. */
    using Moved = std::function<void(std::int64_t id, std::int64_t formerRank)>;
    void place(std::vector<SongKey> &songs, const Moved &moved);

  private:
    struct Neighbour {
        SongKey key;
        std::int64_t rank;
    };
    struct Run;

    bool successor(const SongKey &song, Neighbour &found);
    void placeRun(const Run &run, const Moved &moved);
    void spread(const Run &run, const Moved &moved);
    void setRank(std::int64_t id, std::int64_t rank);

    const RankedOrder &order_;
    Statement atOrBehind_;
    Statement lastBefore_;
    Statement ends_;
    Statement before_;
    Statement behind_;
    Statement update_;
};

/* The columns of a SongKey, in the order in which readSongKey takes them. */
std::string_view songKeyColumns();
SongKey readSongKey(const Statement &row, int firstColumn);

}  // namespace zano::mediadb::sqlite
