#include "engine.h"

#include <algorithm>
#include <random>
#include <unordered_set>
#include <utility>

#include "../query/statements.h"
#include "../row_record.h"
#include "conditions.h"
#include "plan.h"
#include "text/fold.h"

namespace zano::mediadb::postgresql {
namespace {

/* A page of so many rows is fetched at once; what is longer, piece by piece, so that its memory is
 * bounded and the time limit is not spent by a slow caller. */
constexpr std::int64_t kRowsAtOnce = 1000;
constexpr const char *kFetch = "FETCH 500 FROM listing";

class BaseCursor : public Cursor {
  public:
    BaseCursor(ReaderPool::Lease reader, Query query)
        : reader_(std::move(reader)), query_(std::move(query)) {}

  protected:
    Reader &reader() { return *reader_; }
    Connection &connection() { return reader().connection(); }
    const Query &query() const { return query_; }

    bool hasRow() const { return rows_ && at_ < rows_->size(); }
    void setRows(Result rows) {
        rows_.emplace(std::move(rows));
        at_ = 0;
    }
    void putNext(ZANO_MEDIA_INFO &row) { putRow((*rows_)[at_++], query_.select, row); }

  private:
    ReaderPool::Lease reader_;
    Query query_;
    std::optional<Result> rows_;
    int at_ = 0;
};

/* The rows of one statement. It does not run before the first row is asked for, since some
 * callers want the count alone. */
class StatementCursor : public BaseCursor {
  public:
    StatementCursor(ReaderPool::Lease lease, Query asked)
        : BaseCursor(std::move(lease), std::move(asked)), sql_(dialect()) {}

    bool next(ZANO_MEDIA_INFO &row) override {
        Connection &server = connection();  // refused in a forked child, also when rows are left
        if (!hasRow() && !isDone_) {
            isDone_ = true;  // also when it fails
            fetch(server);
        }
        if (hasRow()) {
            putNext(row);
            return true;
        }
        return false;
    }

  protected:
    bool isPiecewise() const { return query().limit == 0 || query().limit > kRowsAtOnce; }

    /* Prepares too, so that a text that the engine refuses fails when the query is opened. */
    void setSql(const Sql &sql, Connection::Plan plan = Connection::Plan::ForValues) {
        sqlPlan_ = plan;
        sql_ = newSql(isPiecewise() ? "DECLARE listing NO SCROLL CURSOR FOR " : "");
        sql_.append(sql);
        connection().check(sql_);
    }

  private:
    void fetch(Connection &server) {
        if (!isPiecewise()) {
            setRows(server.run(sql_, sqlPlan_));
            return;
        }
        if (!isDeclared_) {
            server.run(sql_);
            isDeclared_ = true;
        }
        setRows(server.runOnce(kFetch));
        isDone_ = !hasRow();
    }

    Sql sql_;
    Connection::Plan sqlPlan_ = Connection::Plan::ForValues;
    bool isDeclared_ = false;
    bool isDone_ = false;
};

class SongCursor : public StatementCursor {
  public:
    SongCursor(ReaderPool::Lease lease, Query asked)
        : StatementCursor(std::move(lease), std::move(asked)), plan_(reader(), query().condition) {
        if (const auto facets = plan_.facetPage(query())) {
            setSql(*facets, Connection::Plan::Kept);
        } else {
            setSql(
                query().distinct ? plan_.distinctPage(query()) : plan_.page(query()),
                plan_.isPlanKept(query()) ? Connection::Plan::Kept : Connection::Plan::ForValues);
        }
    }

    std::int64_t countAll() override { return plan_.count(query().distinct); }

  private:
    SongPlan plan_;
};

class PlaylistCursor : public StatementCursor {
  public:
    PlaylistCursor(ReaderPool::Lease lease, Query asked)
        : StatementCursor(std::move(lease), std::move(asked)) {
        setSql(playlistPage(dialect(), columnList(query().select, ""), query()));
    }

    std::int64_t countAll() override {
        return connection().integer(playlistCount(dialect(), query()));
    }
};

/* A few of many songs in random order: drawn by their ids, without a look at the others. */
class DrawingCursor : public BaseCursor {
  public:
    DrawingCursor(ReaderPool::Lease lease, Query asked)
        : BaseCursor(std::move(lease), std::move(asked)), random_(std::random_device{}()) {
        first_ = connection().integer(newSql("SELECT min(id) FROM songs"));
        last_ = connection().integer(newSql("SELECT max(id) FROM songs"));
        const std::int64_t songs = reader().state().songs;
        left_ = std::clamp<std::int64_t>(songs - query().offset, 0, query().limit);
        /* Drawing again when an id is free or was drawn takes few tries then. */
        isFit_ = left_ <= songs / 4 && left_ <= kRowsAtOnce && last_ - first_ < 4 * songs;
    }

    /* Whether this way serves the query. */
    bool isFit() const { return isFit_; }

    bool next(ZANO_MEDIA_INFO &row) override {
        Connection &server = connection();
        while (left_ > 0 && !hasRow()) {
            setRows(draw(server));
        }
        if (left_ > 0) {
            putNext(row);
            --left_;
            return true;
        }
        return false;
    }

    std::int64_t countAll() override { return reader().state().songs; }

