/* A connection for reading with what belongs to it, and the pool that keeps idle ones: connecting
 * costs more than reading a page. A result that its caller never closes keeps its connection. */
#pragma once

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <utility>

#include "../query/analysis.h"
#include "../reader_lease.h"
#include "common_grams.h"
#include "handle.h"

namespace zano::mediadb::postgresql {

/* What the table `state` said when the snapshot began. */
struct State {
    std::int64_t schema = 0;
    std::int64_t songs = 0;
    std::int64_t generation = 0;
    std::int64_t anchored = -1;
    std::int64_t indexed = 0;
    std::int64_t artists = 0;
    std::int64_t albums = 0;
    std::int64_t genres = 0;

    /* By the name of the row; null for one that readers do not need. */
    std::int64_t *find(std::string_view name);
    bool operator==(const State &) const = default;
};

/* A statement and whether one plan serves it whatever its values. */
struct Statement {
    Sql sql;
    Connection::Plan plan = Connection::Plan::ForValues;
};

class Reader {
  public:
    explicit Reader(const std::string &uri) : connection_(uri, Connection::Access::Read) {}

    /* Everything read from now on is of one moment, until the reader goes back to its pool. */
    void beginSnapshot();
    /* The rows of one statement that was made for state(), before a snapshot is begun, and with
     * one. Null: the catalogue has changed since, and state() is another now. */
    std::optional<Result> answer(const Statement &statement);
    std::optional<Result> beginSnapshot(const Statement &statement);
    /* false: the connection is of no more use. */
    bool endSnapshot() noexcept;

    Connection &connection() { return connection_; }
    /* Of the snapshot; before one is begun, of some moment before. */
    const State &state();
    /* Whether the path of every song begins so. */
    bool allPathsBegin(const std::string &prefix);
    /* What is known of the key of a column. */
    const GramShares &gramsOf(Column column);

  private:
    bool takeState(const Result &rows);

    Connection connection_;
    std::optional<State> state_;
    bool isInSnapshot_ = false;
    /* Of the songs at that generation. */
    std::optional<std::string> commonPrefix_;
    std::map<Column, GramShares> grams_;
};

class ReaderPool : public std::enable_shared_from_this<ReaderPool> {
  public:
    using Lease = ReaderLease<ReaderPool, Reader>;

    explicit ReaderPool(std::string uri) : uri_(std::move(uri)) {}

    /* What `work` makes of a reader. An idle connection may have lost its server, which shows when
     * it is used; another host may be there in its place. */
    template <typename Work>
    auto serve(const Work &work) {
        while (auto reader = idle_.take()) {
            try {
                return work(Lease(shared_from_this(), std::move(reader)));
            } catch (const LostConnection &) {
                continue;
            }
        }
        return work(Lease(shared_from_this(), std::make_unique<Reader>(uri_)));
    }

  private:
    friend Lease;

    void giveBack(std::unique_ptr<Reader> reader) noexcept;

    std::string uri_;
    IdleReaders<Reader> idle_;
};

}  // namespace zano::mediadb::postgresql
