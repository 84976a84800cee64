#include "engine.h"

#include <algorithm>
#include <random>
#include <unordered_set>
#include <utility>

#include "../query/statements.h"
#include "../row_record.h"
#include "plan.h"
#include "reader.h"
#include "text/fold.h"

namespace zano::mediadb::sqlite {
namespace {

/* What all cursors share: the reader with its snapshot, and the query. */
class BaseCursor : public Cursor {
  public:
    BaseCursor(ReaderPool::Lease reader, Query query)
        : reader_(std::move(reader)), query_(std::move(query)) {}

  protected:
    Reader &reader() { return *reader_; }
    bool isOurs() const { return reader_.isOurs(); }
    const Query &query() const { return query_; }

  private:
    ReaderPool::Lease reader_;
    Query query_;
};

/* The rows of one statement. It does not run before the first row is asked for, since some
 * callers want the count alone. */
class StatementCursor : public BaseCursor {
  public:
    StatementCursor(ReaderPool::Lease lease, Query asked)
        : BaseCursor(std::move(lease), std::move(asked)), sql_(dialect()) {}
    /* Before the reader ends its snapshot, which an unfinished statement would keep open. */
    ~StatementCursor() override {
        if (statement_ != nullptr && isOurs()) {
            statement_->reset();
        }
    }

    bool next(ZANO_MEDIA_INFO &row) override {
        reader().restartClock();
        if (isDone_) {
            return false;
        }
        if (statement_ == nullptr) {
            statement_ = &reader().statement(sql_);
        }
        isDone_ = true;  // also when the step fails: the statement would begin anew
        isDone_ = !statement_->step();
        if (!isDone_) {
            putRow(*statement_, query().select, row);
        }
        return !isDone_;
    }

  protected:
    /* Prepares too, so that a text that the engine refuses fails when the query is opened. */
    void setSql(Sql sql) {
        sql_ = std::move(sql);
        reader().statement(sql_.text());
    }

  private:
    Sql sql_;
    Statement *statement_ = nullptr;
    bool isDone_ = false;
};

class SongCursor : public StatementCursor {
  public:
    SongCursor(ReaderPool::Lease lease, Query asked)
        : StatementCursor(std::move(lease), std::move(asked)), plan_(reader(), query().condition) {
        if (const Facet *facet = facetOfQuery()) {
            setSql(valuePage(dialect(), facet->number, query()));
        } else {
            const std::string columns = columnList(query().select, "songs.");
            setSql(query().distinct ? plan_.distinctPage(columns, query())
                                    : plan_.page(columns, query()));
        }
    }

    std::int64_t countAll() override { return plan_.count(query().distinct); }

  private:
    /* Null where the values that are kept do not serve. */
    const Facet *facetOfQuery() {
        if (!plan_.isUnconditional() || !reader().state().isOrdered || !asksForValues(query())) {
            return nullptr;
        }
        return findFacet(*query().distinct);
    }

    SongPlan plan_;
};

class PlaylistCursor : public StatementCursor {
  public:
    PlaylistCursor(ReaderPool::Lease lease, Query asked)
        : StatementCursor(std::move(lease), std::move(asked)) {
        setSql(playlistPage(dialect(), columnList(query().select, ""), query()));
    }

    std::int64_t countAll() override { return reader().integer(playlistCount(dialect(), query())); }
};

/* Songs in random order. A few of many are drawn by their ids, without a look at the others. */
class RandomCursor : public BaseCursor {
  public:
    RandomCursor(ReaderPool::Lease lease, Query asked)
        : BaseCursor(std::move(lease), std::move(asked)),
          plan_(reader(), query().condition),
          byId_(reader().statement("SELECT " + columnList(query().select, "songs.") +
                                   " FROM songs WHERE songs.id=?1")),
          random_(std::random_device{}()) {
        if (!query().distinct && plan_.isUnconditional() && query().limit > 0) {
            findRange();
        }
        if (!isDrawing_) {
            shuffle();
        }
    }

    bool next(ZANO_MEDIA_INFO &row) override {
        reader().restartClock();
        while (left_ > 0) {
            const std::int64_t id = isDrawing_ ? draw() : ids_[static_cast<size_t>(left_ - 1)];
            const Using song(byId_);
            if (byId_.bind(1, id).step()) {
                putRow(byId_, query().select, row);
                --left_;
                return true;
            }
        }
        return false;
    }

    std::int64_t countAll() override { return plan_.count(query().distinct); }

