/* Turns a parsed query on the songs into statements. Which index serves a search is left to
 * PostgreSQL, which knows how often words come, where a few letters do not tell already; deep pages
 * and counts are helped. */
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

    /* SELECT the columns of one page, in order; random where the query says so; with a distinct
     * column of the first song of each of its values. */
    Statement page(const Query &query);
    std::int64_t count(std::optional<Column> distinct);
    /* Null: it takes several statements, or none. */
    std::optional<Statement> countStatement(std::optional<Column> distinct);

    bool isUnconditional() const { return conjuncts_.empty(); }

  private:
    /* How songs are come by. But for what the server plans for the values one plan serves all. */
    enum class Way {
        Planned,
        Rare,         // from the trigram index
        Walk,         // along the index of the order
        Anchored,     // likewise, from an anchor on
        WalkOfKeys,   // in that index alone, then the rows of what is found
        PlannedKeys,  // their keys as planned, then the rows
    };
    Way wayOf(const Query &query) const;
    Way wayOfSearch(std::int64_t results, Column leading) const;
    Sql songPage(const Query &query, Way way) const;
    Sql keyPage(const OrderTerm &leading, const Query &query, bool isWalk) const;
    Sql distinctPage(const Query &query) const;
    Sql anchored(const StoredOrder &order, const Query &query) const;
    std::int64_t countOutside(const std::string &prefix, std::int64_t bound);
    void addSongs(Sql &sql, bool isWalk = false) const;

    Reader &reader_;
    std::vector<Conjunct> conjuncts_;
    const Conjunct *rare_ = nullptr;  // that only a few songs meet; null: none is known
};

}  // namespace zano::mediadb::postgresql