  private:
    Result draw(Connection &server) {
        ArrayText ids;
        for (std::int64_t i = 0; i < left_; ++i) {
            const std::int64_t id = std::uniform_int_distribution(first_, last_)(random_);
            if (drawn_.insert(id).second) {
                ids.add(id);
            }
        }
        Sql sql = newSql("SELECT ").add(columnList(query().select, "songs."));
        sql.add(" FROM unnest(")
            .bind(ids.take())
            .add("::bigint[]) WITH ORDINALITY AS drawn(id, place)");
        sql.add(" JOIN songs ON songs.id=drawn.id ORDER BY drawn.place");
        return server.run(sql);
    }

    std::mt19937_64 random_;
    bool isFit_ = false;
    std::int64_t first_ = 0;
    std::int64_t last_ = 0;
    std::int64_t left_ = 0;
    std::unordered_set<std::int64_t> drawn_;
};

class PostgresqlEngine : public Engine {
  public:
    explicit PostgresqlEngine(const std::string &uri)
        : uri_(uri), pool_(std::make_shared<ReaderPool>(uri)) {}

    std::unique_ptr<Cursor> open(Query query) override {
        if (query.condition) {
            query.condition = typedCondition(std::move(*query.condition));
        }
        if (query.table == Table::Playlists) {
            return std::make_unique<PlaylistCursor>(pool_->lease(), std::move(query));
        }
        if (query.random && !query.distinct && query.limit > 0 &&
            conjunctsOf(query.condition).empty()) {
            auto drawing = std::make_unique<DrawingCursor>(pool_->lease(), query);
            if (drawing->isFit()) {
                return drawing;
            }
        }
        return std::make_unique<SongCursor>(pool_->lease(), std::move(query));
    }

    std::int64_t count(const CountQuery &asked) override {
        Query query;
        query.table = asked.table;
        query.distinct = asked.distinct;
        if (asked.condition) {
            query.condition = typedCondition(*asked.condition);
        }
        auto lease = pool_->lease();
        if (query.table == Table::Songs) {
            return SongPlan(*lease, query.condition).count(query.distinct);
        }
        query.select = {{Column::Id, Column::Id}};
        return PlaylistCursor(std::move(lease), std::move(query)).countAll();
    }

    /* The row of the path is looked for first, since a refused insertion uses up an id. */
    void savePlaylist(const ZANO_MEDIA_INFO &row) override {
        Connection connection = openForWriting(uri_);
        Sql update = newSql("UPDATE playlists SET ");
        addPlaylist(update, row);
        update.add(" WHERE path=").bind(std::string(fieldText(row.path))).add(" RETURNING id");
        if (connection.run(update).size() > 0) {
            return;
        }
        Sql insert = newSql(
            "INSERT INTO playlists(path, title, album, title_key, album_key, path_key) VALUES(");
        std::string_view separator;
        for (std::string &value : playlistValues(row)) {
            insert.add(separator).bind(std::move(value));
            separator = ",";
        }
        connection.run(insert.add(
            ") ON CONFLICT(path) DO UPDATE SET title=EXCLUDED.title, album=EXCLUDED.album, "
            "title_key=EXCLUDED.title_key, album_key=EXCLUDED.album_key"));
    }

    bool updatePlaylist(const ZANO_MEDIA_INFO &row) override {
        Connection connection = openForWriting(uri_);
        Sql update = newSql("UPDATE playlists SET ");
        addPlaylist(update, row);
        update.add(" WHERE id=").bind(std::int64_t{row.id}).add(" RETURNING id");
        return connection.run(update).size() > 0;
    }

    bool deletePlaylist(const std::string &path) override {
        Connection connection = openForWriting(uri_);
        Sql sql = newSql("DELETE FROM playlists WHERE path=").bind(path).add(" RETURNING id");
        return connection.run(sql).size() > 0;
    }

    void addNotice(const Notice &notice) override {
        Connection connection = openForWriting(uri_);
        Sql sql = newSql("INSERT INTO notices(path, former_path, operation) VALUES(");
        sql.bind(notice.path).add(",").bind(notice.formerPath).add(",");
        connection.run(sql.bind(std::int64_t{notice.operation}).add(")"));
    }

  private:
    static std::vector<std::string> playlistValues(const ZANO_MEDIA_INFO &row) {
        const std::string title(fieldText(row.title));
        const std::string album(fieldText(row.album));
        const std::string path(fieldText(row.path));
        return {path, title, album, foldedKey(title), foldedKey(album), foldedKey(path)};
    }

    static void addPlaylist(Sql &sql, const ZANO_MEDIA_INFO &row) {
        auto values = playlistValues(row);
        size_t index = 0;
        std::string_view separator;
        for (const char *column :
             {"path=", "title=", "album=", "title_key=", "album_key=", "path_key="}) {
            sql.add(separator).add(column).bind(std::move(values[index++]));
            separator = ", ";
        }
    }

    std::string uri_;
    std::shared_ptr<ReaderPool> pool_;
};

}  // namespace

std::unique_ptr<Engine> makeEngine(const std::string &place) {
    return std::make_unique<PostgresqlEngine>("postgresql:" + place);
}

}  // namespace zano::mediadb::postgresql
