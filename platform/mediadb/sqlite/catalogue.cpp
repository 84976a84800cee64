#include <unistd.h>
#include <zanoplatform/error.h>

#include <algorithm>
#include <cstdlib>
#include <map>
#include <set>
#include <tuple>
#include <unordered_map>
#include <utility>

#include "../query/render.h"
#include "../query/statements.h"
#include "check.h"
#include "engine.h"
#include "grams.h"
#include "plan.h"
#include "ranks.h"
#include "schema.h"
#include "short_counts.h"
#include "text/fold.h"

namespace zano::mediadb::sqlite {
namespace {

/* A run that adds more songs than this, and more than there were, is a first scan. */
constexpr std::int64_t kFirstScanSongs = 2000;
/* Tokens that fewer songs have are not put on record; they are rare. */
constexpr std::int64_t kCommonGram = 200;
/* They are counted again when a fifth of the songs has come or gone. */
constexpr std::int64_t kRecountShare = 5;

struct Keys {
    explicit Keys(const Song &song)
        : title(foldedKey(song.title)),
          album(foldedKey(song.album)),
          artist(foldedKey(song.artist)),
          genre(foldedKey(song.genre)) {}
    std::string title;
    std::string album;
    std::string artist;
    std::string genre;
};

/* A row as it is stored, as far as the stored orders and the search index depend on it. */
struct StoredSong {
    std::int64_t id = 0;
    bool isRanked = false;
    std::int64_t rank = 0;
    std::string title, album, artist, genre;
    std::string titleKey, albumKey, artistKey, genreKey;
    int track = 0, disc = 0, year = 0;
    double duration = 0;

    bool isShownAs(const Song &song) const {
        return std::tie(title, album, artist, genre, track, disc, year, duration) ==
               std::tie(song.title, song.album, song.artist, song.genre, song.track, song.disc,
                        song.year, song.duration);
    }
    std::string document() const { return gramDocument(titleKey, artistKey, albumKey, genreKey); }
};

class SqliteCatalogue : public Catalogue {
  public:
    explicit SqliteCatalogue(const std::string &path)
        : connection_(openForWriting(path)), songsAtStart_(SqliteCatalogue::songCount()) {
        find_ = prepare(
            "SELECT id, rank, title, album, artist, genre, title_key, album_key, artist_key, "
            "genre_key, track, disc, year, duration FROM songs WHERE path=?1");
        insert_ = prepare(
            "INSERT INTO songs(title, album, artist, genre, track, disc, year, duration, bitrate, "
            "frequency, title_key, album_key, artist_key, genre_key, album_artist, size, modified, "
            "changed, path) VALUES(?1,?2,?3,?4,?5,?6,?7,?8,?9,?10,?11,?12,?13,?14,?15,?16,?17,?18,"
            "?19)");
        replace_ = prepare(
            "UPDATE songs SET title=?1, album=?2, artist=?3, genre=?4, track=?5, disc=?6, year=?7, "
            "duration=?8, bitrate=?9, frequency=?10, title_key=?11, album_key=?12, artist_key=?13, "
            "genre_key=?14, album_artist=?15, size=?16, modified=?17, changed=?18, rank=NULL, "
            "tail_rank=NULL WHERE id=?19");
        touch_ = prepare(
            "UPDATE songs SET bitrate=?1, frequency=?2, album_artist=?3, size=?4, modified=?5, "
            "changed=?6 WHERE id=?7");
        remove_ = prepare("DELETE FROM songs WHERE id=?1");
        addFacet_ = prepare(
            "INSERT INTO facets VALUES(?1, ?2, ?3, 1) ON CONFLICT DO UPDATE SET songs=songs+1 "
            "RETURNING songs");
        dropFacet_ = prepare(
            "UPDATE facets SET songs=songs-1 WHERE facet=?1 AND key=?2 AND name=?3 "
            "RETURNING songs");
        emptyFacet_ = prepare("DELETE FROM facets WHERE facet=?1 AND key=?2 AND name=?3");
        addGrams_ = prepare("INSERT INTO grams(rowid, document) VALUES(?1, ?2)");
        dropGrams_ = prepare("INSERT INTO grams(grams, rowid, document) VALUES('delete', ?1, ?2)");
        setState_ = prepare("UPDATE state SET value=?2 WHERE name=?1");
        getState_ = prepare("SELECT value FROM state WHERE name=?1");
        byId_ =
            prepare("SELECT " + std::string(songKeyColumns()) + ", rank FROM songs WHERE id=?1");
    }

