#include "plan.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <utility>

#include "../query/statements.h"

namespace zano::mediadb::sqlite {
namespace {

/* Steps of one entry, measured against each other: an entry of an index, a row fetched through
 * it, an entry of a token's list. Only their ratios matter, and only for speed. */
constexpr double kFetchCost = 8;
constexpr double kPrefixEntryCost = 1.5;
/* A word is common when one song in so many has it. */
constexpr std::int64_t kCommonShare = 20;
constexpr std::int64_t kLongestWalk = 4000;
/* Counts of so many tokens of a word tell enough. */
constexpr size_t kTokensLookedUp = 3;
/* Songs outside of the music root that are counted before counting those inside instead. */
constexpr std::int64_t kOutsideBound = 20000;

Sql newSql(std::string_view text) {
    Sql sql(dialect());
    sql.add(text);
    return sql;
}

}  // namespace

const Dialect &dialect() {
    static constexpr Dialect kDialect{
        '?',          false,    "instr",     "zano_fold",
        "zano_lower", "length", "zano_like", "SELECT value FROM json_each",
        "",           "",       "",          "",
        "",           false,    "-1"};
    return kDialect;
}

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
    answered_.resize(conjuncts_.size());
    if (reader_.state().isOrdered) {
        findGrams();
    }
}

void SongPlan::findGrams() {
    GramQuery all{{}, true, false};
    for (size_t i = 0; i < conjuncts_.size(); ++i) {
        const auto group =
            conjuncts_[i].searches.empty() ? std::nullopt : gramQueryOf(conjuncts_[i].searches);
        if (!group) {
            continue;
        }
        all.match += (all.match.empty() ? "(" : " AND (") + group->match + ")";
        all.isShort = all.isShort || group->isShort;
        answered_[i] = group->isExact;
        terms_.insert(terms_.end(), conjuncts_[i].searches.begin(), conjuncts_[i].searches.end());
    }
    if (!all.match.empty()) {
        all.isExact = std::all_of(answered_.begin(), answered_.end(), [](bool is) { return is; });
        grams_ = std::move(all);
    }
}

void SongPlan::addMatch(Sql &sql) {
    sql.add("grams MATCH ").bind(grams_->match);
}

void SongPlan::addWhere(Sql &sql, bool withGrams) {
    std::string_view word = " WHERE ";
    if (withGrams) {
        addMatch(sql.add(word));
        word = " AND ";
    }
    for (size_t i = 0; i < conjuncts_.size(); ++i) {
        if (withGrams && answered_[i]) {
            continue;
        }
        sql.add(word);
        sql.addCondition(*conjuncts_[i].expression, "songs.");
        word = " AND ";
    }
}

void SongPlan::addSource(Sql &sql, bool withGrams) {
    sql.add(withGrams ? " FROM grams CROSS JOIN songs ON songs.rank=grams.rowid" : " FROM songs");
    addWhere(sql, withGrams);
}

/* The rank at which a walk for a common word should give way to the index; null for rare ones.
 * Walking costs a row for each song but needs no start; the index must find where the lists of
 * all tokens meet. */
std::optional<std::int64_t> SongPlan::endOfWalk(Page page) {
    if (page.limit == 0 || reader_.state().anchored != reader_.state().generation) {
        return std::nullopt;
    }
    const std::int64_t matches = estimatedMatches();
    if (matches * kCommonShare < reader_.state().songs) {
        return std::nullopt;
    }
    const std::int64_t entries =
        (page.offset + page.limit) * 2 * reader_.state().songs / std::max<std::int64_t>(1, matches);
    Sql find =
        newSql("SELECT rank FROM songs WHERE id=(SELECT song FROM anchors WHERE stored_order=");
    find.bind(std::int64_t{findStoredOrder({Column::Title, false})->number}).add(" AND place=");
    find.bind(1 + std::min(entries, kLongestWalk) / kAnchorDistance).add(")");
    const std::int64_t rank = reader_.integer(find, INT64_MIN);
    return rank == INT64_MIN ? std::nullopt : std::optional(rank);
}

Sql SongPlan::stream(std::string_view columns, Page page) {
    const auto end = endOfWalk(page);
    Sql sql = newSql(end ? "SELECT * FROM (" : "");
    if (end) {
        addWalk(sql, columns, *findStoredOrder({Column::Title, false}));
        sql.add(" AND rank<").bind(*end).add(" ORDER BY rank) UNION ALL SELECT * FROM (");
    }
    sql.add("SELECT ").add(columns);
    addSource(sql, true);
    if (end) {
        sql.add(" AND grams.rowid>=").bind(*end);
    }
    sql.add(end ? " ORDER BY grams.rowid)" : " ORDER BY grams.rowid");
    sql.addPage(page.offset, page.limit);
    return sql;
}

