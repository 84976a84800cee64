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

/* The rows of one statement: a page, which is here at once, or everything, which comes piece by
 * piece and begins when its first row is asked for, since some callers want the count alone. */
class StatementCursor : public BaseCursor {
  public:
    StatementCursor(ReaderPool::Lease lease, Query asked)
        : BaseCursor(std::move(lease), std::move(asked)), listing_(dialect()) {}

    bool next(ZANO_MEDIA_INFO &row) override {
        Connection &server = connection();  // refused in a forked child, also when rows are left
        if (!hasRow() && hasMore_) {
            hasMore_ = false;  // also when it fails
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

    /* Within a snapshot. Prepares too, so that a text that the engine refuses fails when the query
     * is opened. */
    void setListing(const Sql &sql) {
        listing_.add("DECLARE listing NO SCROLL CURSOR FOR ").append(sql);
        connection().check(listing_);
        hasMore_ = true;
    }

  private:
    void fetch(Connection &server) {
        if (!isDeclared_) {
            server.run(listing_);
            isDeclared_ = true;
        }
        setRows(server.runOnce(kFetch));
        hasMore_ = hasRow();
    }

    Sql listing_;
    bool hasMore_ = false;
    bool isDeclared_ = false;
};

/* The rows of a statement that one message can ask for. Where the songs have changed meanwhile, it
 * may have to be another one, of a snapshot. */
template <typename MakeStatement>
Result answerOf(Reader &reader, const std::optional<Expression> &condition,
                const MakeStatement &make) {
    {
        SongPlan plan(reader, condition);
        const Statement statement = make(plan);
        if (auto rows = reader.answer(statement)) {
            return std::move(*rows);
        }
    }
    reader.beginSnapshot();
    SongPlan plan(reader, condition);
    const Statement statement = make(plan);
    return reader.connection().run(statement.sql, statement.plan);
}

class SongCursor : public StatementCursor {
  public:
    SongCursor(ReaderPool::Lease lease, Query asked)
        : StatementCursor(std::move(lease), std::move(asked)) {
        if (isPiecewise()) {
            beginListing();
        } else {
            setRows(answerOf(reader(), query().condition,
                             [this](SongPlan &plan) { return plan.page(query()); }));
        }
    }

    std::int64_t countAll() override {
        return total_ ? *total_ : SongPlan(reader(), query().condition).count(query().distinct);
    }

  private:
    /* A list of everything is asked for its length first, which comes with the snapshot. */
    void beginListing() {
        const bool isWhole = query().offset == 0 && query().limit == 0;
        std::optional<SongPlan> plan(std::in_place, reader(), query().condition);
        const auto count = isWhole ? plan->countStatement(query().distinct) : std::nullopt;
        if (!count) {
            reader().beginSnapshot();
        } else if (const auto rows = reader().beginSnapshot(*count)) {
            total_ = (*rows)[0].integer(0);
        }
        if (!total_) {
            plan.emplace(reader(), query().condition);  // of the state that it is now
        }
        setListing(plan->page(query()).sql);
    }

    std::optional<std::int64_t> total_;
};

class PlaylistCursor : public StatementCursor {
  public:
    PlaylistCursor(ReaderPool::Lease lease, Query asked)
        : StatementCursor(std::move(lease), std::move(asked)) {
        reader().beginSnapshot();
        const Sql sql = playlistPage(dialect(), columnList(query().select, ""), query());
        if (isPiecewise()) {
            setListing(sql);
        } else {
            setRows(connection().run(sql));
        }
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
        reader().beginSnapshot();
        const Result ends = connection().run(
            newSql("SELECT (SELECT min(id) FROM songs), (SELECT max(id) FROM songs)"));
        first_ = ends[0].integer(0);
        last_ = ends[0].integer(1);
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
            return opened<PlaylistCursor>(query);
        }
        if (query.random && !query.distinct && query.limit > 0 &&
            conjunctsOf(query.condition).empty()) {
            auto drawing = opened<DrawingCursor>(query);
            if (drawing->isFit()) {
                return drawing;
            }
        }
        return opened<SongCursor>(query);
    }

    std::int64_t count(const CountQuery &asked) override {
        Query query;
        query.table = asked.table;
        query.distinct = asked.distinct;
        if (asked.condition) {
            query.condition = typedCondition(*asked.condition);
        }
        query.select = {{Column::Id, Column::Id}};
        return pool_->serve([&query](ReaderPool::Lease lease) {
            if (query.table == Table::Playlists) {
                return PlaylistCursor(std::move(lease), query).countAll();
            }
            return countSongs(*lease, query);
        });
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
    template <typename AnyCursor>
    std::unique_ptr<AnyCursor> opened(const Query &query) {
        return pool_->serve([&query](ReaderPool::Lease lease) {
            return std::make_unique<AnyCursor>(std::move(lease), query);
        });
    }

    static std::int64_t countSongs(Reader &reader, const Query &query) {
        if (const auto statement =
                SongPlan(reader, query.condition).countStatement(query.distinct)) {
            if (const auto rows = reader.answer(*statement)) {
                return (*rows)[0].integer(0);
            }
        }
        reader.beginSnapshot();
        return SongPlan(reader, query.condition).count(query.distinct);
    }

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
