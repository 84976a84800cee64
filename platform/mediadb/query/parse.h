/* Reads the texts of the interface into a Query. They come from outside: what is not understood
 * is refused with QueryError, and nothing of them reaches an engine but values. */
#pragma once

#include "expression.h"
#include "tokens.h"

namespace zano::mediadb {

/* Null texts mean what the interface says of them (media_database.h). */
std::vector<SelectedColumn> parseSelect(Table table, const char *text);
std::optional<Expression> parseCondition(Table table, const char *text);
std::optional<Column> parseDistinct(Table table, const char *text);
/* Sets query.order or query.random. */
void parseOrder(const char *text, Query &query);
/* "*", a column, or "DISTINCT column", which is the result then. */
std::optional<Column> parseCountExpression(Table table, const char *text);

}  // namespace zano::mediadb