Sql SongPlan::candidates(std::string_view columns, const StoredOrder &order, Page page) {
    Sql sql = newSql("SELECT ").add(columns);
    addSource(sql, true);
    /* The signs keep SQLite from walking an index of the order instead. */
    sql.add(" ORDER BY ").add(orderText(order, "+songs."));
    sql.addPage(page.offset, page.limit);
    return sql;
}

void SongPlan::addWalk(Sql &sql, std::string_view columns, const StoredOrder &order) {
    sql.add("SELECT ").add(columns).add(" FROM songs");
    if (!order.index.empty()) {
        sql.add(" INDEXED BY ").add(order.index);
    }
    addWhere(sql, false);
}

Sql SongPlan::walk(std::string_view columns, const StoredOrder &order, Page page) {
    Sql sql = newSql("");
    addWalk(sql, columns, order);
    sql.add(" ORDER BY ").add(orderText(order, "songs."));
    sql.addPage(page.offset, page.limit);
    return sql;
}

/* Deep pages of the whole library begin at the nearest anchor, if the anchors were set in the
 * very state of the catalogue that is being read. Where there is no anchor, there are no songs. */
std::optional<Sql> SongPlan::anchored(std::string_view columns, const StoredOrder &order,
                                      Page page) {
    if (page.offset < kAnchorDistance || reader_.state().anchored != reader_.state().generation) {
        return std::nullopt;
    }
    Sql sql = newSql("SELECT ").add(columns).add(" FROM songs");
    if (!order.index.empty()) {
        sql.add(" INDEXED BY ").add(order.index);
    }
    std::string place;
    if (!order.key.empty()) {
        place.append(order.key).append(", ");
    }
    place.append(order.tail);
    sql.add(" WHERE (").add(place).add(order.descending ? ")<=(SELECT " : ")>=(SELECT ");
    sql.add(place).add(" FROM songs WHERE id=(SELECT song FROM anchors WHERE stored_order=");
    sql.bind(std::int64_t{order.number}).add(" AND place=");
    sql.bind(page.offset / kAnchorDistance).add(")) ORDER BY ").add(orderText(order, "songs."));
    sql.addPage(page.offset % kAnchorDistance, page.limit);
    return sql;
}

Sql SongPlan::page(std::string_view columns, const Query &query) {
    const Page page{query.offset, query.limit};
    const std::vector<OrderTerm> byId = {{Column::Id}};
    const auto &order = query.order.empty() ? byId : query.order;
    const auto leading = order.front().column == Column::Id || order.front().column == Column::Path
                             ? std::optional(order.front())
                             : leadingTermOf(order);
    const StoredOrder *stored =
        leading && reader_.state().isOrdered ? findStoredOrder(*leading) : nullptr;
    if (stored != nullptr && conjuncts_.empty()) {
        auto deep = anchored(columns, *stored, page);
        return deep ? std::move(*deep) : walk(columns, *stored, page);
    }
    if (stored != nullptr && grams_) {
        if (page.limit > 0 && isWalkCheaper(*stored, page)) {
            return walk(columns, *stored, page);
        }
        return stored->tail == "rank" ? stream(columns, page) : candidates(columns, *stored, page);
    }
    Sql sql = newSql("SELECT ").add(columns);
    addSource(sql, grams_.has_value());
    sql.add(" ORDER BY ");
    if (stored != nullptr) {
        sql.add(orderText(*stored, "songs."));
    } else {
        sql.addFullOrder(order, "songs.");
    }
    sql.addPage(page.offset, page.limit);
    return sql;
}

Sql SongPlan::distinctPage(std::string_view columns, const Query &query) {
    const ColumnInfo &info = columnInfo(*query.distinct);
    Sql sql = newSql("SELECT ").add(columns);
    sql.add(" FROM songs WHERE songs.id IN (SELECT min(songs.id)");
    addSource(sql, grams_.has_value());
    sql.add(" GROUP BY songs.").add(info.name).add(") ORDER BY ");
    /* By the values themselves where no order is given, as the kept values come. */
    sql.addOrder(query.order.empty() ? std::vector<OrderTerm>{{*query.distinct}} : query.order,
                 "songs.");
    const bool isDescending = !query.order.empty() && query.order[0].descending;
    sql.add(", songs.").add(info.name).add(isDescending ? " DESC, songs.id" : ", songs.id");
    sql.addPage(query.offset, query.limit);
    return sql;
}

