#include "statements.h"

#include <algorithm>

namespace zano::mediadb {
namespace {

void addCondition(Sql &sql, const Query &query) {
    if (query.condition) {
        sql.add(" WHERE ");
        sql.addCondition(*query.condition, "");
    }
}

}  // namespace

Sql playlistPage(const Dialect &dialect, std::string_view columns, const Query &query) {
    Sql sql(dialect);
    sql.add("SELECT ").add(columns).add(" FROM playlists");
    if (query.distinct) {
        addCondition(sql.add(" WHERE id IN (SELECT min(id) FROM playlists"), query);
        sql.add(" GROUP BY ").add(columnInfo(*query.distinct).name).add(")");
    } else {
        addCondition(sql, query);
    }
    sql.add(" ORDER BY ");
    if (query.random) {
        sql.add("random()");
    } else {
        sql.addFullOrder(query.order, "");
    }
    sql.addPage(query.offset, query.limit);
    return sql;
}

Sql playlistCount(const Dialect &dialect, const Query &query) {
    Sql sql(dialect);
    sql.add("SELECT count(");
    if (query.distinct) {
        sql.add("DISTINCT ").add(columnInfo(*query.distinct).name);
    } else {
        sql.add("*");
    }
    addCondition(sql.add(") FROM playlists"), query);
    return sql;
}

const std::vector<Facet> &facets() {
    static const std::vector<Facet> rows = {
        {Column::Artist, 1, "artists"}, {Column::Album, 2, "albums"}, {Column::Genre, 3, "genres"}};
    return rows;
}

const Facet *findFacet(Column column) {
    const auto &rows = facets();
    const auto row = std::find_if(rows.begin(), rows.end(),
                                  [column](const Facet &facet) { return facet.column == column; });
    return row == rows.end() ? nullptr : &*row;
}

bool asksForValues(const Query &query) {
    return query.distinct && !query.random && query.select.size() == 1 &&
           query.select[0].column == *query.distinct &&
           (query.order.empty() || query.order[0].column == *query.distinct);
}

Sql valuePage(const Dialect &dialect, int facet, const Query &query) {
    const bool isDescending = !query.order.empty() && query.order[0].descending;
    Sql sql(dialect);
    sql.add("SELECT name FROM facets WHERE facet=").bind(std::int64_t{facet});
    sql.add(isDescending ? " ORDER BY key DESC, name DESC" : " ORDER BY key, name");
    sql.addPage(query.offset, query.limit);
    return sql;
}

}  // namespace zano::mediadb
