/* What the engines make use of in a query: the shape of its condition and of its order. */
#pragma once

#include <string>
#include <vector>

#include "expression.h"
#include "pattern.h"

namespace zano::mediadb {

/* `column ilike pattern`, on a column with a folded key. */
struct SearchTerm {
    Column column;
    Pattern pattern;
};

/* One part of a condition whose parts are joined by `and`. */
struct Conjunct {
    const Expression *expression;
    std::string pathPrefix;            // of `path like 'prefix%'`; else ""
    std::vector<SearchTerm> searches;  // of search terms joined by `or`; else empty
};

/* The parts of a condition that are not true of every row. They point into the expression. */
std::vector<Conjunct> conjunctsOf(const std::optional<Expression> &condition);

/* An order as the listing functions ask for it: one leading column, then the fixed tie-breaks
 * album, disc, track, title, artist, genre, year, path, duration (with or without the leading
 * one). Null for any other order. */
std::optional<OrderTerm> leadingTermOf(const std::vector<OrderTerm> &order);

/* The tie-breaks, which are also the order that a leading album asks for. */
const std::vector<OrderTerm> &tieBreaks();

}  // namespace zano::mediadb