Sql SongPlan::ids(std::optional<Column> distinct) {
    Sql sql = newSql(distinct ? "SELECT min(songs.id)" : "SELECT songs.id");
    addSource(sql, grams_.has_value());
    if (distinct) {
        sql.add(" GROUP BY songs.").add(columnInfo(*distinct).name);
    }
    return sql;
}

/* How many songs have the rarest token of each term, at most; counted at the end of a scan and
 * good enough to choose by. Tokens that are not on record are rare. */
std::int64_t SongPlan::estimatedMatches() {
    std::int64_t sum = 0;
    for (const SearchTerm &term : terms_) {
        std::int64_t least = reader_.state().songs;
        const auto tokens = gramsOf(term);
        const size_t stride = 1 + tokens.size() / kTokensLookedUp;
        for (size_t i = 0; i < tokens.size(); i += stride) {
            least = std::min(least, reader_.gramCount(tokens[i]));
        }
        sum += least;
    }
    return std::min(sum, reader_.state().songs);
}

/* The number of candidates; where there are more than `bound`, what the places of the first of
 * them say of all. */
std::int64_t SongPlan::candidatesUpTo(std::int64_t bound) {
    Sql sql = newSql("SELECT count(*), max(found) FROM (SELECT rowid AS found FROM grams WHERE ");
    addMatch(sql);
    sql.add(" ORDER BY rowid LIMIT ").bind(bound).add(")");
    Using row(reader_.statement(sql));
    row->step();
    const std::int64_t count = row->integer(0);
    if (count < bound) {
        return count;
    }
    const auto last = static_cast<double>(row->integer(1));
    const auto first = static_cast<double>(reader_.integer(newSql("SELECT min(rank) FROM songs")));
    const auto end = static_cast<double>(reader_.integer(newSql("SELECT max(rank) FROM songs")));
    const double share = std::max(1e-6, (last - first) / std::max(1.0, end - first));
    return static_cast<std::int64_t>(static_cast<double>(count) / share);
}

bool SongPlan::isWalkCheaper(const StoredOrder &order, Page page) {
    const bool isStream = order.tail == "rank";
    if (isStream && !grams_->isShort) {
        return false;
    }
    const auto songs = static_cast<double>(reader_.state().songs);
    const auto wanted = static_cast<double>(page.offset + page.limit);
    const double factor = isStream ? kPrefixEntryCost : kFetchCost;
    const auto walkCost = [&](double matches) {
        return std::min(songs, wanted * songs / std::max(1.0, matches)) * kFetchCost;
    };
    auto matches = static_cast<double>(estimatedMatches());
    if (matches * factor <= walkCost(matches)) {
        return false;
    }
    if (!isStream && !grams_->isShort) {
        const auto bound = static_cast<std::int64_t>(std::sqrt(wanted * songs)) + 1;
        matches = static_cast<double>(candidatesUpTo(std::min<std::int64_t>(bound, 1000)));
    }
    return matches * factor > walkCost(matches);
}

std::int64_t SongPlan::countOutside(const std::string &prefix, std::int64_t bound) {
    Sql before = newSql("SELECT count(*) FROM (SELECT 1 FROM songs WHERE path<").bind(prefix);
    before.add(" LIMIT ").bind(bound).add(")");
    std::int64_t outside = reader_.integer(before);
    if (const auto end = endOfPrefix(prefix)) {
        Sql behind = newSql("SELECT count(*) FROM (SELECT 1 FROM songs WHERE path>=").bind(*end);
        behind.add(" LIMIT ").bind(bound).add(")");
        outside += reader_.integer(behind);
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
    if (conjuncts_.empty() && reader_.state().isOrdered) {
        if (const Facet *facet = findFacet(*distinct)) {
            return reader_.state().facetCounts.find(facet->state)->second;
        }
    }
    if (grams_ && grams_->isExact && !distinct) {
        if (grams_->isShort && terms_.size() == 1) {
            Sql kept = newSql("SELECT songs FROM short_counts WHERE gram=");
            return reader_.integer(kept.bind(gramsOf(terms_[0])[0]));
        }
        Sql sql = newSql("SELECT count(*) FROM grams WHERE ");
        addMatch(sql);
        return reader_.integer(sql);
    }
    Sql sql = newSql("SELECT count(");
    if (distinct) {
        sql.add("DISTINCT songs.").add(columnInfo(*distinct).name).add(")");
    } else {
        sql.add("*)");
    }
    /* Looking at every other song is slower than looking at all of them one after another. */
    const bool withGrams = grams_ && estimatedMatches() < reader_.state().songs / 3;
    addSource(sql, withGrams);
    return reader_.integer(sql);
}

}  // namespace zano::mediadb::sqlite
