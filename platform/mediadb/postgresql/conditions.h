/* PostgreSQL compares values of one kind only and refuses the rest, where SQLite takes everything.
 * A condition is written anew here so that both give the same rows. */
#pragma once

#include "../query/expression.h"

namespace zano::mediadb::postgresql {

/* Texts become numbers beside columns of numbers, and the other way round; what does not depend on
 * the row is worked out. Throws QueryError for two columns of different kinds. */
Expression typedCondition(Expression expression);

}  // namespace zano::mediadb::postgresql
