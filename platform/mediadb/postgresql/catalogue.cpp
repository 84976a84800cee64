#include <zanoplatform/error.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdlib>
#include <memory>
#include <span>
#include <unordered_map>
#include <utility>

#include "../query/statements.h"
#include "check.h"
#include "common_grams.h"
#include "engine.h"
#include "plan.h"
#include "songs.h"
#include "text/fold.h"

namespace zano::mediadb::postgresql {
namespace {

/* Songs are sent in pieces of this number, since a question for each would take most of the time.
 */
constexpr size_t kSongsAtOnce = 1000;
/* A batch of more songs than these is written in several goes, so that its memory is bounded. */
constexpr size_t kSongsHeld = 20000;
/* The planner's numbers are made anew when a fifth of the songs has come or gone. */
constexpr std::int64_t kRecountShare = 5;
/* So many songs tell how many have which letters in a row. */
constexpr double kSongsSampled = 50000;
/* The trigram index gives n songs in the time of n rows, which lie anywhere. A walk in the index of
 * an order finds a page of 50 of them after 50 * all / n entries, and a row takes about as long as
 * eight of those: both are alike where n * n is this times all. */
constexpr double kEvenSquare = 6.5;
constexpr std::int64_t kFewSongs = 100;
/* The entries of a page with more songs than these between are looked at before their rows. */
constexpr std::int64_t kManyShare = 16;
constexpr std::array kSearched = {Column::Title, Column::Artist, Column::Album, Column::Genre};
/* Held by who sets anchors; any number that all programs of this kind use. */
constexpr const char *kLockAnchors = "SELECT pg_advisory_lock(1517118562, 2)";
constexpr const char *kUnlockAnchors = "SELECT pg_advisory_unlock(1517118562, 2)";
constexpr const char *kSnapshot = "BEGIN TRANSACTION ISOLATION LEVEL REPEATABLE READ";

class PostgresqlCatalogue : public Catalogue {
  public:
    explicit PostgresqlCatalogue(const std::string &uri) : connection_(openForWriting(uri)) {
        connection_.run(std::string(kPatience));
    }
    ~PostgresqlCatalogue() override { PostgresqlCatalogue::rollback(); }

    /* The range ends at "folder0", '0' being the character behind '/'. It comes from the index in
     * order, and holds a few neighbours such as "folder-b", which are passed over. */
    void forEachFile(const std::string &folder, const FileCallback &callback) override {
        const bool isAll = folder.empty();
        Sql sql = newSql(
            "DECLARE files NO SCROLL CURSOR FOR SELECT path, size, modified, changed FROM songs");
        if (!isAll) {
            sql.add(" WHERE path>=").bind(folder).add(" AND path<").bind(folder + "0");
        }
        sql.add(" ORDER BY path");
        const bool isOwn = !isOpen_;
        if (isOwn) {
            open("BEGIN");
        }
        try {
            connection_.run(sql);
            for (Result rows = nextFiles(); rows.size() > 0; rows = nextFiles()) {
                for (int i = 0; i < rows.size(); ++i) {
                    const std::string_view path = rows[i].text(0);
                    if (isAll || path.size() == folder.size() || path[folder.size()] == '/') {
                        callback(path,
                                 {rows[i].integer(1), rows[i].integer(2), rows[i].integer(3)});
                    }
                }
            }
            connection_.run(std::string("CLOSE files"));
        } catch (...) {
            rollback();
            throw;
        }
        if (isOwn) {
            close();
        }
    }

    void begin() override { open("BEGIN TRANSACTION ISOLATION LEVEL READ COMMITTED"); }

    void commit() override {
        flush();
        if (isChanged_) {
            writeFacets();
            addToState("generation", 1);
            addToState("songs", songs_);
            for (const auto &[name, change] : facetCounts_) {
                addToState(name, change);
            }
        }
        close();
    }

    void rollback() noexcept override {
        if (isOpen_) {
            isOpen_ = false;
            try {
                connection_.run(std::string("ROLLBACK"));
            } catch (const std::exception &) {
                /* The server is gone, and undoes the batch by itself. */
                isOpen_ = false;
            }
        }
    }