    ~SqliteCatalogue() override { SqliteCatalogue::rollback(); }

    /* The range ends at "folder0", '0' being the character behind '/'. It comes from the index in
     * order, and holds a few neighbours such as "folder-b", which are passed over. */
    void forEachFile(const std::string &folder, const FileCallback &callback) override {
        const bool isAll = folder.empty();
        Statement rows = prepare(std::string("SELECT path, size, modified, changed FROM songs") +
                                 (isAll ? "" : " WHERE path>=?1 AND path<?2") + " ORDER BY path");
        const std::string end = folder + "0";
        if (!isAll) {
            rows.bind(1, std::string_view(folder)).bind(2, std::string_view(end));
        }
        while (rows.step()) {
            const std::string_view path = rows.text(0);
            if (isAll || path.size() == folder.size() || path[folder.size()] == '/') {
                callback(path, {rows.integer(1), rows.integer(2), rows.integer(3)});
            }
        }
    }

    void begin() override {
        connection_.run("BEGIN IMMEDIATE");
        isOpen_ = true;
        isOrdered_ = state("ordered") != 0;
        songs_ = state("songs");
        isChanged_ = false;
        pending_.clear();
        gramsToDrop_.clear();
        shortCounts_.clear();
        facetCounts_.clear();
    }

    void commit() override {
        if (isChanged_) {
            if (isOrdered_) {
                placePending();
            }
            for (const auto &[name, change] : facetCounts_) {
                setState(name, state(name) + change);
            }
            setState("songs", songs_);
            setState("generation", state("generation") + 1);
        }
        connection_.run("COMMIT");
        isOpen_ = false;
    }

    void rollback() noexcept override {
        if (isOpen_) {
            sqlite3_exec(connection_.get(), "ROLLBACK", nullptr, nullptr, nullptr);
            isOpen_ = false;
        }
    }

    void putSong(const Song &song) override {
        StoredSong stored;
        const bool isKnown = load(song.path, stored);
        if (isKnown && stored.isShownAs(song)) {
            touch_.bind(1, song.bitrate).bind(2, song.frequency);
            touch_.bind(3, std::string_view(song.albumArtist));
            touch_.bind(4, song.stamp.size).bind(5, song.stamp.modified);
            touch_.bind(6, song.stamp.changed).bind(7, stored.id).run();
            isChanged_ = true;
            return;
        }
        const Keys keys(song);
        Statement &statement = isKnown ? replace_ : insert_;
        bindSong(statement, song, keys);
        if (isKnown) {
            leaveOrders(stored);
            statement.bind(19, stored.id).run();
        } else {
            statement.bind(19, std::string_view(song.path)).run();
            stored.id = connection_.lastId();
            ++songs_;
            noteInsertion();
        }
        isChanged_ = true;
        if (isOrdered_) {
            pending_.insert(stored.id);
            countFacets(song.artist, keys.artist, song.album, keys.album, song.genre, keys.genre);
        }
    }

    bool removeSong(const std::string &path) override {
        StoredSong stored;
        if (!load(path, stored)) {
            return false;
        }
        leaveOrders(stored);
        pending_.erase(stored.id);
        remove_.bind(1, stored.id).run();
        --songs_;
        isChanged_ = true;
        return true;
    }

    bool removePlaylist(const std::string &path) override {
        prepare("DELETE FROM playlists WHERE path=?1").bind(1, path).run();
        return connection_.changes() > 0;
    }

    void addPlaylist(const PlaylistFile &playlist) override {
        const std::string titleKey = foldedKey(playlist.title);
        const std::string folderKey = foldedKey(playlist.folder);
        prepare(
            "INSERT INTO playlists(path, title, album, title_key, album_key) "
            "VALUES(?1, ?2, ?3, ?4, ?5) ON CONFLICT(path) DO NOTHING")
            .bind(1, playlist.path)
            .bind(2, playlist.title)
            .bind(3, playlist.folder)
            .bind(4, titleKey)
            .bind(5, folderKey)
            .run();
    }

