#include "plan.h"

#include <algorithm>
#include <utility>

#include "../query/statements.h"
#include "../row_record.h"

namespace zano::mediadb::postgresql {
namespace {

/* Songs outside of the music root that are counted before counting those inside instead. */
constexpr std::int64_t kOutsideBound = 20000;
/* Of a page that comes from an index; longer ones are fetched piece by piece. */
constexpr std::int64_t kLongestAnchoredPage = 1000;
/* So many results are looked for along an order, where that is known to be short. */
constexpr std::int64_t kLongestWalk = 200;

std::optional<OrderTerm> leadingOf(const std::vector<OrderTerm> &order) {
    if (order.empty()) {
        return OrderTerm{Column::Id, false};
    }
    const bool isUnique =
        order.front().column == Column::Id || order.front().column == Column::Path;
    return isUnique ? order.front() : leadingTermOf(order);
}

/* The columns that tell where in an order a song stands. */
std::vector<std::string_view> placeColumns(Column leading) {
    std::vector<std::string_view> columns = tailColumns(leading);
    columns.insert(columns.begin(), orderColumn(leading));
    return columns;
}

/* "(album_key,disc) >= ((SELECT album_key FROM place),(SELECT disc FROM place))", which an index
 * answers. Only columns of one direction are compared so. */
void addComparison(Sql &sql, const std::vector<std::string_view> &columns, std::string_view how) {
    std::string_view separator = "(";
    for (const std::string_view column : columns) {
        sql.add(separator).add(column);
        separator = ",";
    }
    sql.add(")").add(how);
    separator = "(";
    for (const std::string_view column : columns) {
        sql.add(separator).add("(SELECT ").add(column).add(" FROM place)");
        separator = ",";
    }
    sql.add(")");
}

/* Not in the words of the trigram index, which would be asked for all songs of frequent letters. */
void addWalked(Sql &sql, const std::vector<SearchTerm> &searches) {
    std::string_view separator;
    for (const SearchTerm &term : searches) {
        sql.add(separator).add("songs.").add(columnInfo(term.column).key).add("||'' LIKE ");
        sql.bind(term.pattern.likeText());
        separator = " OR ";
    }
}

/* A number of ours as text: a plan that is kept has to know how few rows are wanted. */
void addLimit(Sql &sql, std::int64_t rows) {
    sql.add(" LIMIT ").add(std::to_string(rows));
}

/* One of the two stretches of a descending order from a place on, each of which an index gives in
 * order: what has the leading value of the place, and what lies behind that value. The server
 * merges them as far as it must. */
void addStretch(Sql &sql, const OrderTerm &leading, bool isSameValue, std::int64_t rows) {
    const std::string_view column = orderColumn(leading.column);
    sql.add("(SELECT * FROM songs WHERE ");
    addComparison(sql, {column}, isSameValue ? "=" : "<");
    if (isSameValue) {
        addComparison(sql.add(" AND "), tailColumns(leading.column), ">=");
    }
    addLimit(sql.add(" ORDER BY ").add(orderText(leading, "")), rows);
    sql.add(")");
}

}  // namespace

SongPlan::SongPlan(Reader &reader, const std::optional<Expression> &condition)
    : reader_(reader), conjuncts_(conjunctsOf(condition)) {
    reader_.state();  // so that what follows is known to be of that state
    /* A prefix that all paths have costs a comparison for each row, and counts would have to
     * look at rows at all. */
    conjuncts_.erase(std::remove_if(conjuncts_.begin(), conjuncts_.end(),
                                    [this](const Conjunct &conjunct) {
                                        return !conjunct.pathPrefix.empty() &&
                                               reader_.allPathsBegin(conjunct.pathPrefix);
                                    }),
                     conjuncts_.end());
    const auto rare =
        std::find_if(conjuncts_.begin(), conjuncts_.end(), [&reader](const Conjunct &conjunct) {
            const auto &terms = conjunct.searches;
            return !terms.empty() && std::all_of(terms.begin(), terms.end(), [&](const auto &term) {
                return reader.isRare(term);
            });
        });
    rare_ = rare != conjuncts_.end() ? &*rare : nullptr;
}

/* The table and the condition. What only a few songs meet is found first and by itself (OFFSET 0
 * keeps it apart), for a plan that is kept would not know that they are few. */
void SongPlan::addSongs(Sql &sql, bool isWalk) {
    sql.add(" FROM ");
    if (isRare()) {
        sql.add("(SELECT * FROM songs WHERE ").addCondition(*rare_->expression, "songs.");
        sql.add(" OFFSET 0) AS ");
    }
    sql.add("songs");
    std::string_view word = " WHERE ";
    if (isWalk) {
        addWalked(sql.add(word), conjuncts_[0].searches);
        return;
    }
    for (const Conjunct &conjunct : conjuncts_) {
        if (&conjunct != rare_) {
            sql.add(word).addCondition(*conjunct.expression, "songs.");
            word = " AND ";
        }
    }
}

/* A search whose results fill a page in a short walk along any order. */
bool SongPlan::isFrequent() const {
    return conjuncts_.size() == 1 &&
           std::any_of(conjuncts_[0].searches.begin(), conjuncts_[0].searches.end(),
                       [this](const SearchTerm &term) { return reader_.isFrequent(term); });
}

/* What an index gives from a known place on, whatever the values. */
bool SongPlan::isPlanKept(const Query &query) const {
    const auto leading = leadingOf(query.order);
    const bool isInOrder = leading && findStoredOrder(*leading) != nullptr;
    const bool isShort = query.limit > 0 && query.limit <= kLongestAnchoredPage;
    if (query.random || query.distinct || !isInOrder || !isShort) {
        return false;
    }
    if (!conjuncts_.empty()) {
        return query.offset + query.limit <= kLongestWalk && isFrequent();
    }
    return query.offset == 0 || reader_.state().anchored == reader_.state().generation;
}

/* Deep pages of the whole library begin at the nearest anchor, if the anchors were set in the
 * very state of the catalogue that is being read. Where there is no anchor, there are no songs. */
std::optional<Sql> SongPlan::anchored(const StoredOrder &order, const Query &query) {
    if (query.offset == 0 || !conjuncts_.empty() || !isPlanKept(query)) {
        return std::nullopt;
    }
    const OrderTerm &leading = order.leading;
    const std::int64_t skipped = query.offset % kAnchorDistance;
    const auto columns = placeColumns(leading.column);
    Sql sql = newSql("WITH place AS MATERIALIZED (SELECT ");
    std::string_view separator;
    for (const std::string_view column : columns) {
        sql.add(separator).add(column);
        separator = ", ";
    }
    sql.add(" FROM songs WHERE id=(SELECT song FROM anchors WHERE stored_order=");
    sql.bind(std::int64_t{order.number}).add(" AND place=");
    sql.bind(query.offset / kAnchorDistance).add(")) SELECT ");
    sql.add(columnList(query.select, "")).add(" FROM ");
    if (leading.descending && columns.size() > 1) {
        addStretch(sql.add("("), leading, true, kAnchorDistance + query.limit);
        addStretch(sql.add(" UNION ALL "), leading, false, kAnchorDistance + query.limit);
        sql.add(") AS songs ORDER BY ");
    } else {
        addComparison(sql.add("songs WHERE "), columns, leading.descending ? "<=" : ">=");
        sql.add(" ORDER BY ");
    }
    addLimit(sql.add(orderText(leading, "")).add(" OFFSET ").bind(skipped), query.limit);
    return sql;
}

Statement SongPlan::page(const Query &query) {
    const bool areValues = conjuncts_.empty() && asksForValues(query);
    if (const Facet *facet = areValues ? findFacet(*query.distinct) : nullptr) {
        return {valuePage(dialect(), facet->number, query), Connection::Plan::Kept};
    }
    if (query.distinct) {
        return {distinctPage(query)};
    }
    const bool isKept = isPlanKept(query) || isRare();
    return {songPage(query), isKept ? Connection::Plan::Kept : Connection::Plan::ForValues};
}

Sql SongPlan::songPage(const Query &query) {
    const auto leading = leadingOf(query.order);
    const StoredOrder *stored = leading ? findStoredOrder(*leading) : nullptr;
    if (stored != nullptr) {
        if (auto deep = anchored(*stored, query)) {
            return std::move(*deep);
        }
    }
    Sql sql = newSql("SELECT ").add(columnList(query.select, "songs."));
    addSongs(sql, !conjuncts_.empty() && isPlanKept(query));
    sql.add(" ORDER BY ");
    if (query.random) {
        sql.add("random()");
    } else if (leading) {
        sql.add(orderText(*leading, "songs."));
    } else {
        sql.addFullOrder(query.order, "songs.");
    }
    if (isPlanKept(query)) {
        addLimit(sql, query.limit);
        if (query.offset > 0) {
            sql.add(" OFFSET ").bind(query.offset);
        }
    } else {
        sql.addPage(query.offset, query.limit);
    }
    return sql;
}

Sql SongPlan::distinctPage(const Query &query) {
    const ColumnInfo &info = columnInfo(*query.distinct);
    Sql sql = newSql("SELECT ").add(columnList(query.select, "songs."));
    addSongs(sql.add(" FROM songs WHERE songs.id IN (SELECT min(songs.id)"));
    sql.add(" GROUP BY songs.").add(info.name).add(") ORDER BY ");
    if (query.random) {
        sql.add("random()");
    } else {
        /* By the values themselves where no order is given, as the kept values come. */
        sql.addOrder(query.order.empty() ? std::vector<OrderTerm>{{*query.distinct}} : query.order,
                     "songs.");
        const bool isDescending = !query.order.empty() && query.order[0].descending;
        sql.add(", songs.").add(info.name).add(isDescending ? " DESC, songs.id" : ", songs.id");
    }
    sql.addPage(query.offset, query.limit);
    return sql;
}

std::int64_t SongPlan::countOutside(const std::string &prefix, std::int64_t bound) {
    const auto countWhere = [&](std::string_view comparison, const std::string &value) {
        Sql sql = newSql("SELECT count(*) FROM (SELECT 1 FROM songs WHERE ");
        sql.add(comparison).bind(value).add(" LIMIT ").bind(bound).add(") AS outside");
        return reader_.connection().integer(sql);
    };
    std::int64_t outside = countWhere("path<", prefix);
    if (const auto end = endOfPrefix(prefix)) {
        outside += countWhere("path>=", *end);
    }
    return outside;
}

std::optional<Statement> SongPlan::countStatement(std::optional<Column> distinct) {
    const bool isKnown = conjuncts_.empty() && (!distinct || findFacet(*distinct) != nullptr);
    const bool isOfPaths = conjuncts_.size() == 1 && !conjuncts_[0].pathPrefix.empty();
    if (isKnown || (isOfPaths && !distinct)) {
        return std::nullopt;
    }
    Sql sql = newSql("SELECT count(");
    if (distinct) {
        sql.add("DISTINCT songs.").add(columnInfo(*distinct).name).add(")");
    } else {
        sql.add("*)");
    }
    addSongs(sql);
    return Statement{sql, isRare() ? Connection::Plan::Kept : Connection::Plan::ForValues};
}

std::int64_t SongPlan::count(std::optional<Column> distinct) {
    if (const auto statement = countStatement(distinct)) {
        return reader_.connection().integer(statement->sql, statement->plan);
    }
    if (conjuncts_.empty()) {
        return distinct ? *State(reader_.state()).find(findFacet(*distinct)->state)
                        : reader_.state().songs;
    }
    const std::string &prefix = conjuncts_[0].pathPrefix;
    const auto outside = countOutside(prefix, kOutsideBound);
    if (outside < kOutsideBound) {
        return reader_.state().songs - outside;
    }
    Sql sql = newSql("SELECT count(*)");
    addSongs(sql);
    return reader_.connection().integer(sql);
}

}  // namespace zano::mediadb::postgresql
