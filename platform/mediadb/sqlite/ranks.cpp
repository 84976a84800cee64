#include "ranks.h"

#include <algorithm>
#include <tuple>
#include <utility>

namespace zano::mediadb::sqlite {
namespace {

/* Songs that are spread anew get at least this distance. */
constexpr std::int64_t kLeastDistance = 8;
constexpr std::int64_t kFirstWindow = 16;

bool isBeforeInTail(const SongKey &a, const SongKey &b) {
    const auto fields = [](const SongKey &key) {
        return std::tie(key.albumKey, key.disc, key.track, key.titleKey, key.artistKey,
                        key.genreKey, key.year, key.path, key.duration);
    };
    return fields(a) < fields(b);
}

bool isBeforeByTitle(const SongKey &a, const SongKey &b) {
    return std::tie(a.titleKey, a.tailRank) < std::tie(b.titleKey, b.tailRank);
}

std::string withColumn(std::string sql, std::string_view column) {
    for (size_t at = sql.find('@'); at != std::string::npos; at = sql.find('@', at)) {
        sql.replace(at, 1, column);
    }
    return sql;
}

}  // namespace

const RankedOrder &tailOrder() {
    static constexpr RankedOrder kOrder{"tail_rank", 1024, isBeforeInTail};
    return kOrder;
}

const RankedOrder &titleOrder() {
    static constexpr RankedOrder kOrder{"rank", 256, isBeforeByTitle};
    return kOrder;
}

/* The rows are written once and one after another: jumping between them, or writing them for each
 * order, takes many times as long. */
void rankAll(Connection &connection) {
    struct Ranks {
        std::int64_t id;
        std::int64_t tail;
        std::int64_t title;
    };
    std::vector<Ranks> songs;
    Statement byTail = connection.prepare(
        "SELECT id FROM songs ORDER BY album_key, disc, track, title_key, artist_key, genre_key, "
        "year, path, duration");
    while (byTail.step()) {
        const auto place = static_cast<std::int64_t>(songs.size()) + 1;
        songs.push_back({byTail.integer(0), place * tailOrder().distance, 0});
    }
    const auto isBefore = [](const Ranks &a, const Ranks &b) { return a.id < b.id; };
    std::sort(songs.begin(), songs.end(), isBefore);

    /* Songs of one title come together; their tails, found by id, decide between them. */
    std::vector<Ranks *> sameTitle;
    std::string title;
    std::int64_t rank = 0;
    const auto rankSameTitle = [&] {
        std::sort(sameTitle.begin(), sameTitle.end(),
                  [](const Ranks *a, const Ranks *b) { return a->tail < b->tail; });
        for (Ranks *song : sameTitle) {
            song->title = rank += titleOrder().distance;
        }
        sameTitle.clear();
    };
    Statement byTitle = connection.prepare("SELECT id, title_key FROM songs ORDER BY title_key");
    while (byTitle.step()) {
        if (byTitle.text(1) != title) {
            rankSameTitle();
            title = byTitle.text(1);
        }
        sameTitle.push_back(&*std::lower_bound(songs.begin(), songs.end(),
                                               Ranks{byTitle.integer(0), 0, 0}, isBefore));
    }
    rankSameTitle();

    Statement update = connection.prepare("UPDATE songs SET tail_rank=?1, rank=?2 WHERE id=?3");
    for (const Ranks &song : songs) {
        update.bind(1, song.tail).bind(2, song.title).bind(3, song.id).run();
    }
}

std::string_view songKeyColumns() {
    return "id, album_key, disc, track, title_key, artist_key, genre_key, year, path, duration, "
           "tail_rank";
}

SongKey readSongKey(const Statement &row, int firstColumn) {
    int column = firstColumn;
    SongKey key;
    key.id = row.integer(column++);
    key.albumKey = row.text(column++);
    key.disc = static_cast<int>(row.integer(column++));
    key.track = static_cast<int>(row.integer(column++));
    key.titleKey = row.text(column++);
    key.artistKey = row.text(column++);
    key.genreKey = row.text(column++);
    key.year = static_cast<int>(row.integer(column++));
    key.path = row.text(column++);
    key.duration = row.real(column++);
    key.tailRank = row.integer(column++);
    return key;
}

/* New songs that stand one behind another, between two ranked ones. */
struct Ranking::Run {
    const SongKey *songs;
    std::int64_t count;
    bool hasNext;
    std::int64_t next;  // rank of the song behind the run
};

Ranking::Ranking(Connection &connection, const RankedOrder &order) : order_(order) {
    const auto prepare = [&](std::string_view sql) {
        return connection.prepare(withColumn(std::string(sql), order.column), true);
    };
    atOrBehind_ = prepare("SELECT @, " + std::string(songKeyColumns()) +
                          " FROM songs WHERE @>=?1 ORDER BY @ LIMIT 1");
    lastBefore_ = prepare("SELECT max(@) FROM songs WHERE @<?1");
    ends_ = prepare("SELECT (SELECT min(@) FROM songs), (SELECT max(@) FROM songs)");
    before_ = prepare("SELECT id, @ FROM songs WHERE @<?1 ORDER BY @ DESC LIMIT ?2");
    behind_ = prepare("SELECT id, @ FROM songs WHERE @>=?1 ORDER BY @ LIMIT ?2");
    update_ = prepare("UPDATE songs SET @=?1 WHERE id=?2");
}

void Ranking::setRank(std::int64_t id, std::int64_t rank) {
    update_.bind(1, rank).bind(2, id).run();
}

/* The first ranked song that stands behind `song`, found by halving the range of the ranks. */
bool Ranking::successor(const SongKey &song, Neighbour &found) {
    Using ends(ends_);
    ends->step();
    if (ends->isNull(0)) {
        return false;
    }
    std::int64_t low = ends->integer(0);
    std::int64_t high = ends->integer(1) + 1;
    bool isFound = false;
    while (low < high) {
        const std::int64_t middle = low + (high - low) / 2;
        Using row(atOrBehind_);
        row->bind(1, middle);
        row->step();
        Neighbour candidate{readSongKey(atOrBehind_, 1), row->integer(0)};
        if (order_.isBefore(song, candidate.key)) {
            high = middle;
            isFound = true;
            found = std::move(candidate);
        } else {
            low = candidate.rank + 1;
        }
    }
    return isFound;
}

void Ranking::place(std::vector<SongKey> &songs, const Moved &moved) {
    std::sort(songs.begin(), songs.end(), order_.isBefore);
    for (size_t i = 0; i < songs.size();) {
        Neighbour next;
        const bool hasNext = successor(songs[i], next);
        size_t end = i + 1;
        while (end < songs.size() && (!hasNext || order_.isBefore(songs[end], next.key))) {
            ++end;
        }
        placeRun({&songs[i], static_cast<std::int64_t>(end - i), hasNext, next.rank}, moved);
        i = end;
    }
}

void Ranking::placeRun(const Run &run, const Moved &moved) {
    Using row(run.hasNext ? lastBefore_ : ends_);
    if (run.hasNext) {
        row->bind(1, run.next);
    }
    row->step();
    const int column = run.hasNext ? 0 : 1;
    const bool hasPrevious = !row->isNull(column);
    const std::int64_t previous = row->integer(column);
    if (hasPrevious && run.hasNext && run.next - previous <= run.count) {
        spread(run, moved);
        return;
    }
    for (std::int64_t i = 0; i < run.count; ++i) {
        std::int64_t rank = 0;
        if (hasPrevious && run.hasNext) {
            rank = previous + (run.next - previous) * (i + 1) / (run.count + 1);
        } else if (run.hasNext) {
            rank = run.next - order_.distance * (run.count - i);
        } else {
            rank = previous + order_.distance * (i + 1);
        }
        setRank(run.songs[i].id, rank);
    }
}

/* Takes in ever more neighbours until there is room for all at a fair distance. */
void Ranking::spread(const Run &run, const Moved &moved) {
    std::vector<std::pair<std::int64_t, std::int64_t>> front;
    std::vector<std::pair<std::int64_t, std::int64_t>> back;
    const auto read = [&](Statement &statement, std::int64_t count, auto &songs) {
        songs.clear();
        Using rows(statement);
        rows->bind(1, run.next).bind(2, count);
        while (rows->step()) {
            songs.emplace_back(rows->integer(0), rows->integer(1));
        }
    };
    std::int64_t low = 0;
    std::int64_t distance = 0;
    for (std::int64_t window = kFirstWindow; distance < kLeastDistance; window *= 2) {
        /* One more at each side, which stays where it is and bounds the room. */
        read(before_, window + 1, front);
        read(behind_, window + 1, back);
        const bool isAllFront = static_cast<std::int64_t>(front.size()) <= window;
        const bool isAllBack = static_cast<std::int64_t>(back.size()) <= window;
        low = front.back().second - (isAllFront ? order_.distance : 0);
        const std::int64_t high = back.back().second + (isAllBack ? order_.distance : 0);
        front.resize(front.size() - (isAllFront ? 0 : 1));
        back.resize(back.size() - (isAllBack ? 0 : 1));
        const auto all = static_cast<std::int64_t>(front.size() + back.size()) + run.count;
        distance = isAllFront && isAllBack ? order_.distance : (high - low) / (all + 1);
    }
    std::int64_t rank = low;
    const auto move = [&](const std::pair<std::int64_t, std::int64_t> &song) {
        rank += distance;
        if (rank != song.second) {
            moved(song.first, song.second);
            setRank(song.first, rank);
        }
    };
    std::for_each(front.rbegin(), front.rend(), move);
    for (std::int64_t i = 0; i < run.count; ++i) {
        rank += distance;
        setRank(run.songs[i].id, rank);
    }
    std::for_each(back.begin(), back.end(), move);
}

}  // namespace zano::mediadb::sqlite