    std::vector<std::string> playlists(const std::string &folder) override {
        Statement rows = prepare(
            "SELECT path FROM playlists WHERE path=?1 OR (path>=?2 AND path<?3) "
            "ORDER BY path");
        const std::string start = folder + "/";
        const std::string end = folder + "0";
        rows.bind(1, folder).bind(2, start).bind(3, end);
        std::vector<std::string> paths;
        while (rows.step()) {
            paths.emplace_back(rows.text(0));
        }
        return paths;
    }

    bool finish(const Progress &progress) override {
        if (state("ordered") != 0 && state("anchored") == state("generation")) {
            return false;
        }
        begin();
        try {
            finishBatch(progress);
        } catch (...) {
            rollback();
            throw;
        }
        connection_.run("PRAGMA wal_checkpoint(PASSIVE)");
        return true;
    }

    std::int64_t songCount() override {
        return connection_.integer("SELECT value FROM state WHERE name='songs'");
    }

    std::vector<Notice> notices(int limit) override {
        Statement rows =
            prepare("SELECT id, path, former_path, operation FROM notices ORDER BY id LIMIT ?1");
        rows.bind(1, limit);
        std::vector<Notice> notices;
        while (rows.step()) {
            notices.push_back({rows.integer(0), std::string(rows.text(1)),
                               std::string(rows.text(2)), static_cast<int>(rows.integer(3))});
        }
        return notices;
    }

    void removeNotice(std::int64_t id) override {
        prepare("DELETE FROM notices WHERE id=?1").bind(1, id).run();
    }

    void check() override {
        const Transaction moment(connection_, "BEGIN");
        checkDatabase(connection_);
    }

  private:
    void finishBatch(const Progress &progress) {
        if (!isOrdered_) {
            buildOrders(progress);
        }
        if (std::abs(songs_ - state("counted")) > songs_ / kRecountShare) {
            countGrams();
        }
        setAnchors();
        commit();
    }

    Statement prepare(std::string_view sql) { return connection_.prepare(sql, true); }

    std::int64_t state(std::string_view name) {
        Using row(getState_);
        row->bind(1, name);
        return row->step() ? row->integer(0) : 0;
    }

    void setState(std::string_view name, std::int64_t value) {
        setState_.bind(1, name).bind(2, value).run();
    }

    bool load(const std::string &path, StoredSong &song) {
        Using row(find_);
        row->bind(1, path);
        if (!row->step()) {
            return false;
        }
        song.id = row->integer(0);
        song.isRanked = !row->isNull(1);
        song.rank = row->integer(1);
        int column = 2;
        for (std::string *text :
             {&song.title, &song.album, &song.artist, &song.genre, &song.titleKey, &song.albumKey,
              &song.artistKey, &song.genreKey}) {
            *text = row->text(column++);
        }
        for (int *number : {&song.track, &song.disc, &song.year}) {
            *number = static_cast<int>(row->integer(column++));
        }
        song.duration = row->real(column);
        return true;
    }

    static void bindSong(Statement &statement, const Song &song, const Keys &keys) {
        int index = 1;
        for (const std::string *text : {&song.title, &song.album, &song.artist, &song.genre}) {
            statement.bind(index++, std::string_view(*text));
        }
        for (const int number : {song.track, song.disc, song.year}) {
            statement.bind(index++, number);
        }
        statement.bind(index++, song.duration);
        for (const int number : {song.bitrate, song.frequency}) {
            statement.bind(index++, number);
        }
        for (const std::string *text :
             {&keys.title, &keys.album, &keys.artist, &keys.genre, &song.albumArtist}) {
            statement.bind(index++, std::string_view(*text));
        }
        statement.bind(index, song.stamp.size).bind(index + 1, song.stamp.modified);
        statement.bind(index + 2, song.stamp.changed);
    }

