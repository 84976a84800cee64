/* Turns a parsed query on the songs into the statement that answers it fastest.
 *
 * Ways to the rows, and when each is taken:
 *   stream      the search index gives matches in the default order, so a page stops early; for
 *               common words the first stretch is walked, which often fills the page already
 *   candidates  few matches: fetch them all and sort; for every other order
 *   walk        many matches: follow the index of the order and keep what matches
 *   plain       everything else, and while the stored orders are not built: left to SQLite
 */
#pragma once

#include <optional>

#include "../query/render.h"
#include "grams.h"
#include "reader.h"
#include "schema.h"

namespace zano::mediadb::sqlite {

const Dialect &dialect();

class SongPlan {
  public:
    /* `condition` must outlive the plan. Reads what it needs to know through the reader. */
    SongPlan(Reader &reader, const std::optional<Expression> &condition);

    /* SELECT `columns` of one page, in order; not for distinct and random queries. */
    Sql page(std::string_view columns, const Query &query);
    /* SELECT `columns` of the first song of each value of the distinct column. */
    Sql distinctPage(std::string_view columns, const Query &query);
    /* SELECT the ids of all rows, or of the first of each distinct value, in no order. */
    Sql ids(std::optional<Column> distinct);
    std::int64_t count(std::optional<Column> distinct);

    bool isUnconditional() const { return conjuncts_.empty(); }

  private:
    struct Page {
        std::int64_t offset;
        std::int64_t limit;
    };

    void findGrams();
    std::int64_t estimatedMatches();
    std::int64_t candidatesUpTo(std::int64_t bound);
    std::int64_t countOutside(const std::string &prefix, std::int64_t bound);
    bool isWalkCheaper(const StoredOrder &order, Page page);

    void addWhere(Sql &sql, bool withGrams);
    void addSource(Sql &sql, bool withGrams);
    void addWalk(Sql &sql, std::string_view columns, const StoredOrder &order);
    void addMatch(Sql &sql);
    Sql stream(std::string_view columns, Page page);
    std::optional<std::int64_t> endOfWalk(Page page);
    Sql candidates(std::string_view columns, const StoredOrder &order, Page page);
    Sql walk(std::string_view columns, const StoredOrder &order, Page page);
    std::optional<Sql> anchored(std::string_view columns, const StoredOrder &order, Page page);

    Reader &reader_;
    std::vector<Conjunct> conjuncts_;
    std::optional<GramQuery> grams_;
    std::vector<bool> answered_;  // by the search index alone, for each conjunct
    std::vector<SearchTerm> terms_;
};

/* How many entries of an order lie between two anchors. */
constexpr std::int64_t kAnchorDistance = 128;

}  // namespace zano::mediadb::sqlite
