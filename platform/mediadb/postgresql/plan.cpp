#include "plan.h"

#include <algorithm>
#include <utility>

#include "../query/statements.h"
#include "../row_record.h"

namespace zano::mediadb::postgresql {
namespace {

/* Songs outside of the music root that are counted before counting those inside instead. */
constexpr std::int64_t kOutsideBound = 20000;
/* A longer page is worth no anchor, for its rows are sorted once more. */
constexpr std::int64_t kLongestAnchoredPage = 1000;

const Facet *findFacet(Column column) {
    const auto &rows = facets();
    const auto row = std::find_if(rows.begin(), rows.end(),
                                  [column](const Facet &facet) { return facet.column == column; });
    return row == rows.end() ? nullptr : &*row;
}

std::optional<OrderTerm> leadingOf(const std::vector<OrderTerm> &order) {
    if (order.empty()) {
        return OrderTerm{Column::Id, false};
    }
    const bool isUnique =
        order.front().column == Column::Id || order.front().column == Column::Path;
    return isUnique ? order.front() : leadingTermOf(order);
}

/* What was read of an anchor, as it is bound again. */
Value valueOf(const Row &row, int index, Column column) {
    if (columnInfo(column).isText) {
        return std::string(row.text(index));
    }
    if (column == Column::Duration) {
        return row.real(index);
    }
    return row.integer(index);
}

std::vector<Column> placeColumns(Column leading) {
    std::vector<Column> columns = {leading};
    if (leading != Column::Id && leading != Column::Path) {
        for (const OrderTerm &term : tieBreaks()) {
            if (term.column != leading) {
                columns.push_back(term.column);
            }
        }
    }
    return columns;
}

/* Where a page begins: the values of the song at an anchor. */
struct Place {
    OrderTerm leading;
    std::vector<Column> columns;
    std::vector<Value> values;
};

void addList(Sql &sql, const Place &place, bool isOfValues) {
    std::string_view separator = "(";
    for (size_t i = 1; i < place.columns.size(); ++i) {
        sql.add(separator);
        if (isOfValues) {
            sql.bind(place.values[i]);
        } else {
            sql.add(orderColumn(place.columns[i]));
        }
        separator = ",";
    }
    sql.add(")");
}

/* One of the two stretches of an order from a place on, each of which an index gives in order:
 * what has the leading value of the place, and what lies behind that value. */
void addStretch(Sql &sql, const Place &place, bool isSameValue, std::int64_t rows) {
    const std::string_view column = orderColumn(place.leading.column);
    sql.add("(SELECT songs.*, ").add(isSameValue ? "0" : "1").add(" AS stretch FROM songs WHERE ");
    sql.add(column);
    sql.add(isSameValue ? "=" : place.leading.descending ? "<" : ">").bind(place.values[0]);
    if (isSameValue && place.columns.size() > 1) {
        sql.add(" AND ");
        addList(sql, place, false);
        sql.add(">=");
        addList(sql, place, true);
    }
    sql.add(" ORDER BY ").add(orderText(place.leading, "")).add(" LIMIT ").bind(rows).add(")");
}

}  // namespace

SongPlan::SongPlan(Reader &reader, const std::optional<Expression> &condition)
    : reader_(reader), conjuncts_(conjunctsOf(condition)) {
    /* A prefix that all paths have costs a comparison for each row, and counts would have to
     * look at rows at all. */
    conjuncts_.erase(std::remove_if(conjuncts_.begin(), conjuncts_.end(),
                                    [this](const Conjunct &conjunct) {
                                        return !conjunct.pathPrefix.empty() &&
                                               reader_.allPathsBegin(conjunct.pathPrefix);
                                    }),
                     conjuncts_.end());
}

void SongPlan::addWhere(Sql &sql) {
    std::string_view word = " WHERE ";
    for (const Conjunct &conjunct : conjuncts_) {
        sql.add(word);
        sql.addCondition(*conjunct.expression, "songs.");
        word = " AND ";
    }
}

/* Deep pages of the whole library begin at the nearest anchor, if the anchors were set in the
 * very state of the catalogue that is being read. Where there is no anchor, there are no songs. */
std::optional<Sql> SongPlan::anchored(const StoredOrder &order, const Query &query) {
    const bool isUseful = query.offset >= kAnchorDistance && query.limit > 0 &&
                          query.limit <= kLongestAnchoredPage &&
                          reader_.state().anchored == reader_.state().generation;
    if (!isUseful) {
        return std::nullopt;
    }
    Place place{order.leading, placeColumns(order.leading.column), {}};
    Sql find = newSql("SELECT ");
    std::string_view separator;
    for (const Column column : place.columns) {
        find.add(separator).add(orderColumn(column));
        separator = ", ";
    }
    find.add(" FROM songs WHERE id=(SELECT song FROM anchors WHERE stored_order=");
    find.bind(std::int64_t{order.number}).add(" AND place=");
    find.bind(query.offset / kAnchorDistance).add(")");
    const Result anchor = reader_.connection().run(find);
    Sql sql = newSql("SELECT ").add(columnList(query.select, ""));
    if (anchor.size() == 0) {
        return sql.add(" FROM songs LIMIT 0");
    }
    for (size_t i = 0; i < place.columns.size(); ++i) {
        place.values.push_back(valueOf(anchor[0], static_cast<int>(i), place.columns[i]));
    }
    const std::int64_t skipped = query.offset % kAnchorDistance;
    addStretch(sql.add(" FROM ("), place, true, skipped + query.limit);
    addStretch(sql.add(" UNION ALL "), place, false, skipped + query.limit);
    sql.add(") AS songs ORDER BY stretch, ").add(orderText(order.leading, ""));
    sql.addPage(skipped, query.limit);
    return sql;
}

Sql SongPlan::page(const Query &query) {
    const auto leading = leadingOf(query.order);
    const StoredOrder *stored = leading && !query.random ? findStoredOrder(*leading) : nullptr;
    if (stored != nullptr && conjuncts_.empty()) {
        if (auto deep = anchored(*stored, query)) {
            return std::move(*deep);
        }
    }
    Sql sql = newSql("SELECT ").add(columnList(query.select, "songs.")).add(" FROM songs");
    addWhere(sql);
    sql.add(" ORDER BY ");
    if (query.random) {
        sql.add("random()");
    } else if (leading) {
        sql.add(orderText(*leading, "songs."));
    } else {
        sql.addFullOrder(query.order, "songs.");
    }
    sql.addPage(query.offset, query.limit);
    return sql;
}

Sql SongPlan::distinctPage(const Query &query) {
    const ColumnInfo &info = columnInfo(*query.distinct);
    Sql sql = newSql("SELECT ").add(columnList(query.select, "songs."));
    sql.add(" FROM songs WHERE songs.id IN (SELECT min(songs.id) FROM songs");
    addWhere(sql);
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

std::optional<Sql> SongPlan::facetPage(const Query &query) {
    const bool areWanted = conjuncts_.empty() && asksForValues(query);
    const Facet *facet = areWanted ? findFacet(*query.distinct) : nullptr;
    return facet != nullptr ? std::optional(valuePage(dialect(), facet->number, query))
                            : std::nullopt;
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

std::int64_t SongPlan::count(std::optional<Column> distinct) {
    if (conjuncts_.empty() && !distinct) {
        return reader_.state().songs;
    }
    if (conjuncts_.size() == 1 && !conjuncts_[0].pathPrefix.empty() && !distinct) {
        const auto outside = countOutside(conjuncts_[0].pathPrefix, kOutsideBound);
        if (outside < kOutsideBound) {
            return reader_.state().songs - outside;
        }
    }
    const Facet *facet = conjuncts_.empty() ? findFacet(*distinct) : nullptr;
    if (facet != nullptr) {
        return *reader_.state().find(facet->state);
    }
    Sql sql = newSql("SELECT count(");
    if (distinct) {
        sql.add("DISTINCT songs.").add(columnInfo(*distinct).name).add(")");
    } else {
        sql.add("*)");
    }
    addWhere(sql.add(" FROM songs"));
    return reader_.connection().integer(sql);
}

}  // namespace zano::mediadb::postgresql