    /* A song that changes or goes: its traces in the search index and the counts. */
    void leaveOrders(const StoredSong &song) {
        if (!isOrdered_) {
            return;
        }
        if (song.isRanked) {
            const auto place = gramsToDrop_.emplace(song.rank, song.document()).first;
            shortCounts_.add(place->second, -1);
        }
        const std::pair<const std::string &, const std::string &> values[] = {
            {song.artist, song.artistKey},
            {song.album, song.albumKey},
            {song.genre, song.genreKey}};
        for (size_t i = 0; i < facets().size(); ++i) {
            Using row(dropFacet_);
            row->bind(1, facets()[i].number).bind(2, std::string_view(values[i].second));
            row->bind(3, std::string_view(values[i].first));
            if (row->step() && row->integer(0) == 0) {
                emptyFacet_.bind(1, facets()[i].number).bind(2, std::string_view(values[i].second));
                emptyFacet_.bind(3, std::string_view(values[i].first)).run();
                --facetCounts_[std::string(facets()[i].state)];
            }
        }
    }

    void countFacets(const std::string &artist, const std::string &artistKey,
                     const std::string &album, const std::string &albumKey,
                     const std::string &genre, const std::string &genreKey) {
        const std::pair<const std::string &, const std::string &> values[] = {
            {artist, artistKey}, {album, albumKey}, {genre, genreKey}};
        for (size_t i = 0; i < facets().size(); ++i) {
            Using row(addFacet_);
            row->bind(1, facets()[i].number).bind(2, std::string_view(values[i].second));
            row->bind(3, std::string_view(values[i].first));
            if (row->step() && row->integer(0) == 1) {
                ++facetCounts_[std::string(facets()[i].state)];
            }
        }
    }

    /* Keeping the orders up with every song costs ten times what building them afterwards does,
     * so a run that turns out to be a first scan gives them up until its end. */
    void noteInsertion() {
        if (isOrdered_ && ++inserted_ > std::max(kFirstScanSongs, songsAtStart_)) {
            dropOrders();
            isOrdered_ = false;
            setState("ordered", 0);
        }
    }

    void dropOrders() {
        dropOrdersOf(connection_);
        pending_.clear();
        gramsToDrop_.clear();
        shortCounts_.clear();
        facetCounts_.clear();
    }

    /* Ranks the songs of the batch and brings the search index up to date. The index wants its
     * changes in the order of the ranks, or it writes a piece to disk for each. */
    void placePending() {
        std::map<std::int64_t, std::int64_t> moved;  // id and rank in the search index
        place(tailOrder(), [](std::int64_t, std::int64_t) {});
        place(titleOrder(), [&](std::int64_t id, std::int64_t formerRank) {
            if (pending_.count(id) == 0) {
                moved.emplace(id, formerRank);
            }
        });
        std::map<std::int64_t, std::string> toAdd;
        const auto add = [&](std::int64_t id) -> std::string & {
            Using row(byId_);
            row->bind(1, id);
            row->step();
            const SongKey key = readSongKey(byId_, 0);
            return toAdd[row->integer(11)] =
                       gramDocument(key.titleKey, key.artistKey, key.albumKey, key.genreKey);
        };
        for (const std::int64_t id : pending_) {
            shortCounts_.add(add(id), 1);
        }
        shortCounts_.write(connection_);
        for (const auto &[id, formerRank] : moved) {
            gramsToDrop_.emplace(formerRank, add(id));
        }
        for (const auto &[rank, document] : gramsToDrop_) {
            dropGrams_.bind(1, rank).bind(2, std::string_view(document)).run();
        }
        for (const auto &[rank, document] : toAdd) {
            addGrams_.bind(1, rank).bind(2, std::string_view(document)).run();
        }
    }

    void place(const RankedOrder &order, const Ranking::Moved &moved) {
        std::vector<SongKey> songs;
        for (const std::int64_t id : pending_) {
            Using row(byId_);
            row->bind(1, id);
            row->step();
            songs.push_back(readSongKey(byId_, 0));
        }
        Ranking(connection_, order).place(songs, moved);
    }

