/* A connection for reading with what belongs to it, and the pool that keeps idle ones.
 *
 * Opening a connection costs more than reading a page, so they are kept, with their prepared
 * statements. A result that its caller never closes keeps its connection to itself and so holds
 * back nobody else's view of the database.
 */
#pragma once

#include <sys/types.h>

#include <chrono>
#include <list>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "../clock_tick.h"
#include "../query/render.h"
#include "../reader_lease.h"
#include "handle.h"

namespace zano::mediadb::sqlite {

/* What the table `state` said when the snapshot began. */
struct State {
    std::int64_t songs = 0;
    std::int64_t generation = 0;
    std::int64_t anchored = -1;
    bool isOrdered = false;
    std::map<std::string, std::int64_t, std::less<>> facetCounts;
};

class Reader {
  public:
    explicit Reader(const std::string &path);

    /* Everything read between the two is of one moment. Statements are reset before the end. */
    void beginSnapshot();
    void endSnapshot() noexcept;
    const State &state() const { return state_; }
    /* Whether the path of every song begins so. */
    bool allPathsBegin(const std::string &prefix);

    /* How many songs have a token, as counted at the end of a scan; 0 for rare ones. */
    std::int64_t gramCount(const std::string &gram);

    /* Gives what follows the time limit of a query. The clock itself is first looked at when
     * something takes long enough to be asked for it. */
    void restartClock() { isClockRunning_ = false; }

    /* A prepared statement, kept for the next time; it is the caller's until it is reset. */
    Statement &statement(const std::string &sql);
    /* The same with its values bound; they must live until it is reset. */
    Statement &statement(const Sql &sql);

    /* The first column of the first row of a statement; `fallback` when there is none. */
    std::int64_t integer(const Sql &sql, std::int64_t fallback = 0);

  private:
    static int checkClock(void *self);

    void readState();

    Connection connection_;
    bool isClockRunning_ = false;
    std::chrono::steady_clock::time_point deadline_;
    Statement snapshot_;

    std::int64_t dataVersion_ = -1;
    State state_;
    std::optional<std::string> commonPrefix_;                  // of the paths at dataVersion_
    std::map<std::string, std::int64_t> gramCounts_;           // at dataVersion_
    std::list<std::pair<std::string, Statement>> statements_;  // the last used first
    std::map<std::string_view, std::list<std::pair<std::string, Statement>>::iterator> bySql_;
};

class ReaderPool : public std::enable_shared_from_this<ReaderPool> {
  public:
    using Lease = ReaderLease<ReaderPool, Reader>;

    explicit ReaderPool(std::string path) : path_(std::move(path)) {}

    Lease lease();

  private:
    friend Lease;

    void followFile();
    void giveBack(std::unique_ptr<Reader> reader) noexcept;

    std::string path_;
    IdleReaders<Reader> idle_;
    ClockTick tick_;
    std::mutex mutex_;  // of what follows
    dev_t device_ = 0;
    ino_t inode_ = 0;
};

}  // namespace zano::mediadb::sqlite