  private:
    /* Drawing again when an id is free or was drawn takes few tries while a quarter of the ids
     * in use are free at most and few songs are wanted. */
    void findRange() {
        const std::int64_t songs = reader().state().songs;
        Sql least(dialect());
        least.add("SELECT min(id) FROM songs");
        Sql greatest(dialect());
        greatest.add("SELECT max(id) FROM songs");
        first_ = reader().integer(least);
        last_ = reader().integer(greatest);
        left_ = std::clamp<std::int64_t>(songs - query().offset, 0, query().limit);
        isDrawing_ = left_ <= songs / 4 && last_ - first_ < 4 * songs;
    }

    std::int64_t draw() {
        for (;;) {
            const std::int64_t id = std::uniform_int_distribution(first_, last_)(random_);
            if (drawn_.insert(id).second) {
                return id;
            }
        }
    }

    void shuffle() {
        const Sql sql = plan_.ids(query().distinct);
        {
            Using rows(reader().statement(sql));
            while (rows->step()) {
                ids_.push_back(rows->integer(0));
            }
        }
        std::shuffle(ids_.begin(), ids_.end(), random_);
        const auto all = static_cast<std::int64_t>(ids_.size());
        left_ = std::max<std::int64_t>(all - query().offset, 0);
        if (query().limit > 0) {
            left_ = std::min(left_, query().limit);
        }
    }

    SongPlan plan_;
    Statement &byId_;
    std::mt19937_64 random_;
    bool isDrawing_ = false;
    std::int64_t first_ = 0;
    std::int64_t last_ = 0;
    std::int64_t left_ = 0;
    std::unordered_set<std::int64_t> drawn_;
    std::vector<std::int64_t> ids_;
};

class SqliteEngine : public Engine {
  public:
    explicit SqliteEngine(const std::string &path)
        : path_(path), pool_(std::make_shared<ReaderPool>(path)) {}

    std::unique_ptr<Cursor> open(Query query) override {
        auto lease = pool_->lease();
        if (query.table == Table::Playlists) {
            return std::make_unique<PlaylistCursor>(std::move(lease), std::move(query));
        }
        if (query.random) {
            return std::make_unique<RandomCursor>(std::move(lease), std::move(query));
        }
        return std::make_unique<SongCursor>(std::move(lease), std::move(query));
    }

    std::int64_t count(const CountQuery &query) override {
        auto lease = pool_->lease();
        if (query.table == Table::Songs) {
            return SongPlan(*lease, query.condition).count(query.distinct);
        }
        Query rows;
        rows.table = query.table;
        rows.select = {{Column::Id, Column::Id}};
        rows.distinct = query.distinct;
        rows.condition = query.condition;
        return PlaylistCursor(std::move(lease), std::move(rows)).countAll();
    }

    void savePlaylist(const ZANO_MEDIA_INFO &row) override {
        Connection connection = openForWriting(path_);
        Statement insert = connection.prepare(
            "INSERT INTO playlists(path, title, album, title_key, album_key) "
            "VALUES(?1, ?2, ?3, ?4, ?5) ON CONFLICT(path) DO UPDATE SET title=?2, album=?3, "
            "title_key=?4, album_key=?5");
        bindPlaylist(insert, row);
    }

    bool updatePlaylist(const ZANO_MEDIA_INFO &row) override {
        Connection connection = openExistingForWriting(path_);
        Statement update = connection.prepare(
            "UPDATE playlists SET path=?1, title=?2, album=?3, title_key=?4, album_key=?5 "
            "WHERE id=?6");
        update.bind(6, row.id);
        bindPlaylist(update, row);
        return connection.changes() > 0;
    }

    bool deletePlaylist(const std::string &path) override {
        Connection connection = openExistingForWriting(path_);
        connection.prepare("DELETE FROM playlists WHERE path=?1").bind(1, path).run();
        return connection.changes() > 0;
    }

    void addNotice(const Notice &notice) override {
        Connection connection = openForWriting(path_);
        connection.prepare("INSERT INTO notices(path, former_path, operation) VALUES(?1, ?2, ?3)")
            .bind(1, notice.path)
            .bind(2, notice.formerPath)
            .bind(3, notice.operation)
            .run();
    }

  private:
    static void bindPlaylist(Statement &statement, const ZANO_MEDIA_INFO &row) {
        const std::string_view title = fieldText(row.title);
        const std::string_view album = fieldText(row.album);
        const std::string titleKey = foldedKey(title);
        const std::string albumKey = foldedKey(album);
        statement.bind(1, fieldText(row.path)).bind(2, title).bind(3, album);
        statement.bind(4, titleKey).bind(5, albumKey).run();
    }

    std::string path_;
    std::shared_ptr<ReaderPool> pool_;
};

}  // namespace

std::unique_ptr<Engine> makeEngine(const std::string &path) {
    return std::make_unique<SqliteEngine>(path);
}

}  // namespace zano::mediadb::sqlite
