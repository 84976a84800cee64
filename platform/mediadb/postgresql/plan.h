/* Turns a parsed query on the songs into statements. Which index serves a search is left to
 * PostgreSQL, which knows how often words come; deep pages and counts are helped. */
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "../query/analysis.h"
#include "reader.h"
#include "schema.h"

namespace zano::mediadb::postgresql {

/* How many entries of an order lie between two anchors. */
constexpr std::int64_t kAnchorDistance = 128;

class SongPlan {
  public:
    /* `condition`, a typed one, must outlive the plan. */
    SongPlan(Reader &reader, const std::optional<Expression> &condition);

    /* SELECT the columns of one page, in order; random where the query says so. */
    Sql page(const Query &query);
    /* The same of the first song of each value of the distinct column. */
    Sql distinctPage(const Query &query);
    std::int64_t count(std::optional<Column> distinct);

    /* Whether one plan serves all pages of this kind: the server need not make it anew. */
    bool isPlanKept(const Query &query) const;
    bool isUnconditional() const { return conjuncts_.empty(); }
    /* The values of a column, where they are kept and the query asks for nothing else. */
    std::optional<Sql> facetPage(const Query &query);

  private:
    std::int64_t countOutside(const std::string &prefix, std::int64_t bound);
    std::optional<Sql> anchored(const StoredOrder &order, const Query &query);
    void addWhere(Sql &sql);

    Reader &reader_;
    std::vector<Conjunct> conjuncts_;
};

}  // namespace zano::mediadb::postgresql