    void putSong(const Song &song) override {
        const auto [place, isNew] = placeOf_.emplace(song.path, pending_.size());
        if (isNew) {
            pending_.push_back(song);
        } else {
            pending_[place->second] = song;
        }
        if (pending_.size() >= kSongsHeld) {
            flush();
        }
    }

    bool removeSong(const std::string &path) override {
        lockWriting();
        if (placeOf_.count(path) > 0) {
            flush();
        }
        Sql sql = newSql("DELETE FROM songs WHERE path=");
        const Result row = connection_.run(sql.bind(path).add(" RETURNING artist, album, genre"));
        if (row.size() == 0) {
            return false;
        }
        countFacets(facetChanges_, std::string(row[0].text(0)), std::string(row[0].text(1)),
                    std::string(row[0].text(2)), -1);
        --songs_;
        isChanged_ = true;
        return true;
    }

    bool removePlaylist(const std::string &path) override {
        lockWriting();
        Sql sql = newSql("DELETE FROM playlists WHERE path=");
        return connection_.run(sql.bind(path).add(" RETURNING id")).size() > 0;
    }

    void addPlaylist(const PlaylistFile &playlist) override {
        lockWriting();
        Sql sql = newSql(
            "INSERT INTO playlists(path, title, album, title_key, album_key, path_key) VALUES(");
        std::string_view separator;
        for (const std::string &value :
             {playlist.path, playlist.title, playlist.folder, foldedKey(playlist.title),
              foldedKey(playlist.folder), foldedKey(playlist.path)}) {
            sql.add(separator).bind(value);
            separator = ",";
        }
        connection_.run(sql.add(") ON CONFLICT(path) DO NOTHING"));
    }

    std::vector<std::string> playlists(const std::string &folder) override {
        Sql sql = newSql("SELECT path FROM playlists WHERE path=");
        sql.bind(folder).add(" OR (path>=").bind(folder + "/");
        sql.add(" AND path<").bind(folder + "0").add(") ORDER BY path");
        const Result rows = connection_.run(sql);
        std::vector<std::string> paths;
        paths.reserve(static_cast<size_t>(rows.size()));
        for (int i = 0; i < rows.size(); ++i) {
            paths.emplace_back(rows[i].text(0));
        }
        return paths;
    }

    bool finish(const Progress &progress) override {
        const bool isIndexed = state("indexed") != 0;
        if (isIndexed && state("anchored") == state("generation")) {
            return false;
        }
        connection_.run(std::string(kLockAnchors));
        try {
            Steps steps(progress, isIndexed ? 0 : kIndexSteps);
            if (!isIndexed) {
                makeIndexes(steps);
            }
            setAnchors(steps);
        } catch (...) {
            rollback();
            if (!connection_.isBroken()) {
                connection_.run(std::string(kUnlockAnchors));
            }
            throw;
        }
        connection_.run(std::string(kUnlockAnchors));
        refreshStatistics();
        return true;
    }

    std::int64_t songCount() override { return state("songs"); }

    std::vector<Notice> notices(int limit) override {
        Sql sql = newSql("SELECT id, path, former_path, operation FROM notices ORDER BY id LIMIT ");
        const Result rows = connection_.run(sql.bind(std::int64_t{limit}));
        std::vector<Notice> notices;
        notices.reserve(static_cast<size_t>(rows.size()));
        for (int i = 0; i < rows.size(); ++i) {
            notices.push_back({rows[i].integer(0), std::string(rows[i].text(1)),
                               std::string(rows[i].text(2)), static_cast<int>(rows[i].integer(3))});
        }
        return notices;
    }

    void removeNotice(std::int64_t id) override {
        connection_.run(newSql("DELETE FROM notices WHERE id=").bind(id));
    }

    void check() override {
        open(kSnapshot);
        try {
            checkDatabase(connection_);
        } catch (...) {
            rollback();
            throw;
        }
        close();
    }

  private:
    void open(const char *how) {
        connection_.run(std::string(how));
        isOpen_ = true;
        isChanged_ = false;
        isWriting_ = false;
        songs_ = 0;
        pending_.clear();
        placeOf_.clear();
        facetChanges_.clear();
        facetCounts_.clear();
    }

