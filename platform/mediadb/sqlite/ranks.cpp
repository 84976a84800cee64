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
    static constexpr RankedOrder kOrder{
        "tail_rank", 1024, isBeforeInTail,
        "album_key, disc, track, title_key, artist_key, genre_key, year, path, duration"};
    return kOrder;
}

const RankedOrder &titleOrder() {
    static constexpr RankedOrder kOrder{"rank", 256, isBeforeByTitle, "title_key, tail_rank"};
    return kOrder;
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
    sorted_ = prepare("SELECT id FROM songs ORDER BY " + std::string(order.sortedBy));
}

void Ranking::setRank(std::int64_t id, std::int64_t rank) {
    update_.bind(1, rank).bind(2, id).run();
}

/* The sorting gives ids in the order of the ranks; the rows are then written one after another,
 * since jumping between them would take many times as long. */
void Ranking::rankAll() {
    std::vector<std::pair<std::int64_t, std::int64_t>> ranks;
    while (sorted_.step()) {
        const auto place = static_cast<std::int64_t>(ranks.size()) + 1;
        ranks.emplace_back(sorted_.integer(0), place * order_.distance);
    }
    std::sort(ranks.begin(), ranks.end());
    for (const auto &[id, rank] : ranks) {
        setRank(id, rank);
    }
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
