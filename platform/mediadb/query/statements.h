/* Statements that both engines ask in the same words, over tables that they have alike. */
#pragma once

#include <cstdint>
#include <string_view>
#include <vector>

#include "expression.h"
#include "render.h"

namespace zano::mediadb {

/* A page of the table `playlists`, with `columns` of each row. */
Sql playlistPage(const Dialect &dialect, std::string_view columns, const Query &query);
/* The number of its rows without offset and limit. */
Sql playlistCount(const Dialect &dialect, const Query &query);

/* The columns whose distinct values are kept counted. */
struct Facet {
    Column column;
    int number;              // in the database
    std::string_view state;  // the name of the count of its values
};
const std::vector<Facet> &facets();
/* Null where the values of the column are not kept. */
const Facet *findFacet(Column column);

/* Whether a query without condition asks for nothing but the values of one column, in their own
 * order, as the table `facets` keeps them. */
bool asksForValues(const Query &query);
/* A page of the values of the facet of that number. */
Sql valuePage(const Dialect &dialect, int facet, const Query &query);

}  // namespace zano::mediadb