    void close() {
        connection_.run(std::string("COMMIT"));
        isOpen_ = false;
    }

    Result nextFiles() { return connection_.runOnce("FETCH 2000 FROM files"); }

    std::int64_t state(const std::string &name) {
        return connection_.integer(newSql("SELECT value FROM state WHERE name=").bind(name));
    }

    void addToState(const std::string &name, std::int64_t change) {
        if (change != 0) {
            Sql sql = newSql("UPDATE state SET value=value+").bind(change);
            connection_.run(sql.add(" WHERE name=").bind(name));
        }
    }

    void setState(const std::string &name, std::int64_t value) {
        Sql sql = newSql("UPDATE state SET value=").bind(value);
        connection_.run(sql.add(" WHERE name=").bind(name));
    }

    void lockWriting() {
        if (!isWriting_) {
            connection_.run(std::string(kLockWriting));
            isWriting_ = true;
        }
    }

    void flush() {
        const std::vector<Song> songs = std::move(pending_);
        pending_.clear();
        placeOf_.clear();
        for (size_t begin = 0; begin < songs.size(); begin += kSongsAtOnce) {
            lockWriting();
            isChanged_ = true;
            write(std::span(songs).subspan(begin, std::min(kSongsAtOnce, songs.size() - begin)));
        }
    }

    void write(std::span<const Song> songs) {
        const auto stored = loadSongs(connection_, songs);
        SongArrays changed;
        SongArrays added;
        for (const Song &song : songs) {
            const auto known = stored.find(song.path);
            if (known != stored.end()) {
                changed.add(song, known->second.id);
                noteChange(known->second, song);
                continue;
            }
            added.add(song, 0);
            countFacets(facetChanges_, song.artist, song.album, song.genre, 1);
            ++songs_;
        }
        if (!changed.isEmpty()) {
            connection_.run(changed.replacement());
        }
        if (!added.isEmpty()) {
            connection_.run(added.insertion());
        }
    }

    void noteChange(const StoredSong &before, const Song &now) {
        if (!before.isShownAs(now)) {
            countFacets(facetChanges_, before.artist, before.album, before.genre, -1);
            countFacets(facetChanges_, now.artist, now.album, now.genre, 1);
        }
    }

    void writeFacets() {
        FacetArrays changes;
        for (const auto &[facet, change] : facetChanges_) {
            if (change != 0) {
                changes.add(facet, change);
            }
        }
        if (changes.isEmpty()) {
            return;
        }
        const Result rows = connection_.run(changes.addition());
        FacetArrays emptied;
        for (int i = 0; i < rows.size(); ++i) {
            const std::int64_t songs = rows[i].integer(3);
            const FacetChanges::key_type facet{static_cast<int>(rows[i].integer(0)),
                                               std::string(rows[i].text(1)),
                                               std::string(rows[i].text(2))};
            if (songs == 0) {
                emptied.add(facet, 0);
                --facetCounts_[stateOf(std::get<0>(facet))];
            } else if (songs == facetChanges_[facet]) {
                ++facetCounts_[stateOf(std::get<0>(facet))];
            }
        }
        if (!emptied.isEmpty()) {
            connection_.run(emptied.removal());
        }
    }

    static std::string stateOf(int number) {
        return std::string(facets().at(static_cast<size_t>(number) - 1).state);
    }

    /* Tells how far the end of a scan is. */
    class Steps {
      public:
        Steps(const Progress &progress, int indexes)
            : progress_(progress), total_(indexes + static_cast<int>(storedOrders().size()) + 1) {}
        void operator()() {
            if (progress_) {
                progress_(++done_, total_);
            }
        }

      private:
        const Progress &progress_;
        int done_ = 0;
        int total_;
    };

    void makeIndexes(Steps &step) {
        open("BEGIN");
        addIndexes(connection_, [&step] { step(); });
        setState("indexed", 1);
        close();
    }

