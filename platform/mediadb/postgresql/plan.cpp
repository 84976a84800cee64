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
/* So many results are looked for along an order, row by row. */
constexpr std::int64_t kLongestWalk = 200;
/* And in its index alone. */
constexpr std::int64_t kLongestWalkOfKeys = 100;

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

/* "songs.disc, songs.track" */
std::string listOf(const std::vector<std::string_view> &columns, std::string_view qualifier) {
    std::string text;
    for (const std::string_view column : columns) {
        text.append(text.empty() ? "" : ", ").append(qualifier).append(column);
    }
    return text;
}

/* How many songs have what is searched for; null: it is not known. */
std::optional<Share> shareOf(Reader &reader, const SearchTerm &term) {
    const GramShares &grams = reader.gramsOf(term.column);
    const std::size_t gram = gramNumber(term.pattern.part().value_or(""));
    return gram != 0 && grams.isKnown() ? std::optional(grams.of(gram)) : std::nullopt;
}

/* How many have it at most. */
std::optional<Share> mostOf(Reader &reader, const SearchTerm &term) {
    std::optional<Share> most;
    for (const Pattern::Piece &piece : term.pattern.pieces()) {
        if (const auto share = reader.gramsOf(term.column).leastIn(piece.text)) {
            most = std::min(most.value_or(Share::Many), *share);
        }
    }
    return most;
}

/* Found by the trigram index, and soon. */
bool isRare(Reader &reader, const SearchTerm &term) {
    const auto &pieces = term.pattern.pieces();
    return std::any_of(pieces.begin(), pieces.end(), [&](const Pattern::Piece &piece) {
        return hasTrigram(piece.text) &&
               reader.gramsOf(term.column).leastIn(piece.text) == Share::Few;
    });
}

bool isIndexed(const std::vector<SearchTerm> &searches, Column leading) {
    const auto columns = indexedColumns(leading);
    return std::all_of(searches.begin(), searches.end(), [&columns](const SearchTerm &term) {
        return std::count(columns.begin(), columns.end(), columnInfo(term.column).key) > 0;
    });
}

/* Not in the words of the trigram index, which would be asked for all songs of frequent letters.
 * Of what else keeps it out, strpos takes the least time for a song. */
void addWalked(Sql &sql, const std::vector<SearchTerm> &searches) {
    std::string_view separator;
    for (const SearchTerm &term : searches) {
        const std::string_view key = columnInfo(term.column).key;
        if (const auto part = term.pattern.part()) {
            sql.add(separator).add("strpos(songs.").add(key).add(",").bind(std::string(*part));
            sql.add(")>0");
        } else {
            sql.add(separator).add("songs.").add(key).add("||'' LIKE ");
            sql.bind(term.pattern.likeText());
        }
        separator = " OR ";
    }
}

/* A number of ours as text: a plan that is kept has to know how few rows are wanted, or it sorts.
 */
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
                return isRare(reader, term);
            });
        });
    rare_ = rare != conjuncts_.end() ? &*rare : nullptr;
}

/* The table and the condition. What only a few songs meet is found first and by itself (OFFSET 0
 * keeps it apart), for a plan that is kept would not know that they are few. */