    void buildOrders(const Progress &progress) {
        const auto indexes = createIndexes();
        const int total = 3 + static_cast<int>(indexes.size());
        int done = 0;
        const auto step = [&] {
            ++done;
            if (progress) {
                progress(done, total);
            }
        };
        dropOrders();
        rankAll(connection_);
        step();
        for (const std::string &statement : indexes) {
            connection_.run(statement);
            step();
        }
        buildGrams();
        step();
        buildFacets();
        connection_.run("PRAGMA analysis_limit=1000");
        connection_.run("ANALYZE");
        step();
        setState("ordered", 1);
        isChanged_ = true;
    }

    void buildGrams() {
        Statement rows = prepare(
            "SELECT rank, title_key, artist_key, album_key, genre_key FROM songs "
            "INDEXED BY songs_by_rank WHERE rank IS NOT NULL ORDER BY rank");
        while (rows.step()) {
            const std::string document =
                gramDocument(rows.text(1), rows.text(2), rows.text(3), rows.text(4));
            addGrams_.bind(1, rows.integer(0)).bind(2, std::string_view(document)).run();
            shortCounts_.add(document, 1);
        }
        shortCounts_.write(connection_);
    }

    void buildFacets() {
        for (const Facet &facet : facets()) {
            const ColumnInfo &info = columnInfo(facet.column);
            Statement fill =
                prepare("INSERT INTO facets SELECT ?1, " + std::string(info.key) + ", " +
                        std::string(info.name) + ", count(*) FROM songs GROUP BY 2, 3");
            fill.bind(1, facet.number).run();
            Statement count = prepare("SELECT count(*) FROM facets WHERE facet=?1");
            count.bind(1, facet.number).step();
            setState(facet.state, count.integer(0));
        }
    }

    /* How many songs have each of the common tokens, and each beginning of one. */
    void countGrams() {
        connection_.run("DELETE FROM gram_counts");
        connection_.run("CREATE VIRTUAL TABLE temp.gram_words USING fts5vocab(main, grams, row)");
        {
            std::unordered_map<std::string, std::int64_t> counts;
            Statement words = prepare("SELECT term, doc FROM temp.gram_words");
            while (words.step()) {
                for (const std::string &beginning : beginningsOf(words.text(0))) {
                    counts[beginning] += words.integer(1);
                }
            }
            Statement insert = prepare("INSERT INTO gram_counts VALUES(?1, ?2)");
            for (const auto &[gram, count] : counts) {
                if (count >= kCommonGram) {
                    insert.bind(1, std::string_view(gram)).bind(2, std::min(count, songs_)).run();
                }
            }
        }
        connection_.run("DROP TABLE temp.gram_words");
        setState("counted", songs_);
    }

    /* One song in each stretch of every order, from which deep pages begin. */
    void setAnchors() {
        connection_.run("DELETE FROM anchors");
        Statement insert = prepare("INSERT INTO anchors VALUES(?1, ?2, ?3)");
        for (const StoredOrder &order : storedOrders()) {
            Statement songs = prepare(orderedIds(order));
            for (std::int64_t at = 0; songs.step(); ++at) {
                if (at % kAnchorDistance == 0) {
                    insert.bind(1, order.number).bind(2, at / kAnchorDistance);
                    insert.bind(3, songs.integer(0)).run();
                }
            }
        }
        setState("anchored", state("generation") + 1);
        isChanged_ = true;
    }

    Connection connection_;
    std::int64_t songsAtStart_;
    std::int64_t inserted_ = 0;
    bool isOpen_ = false;

    /* Of the batch. */
    bool isOrdered_ = false;
    bool isChanged_ = false;
    std::int64_t songs_ = 0;
    std::set<std::int64_t> pending_;
    std::map<std::int64_t, std::string> gramsToDrop_;  // by rank
    ShortCounts shortCounts_;
    std::map<std::string, std::int64_t> facetCounts_;

    Statement find_, insert_, replace_, touch_, remove_;
    Statement addFacet_, dropFacet_, emptyFacet_, addGrams_, dropGrams_;
    Statement setState_, getState_, byId_;
};

}  // namespace

std::unique_ptr<Catalogue> openCatalogue(const std::string &path) {
    return std::make_unique<SqliteCatalogue>(path);
}

}  // namespace zano::mediadb::sqlite