    void setAnchors(Steps &step) {
        open(kSnapshot);
        const std::int64_t generation = state("generation");
        connection_.run(
            "CREATE TEMPORARY TABLE ordered ON COMMIT DROP AS SELECT id, path, title_key, "
            "album_key, artist_key, genre_key, year, duration, row_number() OVER (ORDER BY " +
            orderText({Column::Album, false}, "") + ") AS tail FROM songs");
        step();
        connection_.run(std::string("DELETE FROM anchors"));
        for (const StoredOrder &order : storedOrders()) {
            Sql sql = newSql("INSERT INTO anchors SELECT ");
            sql.bind(std::int64_t{order.number}).add(", at/").bind(kAnchorDistance);
            sql.add(", id FROM (SELECT id, row_number() OVER (ORDER BY ");
            sql.add(orderColumn(order.leading.column)).add(order.leading.descending ? " DESC" : "");
            sql.add(", tail)-1 AS at FROM ordered) AS places WHERE at%");
            connection_.run(sql.bind(kAnchorDistance).add("=0"));
            step();
        }
        countGrams();
        setState("anchored", generation);
        close();
    }

    /* Of some of the songs, at random: what repeats with their ids must not mislead. */
    void countGrams() {
        const std::int64_t songs = connection_.integer(newSql("SELECT count(*) FROM ordered"));
        const double share =
            std::min(1.0, kSongsSampled / static_cast<double>(std::max<std::int64_t>(songs, 1)));
        Sql sample = newSql("DECLARE files NO SCROLL CURSOR FOR SELECT ");
        std::string_view separator;
        std::array<std::string_view, 4> keys;
        std::transform(kSearched.begin(), kSearched.end(), keys.begin(),
                       [](Column column) { return columnInfo(column).key; });
        for (const std::string_view key : keys) {
            sample.add(separator).add(key);
            separator = ", ";
        }
        sample.add(" FROM songs WHERE random()<").bind(share);
        connection_.run(sample);
        const auto counts = std::make_unique<std::array<GramCounts, keys.size()>>();
        for (Result rows = nextFiles(); rows.size() > 0; rows = nextFiles()) {
            for (int i = 0; i < rows.size(); ++i) {
                for (size_t column = 0; column < keys.size(); ++column) {
                    (*counts)[column].add(rows[i].text(static_cast<int>(column)));
                }
            }
        }
        connection_.run(std::string("CLOSE files; DELETE FROM grams"));
        const auto sampled = [share](std::int64_t number) {
            return static_cast<std::int64_t>(static_cast<double>(number) * share);
        };
        const double even = std::sqrt(kEvenSquare * static_cast<double>(songs));
        const std::int64_t few = sampled(std::max(kFewSongs, static_cast<std::int64_t>(even)));
        const std::int64_t many = sampled(std::max(kFewSongs, songs / kManyShare));
        for (size_t column = 0; column < keys.size(); ++column) {
            Sql sql = newSql("INSERT INTO grams VALUES(").bind(std::string(keys[column])).add(",");
            sql.bind((*counts)[column].shares(few, many).bits());
            connection_.run(sql.add(")"));
        }
    }

    /* Without them the server would guess how often words come. Vacuuming lets it answer counts
     * from indexes alone, and empties the list of what the search index has yet to take in. */
    void refreshStatistics() {
        const std::int64_t songs = state("songs");
        if (std::abs(songs - state("counted")) * kRecountShare > songs) {
            try {
                connection_.run(std::string("VACUUM (ANALYZE) songs, facets, playlists, anchors"));
            } catch (const ServerError &) {
                connection_.run(std::string("ANALYZE"));  // of an engine that has nothing to vacuum
            }
            setState("counted", songs);
        }
    }

    Connection connection_;
    bool isOpen_ = false;

    /* Of the batch. */
    bool isChanged_ = false;
    bool isWriting_ = false;  // under the lock
    std::int64_t songs_ = 0;  // come, less those gone
    std::vector<Song> pending_;
    std::unordered_map<std::string, size_t> placeOf_;
    FacetChanges facetChanges_;
    std::map<std::string, std::int64_t> facetCounts_;
};

}  // namespace

std::unique_ptr<Catalogue> openCatalogue(const std::string &place) {
    return std::make_unique<PostgresqlCatalogue>("postgresql:" + place);
}

}  // namespace zano::mediadb::postgresql
