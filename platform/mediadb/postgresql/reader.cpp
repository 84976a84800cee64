#include "reader.h"

#include <zanoplatform/error.h>

#include <algorithm>
#include <utility>

#include "schema.h"

namespace zano::mediadb::postgresql {
namespace {

constexpr const char *kState = "SELECT name, value FROM state";
constexpr const char *kBegin = "BEGIN TRANSACTION ISOLATION LEVEL REPEATABLE READ, READ ONLY";

constexpr const char *kNoRight = "42501";

/* What a database without a media database says. */
template <typename Work>
Result withWordsForNoTable(const Work &work) {
    try {
        return work();
    } catch (const ServerError &error) {
        if (error.state() == "42P01") {
            throw ServerError(KLIB_ERR_DATABASE_OPEN,
                              "the PostgreSQL database holds no media database yet; zanoindex "
                              "makes it",
                              error.state());
        }
        throw;
    }
}

}  // namespace

std::int64_t *State::find(std::string_view name) {
    const std::pair<std::string_view, std::int64_t *> rows[] = {
        {"schema", &schema},     {"songs", &songs},     {"generation", &generation},
        {"anchored", &anchored}, {"indexed", &indexed}, {"artists", &artists},
        {"albums", &albums},     {"genres", &genres}};
    for (const auto &[known, value] : rows) {
        if (known == name) {
            return value;
        }
    }
    return nullptr;
}

/* false: it is as it was. What was kept of the songs goes with their generation. */
bool Reader::takeState(const Result &rows) {
    State state;
    for (int i = 0; i < rows.size(); ++i) {
        if (std::int64_t *value = state.find(rows[i].text(0))) {
            *value = rows[i].integer(1);
        }
    }
    requireVersion(state.schema);
    if (state == state_) {
        return false;
    }
    if (!state_ || state.generation != state_->generation || state.anchored != state_->anchored) {
        commonPrefix_.reset();
        grams_.clear();
    }
    state_ = state;
    return true;
}

const State &Reader::state() {
    if (!state_) {
        takeState(withWordsForNoTable([this] { return connection_.run(newSql(kState)); }));
    }
    return *state_;
}

void Reader::beginSnapshot() {
    const std::string begin = std::string(kBegin) + "; EXECUTE ";
    isInSnapshot_ = true;  // also when what follows its beginning fails
    takeState(
        withWordsForNoTable([&] { return connection_.run(begin + connection_.nameOf(kState)); }));
}

bool Reader::endSnapshot() noexcept {
    try {
        if (isInSnapshot_) {
            isInSnapshot_ = false;
            connection_.runLater("COMMIT");
        }
        return !connection_.isBroken();
    } catch (const std::exception &) {
        return false;
    }
}

std::optional<Result> Reader::answer(const Statement &statement) {
    auto results = connection_.runTogether({kState}, statement.sql, statement.plan);
    return takeState(results[0]) ? std::nullopt : std::optional(std::move(results[1]));
}

std::optional<Result> Reader::beginSnapshot(const Statement &statement) {
    isInSnapshot_ = true;  // also when what follows its beginning fails
    auto results = connection_.runTogether({kBegin, kState}, statement.sql, statement.plan);
    return takeState(results[1]) ? std::nullopt : std::optional(std::move(results[2]));
}

/* A role may have been given its rights before there was the table. */
const GramShares &Reader::gramsOf(Column column) {
    if (const auto known = grams_.find(column); known != grams_.end()) {
        return known->second;
    }
    if (isInSnapshot_) {  // which a refusal would end
        static const GramShares kNone;
        return kNone;
    }
    GramShares grams;
    try {
        Sql sql = newSql("SELECT shares FROM grams WHERE key=");
        const Result rows = connection_.run(sql.bind(std::string(columnInfo(column).key)));
        if (rows.size() > 0) {
            grams = GramShares(std::string(rows[0].text(0)));
        }
    } catch (const ServerError &error) {
        if (error.state() != kNoRight) {
            throw;
        }
    }
    return grams_.emplace(column, std::move(grams)).first->second;
}

/* Nearly always true of the music root. What all paths begin with is what the first and the last
 * of them have in common. */
bool Reader::allPathsBegin(const std::string &prefix) {
    if (!commonPrefix_) {
        const Result ends =
            connection_.run(newSql("SELECT (SELECT path FROM songs ORDER BY path LIMIT 1), "
                                   "(SELECT path FROM songs ORDER BY path DESC LIMIT 1)"));
        const std::string_view a = ends[0].text(0);
        const std::string_view b = ends[0].text(1);
        commonPrefix_.emplace(a.begin(),
                              std::mismatch(a.begin(), a.end(), b.begin(), b.end()).first);
    }
    return commonPrefix_->compare(0, prefix.size(), prefix) == 0;
}

void ReaderPool::giveBack(std::unique_ptr<Reader> reader) noexcept {
    if (reader->endSnapshot()) {
        idle_.put(std::move(reader));
    }
}

}  // namespace zano::mediadb::postgresql