void SongPlan::addSongs(Sql &sql, bool isWalk) const {
    sql.add(" FROM ");
    if (rare_ != nullptr) {
        sql.add("(SELECT * FROM songs WHERE ").addCondition(*rare_->expression, "songs.");
        sql.add(" OFFSET 0) AS ");
    }
    sql.add("songs");
    std::string_view word = " WHERE ";
    if (isWalk && !conjuncts_.empty()) {
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

SongPlan::Way SongPlan::wayOfSearch(std::int64_t results, Column leading) const {
    if (conjuncts_.size() != 1 || results > kLongestAnchoredPage) {
        return Way::Planned;
    }
    const auto &searches = conjuncts_[0].searches;
    const auto anyOf = [&](const auto &isSo) {
        return std::any_of(searches.begin(), searches.end(), isSo);
    };
    if (anyOf([&](const auto &term) { return shareOf(reader_, term) == Share::Many; })) {
        return results <= kLongestWalk ? Way::Walk : Way::Planned;
    }
    const bool isIndexKnown = reader_.state().indexed != 0 && reader_.connection().knowsPlans();
    if (searches.empty() || !isIndexKnown || !isIndexed(searches, leading) ||
        anyOf([&](const auto &term) { return mostOf(reader_, term) == Share::Many; })) {
        return Way::Planned;
    }
    const bool isWalk = results <= kLongestWalkOfKeys && anyOf([&](const auto &term) {
                            return shareOf(reader_, term) == Share::Some;
                        });
    return isWalk ? Way::WalkOfKeys : Way::PlannedKeys;
}

SongPlan::Way SongPlan::wayOf(const Query &query) const {
    if (rare_ != nullptr) {
        return Way::Rare;
    }
    const auto leading = leadingOf(query.order);
    const bool isInOrder = leading && findStoredOrder(*leading) != nullptr;
    const bool isShort = query.limit > 0 && query.limit <= kLongestAnchoredPage;
    if (query.random || !isInOrder || !isShort) {
        return Way::Planned;
    }
    if (!conjuncts_.empty()) {
        return wayOfSearch(query.offset + query.limit, leading->column);
    }
    if (query.offset == 0) {
        return Way::Walk;
    }
    return reader_.state().anchored == reader_.state().generation ? Way::Anchored : Way::Planned;
}

/* Deep pages of the whole library begin at the nearest anchor, if the anchors were set in the
 * very state of the catalogue that is being read. Where there is no anchor, there are no songs. */
Sql SongPlan::anchored(const StoredOrder &order, const Query &query) const {
    const OrderTerm &leading = order.leading;
    const std::int64_t skipped = query.offset % kAnchorDistance;
    const auto columns = placeColumns(leading.column);
    Sql sql = newSql("WITH place AS MATERIALIZED (SELECT ").add(listOf(columns, ""));
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
    const Way way = wayOf(query);
    const bool isForValues = way == Way::Planned || way == Way::PlannedKeys;
    return {songPage(query, way),
            isForValues ? Connection::Plan::ForValues : Connection::Plan::Kept};
}

/* Most songs along an order need not be looked at where its index knows the searched keys: what
 * the first results have in the index tells which rows to fetch, and how many are equal by it. They
 * are looked up as so many rows from there on, for which no index but that of the order will do:
 * the trigram index takes = too, and far longer. */
Sql SongPlan::keyPage(const OrderTerm &leading, const Query &query, bool isWalk) const {
    const auto columns = indexedColumns(leading.column);
    const std::string keys = listOf(columns, "");
    const std::string ofSongs = listOf(columns, "songs.");
    std::int64_t results = query.limit;
    while (results < query.offset + query.limit) {
        results *= 2;  // so that few statements are prepared
    }
    Sql sql = newSql("SELECT ").add(columnList(query.select, "songs.")).add(" FROM (SELECT ");
    addSongs(sql.add(keys).add(", count(*) AS songs FROM (SELECT ").add(keys), isWalk);
    sql.add(" ORDER BY ").add(columns[0]).add(leading.descending ? " DESC, " : ", ");
    sql.add(listOf({columns.begin() + 1, columns.end()}, "")).add(" FETCH FIRST ");
    sql.add(std::to_string(results)).add(" ROWS WITH TIES) AS results GROUP BY ").add(keys);
    sql.add(") AS results CROSS JOIN LATERAL (SELECT * FROM songs WHERE (").add(ofSongs);
    sql.add(")>=(").add(listOf(columns, "results.")).add(") ORDER BY ").add(ofSongs);
    sql.add(" LIMIT results.songs) AS songs ORDER BY ").add(orderText(leading, "songs."));
    sql.addPage(query.offset, query.limit);
    return sql;
}

Sql SongPlan::songPage(const Query &query, Way way) const {
    const auto leading = leadingOf(query.order);
    if (way == Way::Anchored) {
        return anchored(*findStoredOrder(*leading), query);
    }
    if (way == Way::WalkOfKeys || way == Way::PlannedKeys) {
        return keyPage(*leading, query, way == Way::WalkOfKeys);
    }
    Sql sql = newSql("SELECT ").add(columnList(query.select, "songs."));
    addSongs(sql, way == Way::Walk);
    sql.add(" ORDER BY ");
    if (query.random) {
        sql.add("random()");
    } else if (leading) {
        sql.add(orderText(*leading, "songs."));
    } else {
        sql.addFullOrder(query.order, "songs.");
    }
    if (way == Way::Walk) {
        addLimit(sql, query.limit);
        sql.add(" OFFSET ").add(std::to_string(query.offset));
    } else {
        sql.addPage(query.offset, query.limit);
    }
    return sql;
}

Sql SongPlan::distinctPage(const Query &query) const {
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
    return Statement{sql, rare_ != nullptr ? Connection::Plan::Kept : Connection::Plan::ForValues};
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
