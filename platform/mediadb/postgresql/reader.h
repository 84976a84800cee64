/* A connection for reading with what belongs to it, and the pool that keeps idle ones: connecting
 * costs more than reading a page. A result that its caller never closes keeps its connection. */
#pragma once

#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "../forks.h"
#include "handle.h"

namespace zano::mediadb::postgresql {

/* What the table `state` said when the snapshot began. */
struct State {
    std::int64_t schema = 0;
    std::int64_t songs = 0;
    std::int64_t generation = 0;
    std::int64_t anchored = -1;
    std::int64_t artists = 0;
    std::int64_t albums = 0;
    std::int64_t genres = 0;

    /* By the name of the row; null for one that readers do not need. */
    std::int64_t *find(std::string_view name);
};

class Reader {
  public:
    explicit Reader(const std::string &uri) : connection_(uri, Connection::Access::Read) {}

    /* Everything read between the two is of one moment. */
    void beginSnapshot();
    /* false: the connection is of no more use. */
    bool endSnapshot() noexcept;

    Connection &connection() { return connection_; }
    State &state() { return state_; }
    /* Whether the path of every song begins so. */
    bool allPathsBegin(const std::string &prefix);

  private:
    Connection connection_;
    State state_;
    std::optional<std::string> commonPrefix_;  // of the paths at state_.generation
};

class ReaderPool : public std::enable_shared_from_this<ReaderPool> {
  public:
    explicit ReaderPool(std::string uri) : uri_(std::move(uri)), forks_(forksSoFar()) {}
    ~ReaderPool() { forgetOthers(); }
    ReaderPool(const ReaderPool &) = delete;
    ReaderPool &operator=(const ReaderPool &) = delete;

    /* A reader with a snapshot begun; it goes back when the lease ends. */
    class Lease {
      public:
        Lease(std::shared_ptr<ReaderPool> pool, std::unique_ptr<Reader> reader)
            : pool_(std::move(pool)), reader_(std::move(reader)), forks_(forksSoFar()) {}
        ~Lease();
        Lease(Lease &&) = default;
        Lease &operator=(Lease &&) = delete;
        Lease(const Lease &) = delete;
        Lease &operator=(const Lease &) = delete;

        /* Throws in a process that was forked off since: the connection is its parent's. */
        Reader &operator*() const;

      private:
        std::shared_ptr<ReaderPool> pool_;
        std::unique_ptr<Reader> reader_;
        unsigned forks_;
    };
    Lease lease();

  private:
    void forgetOthers();
    std::unique_ptr<Reader> takeIdle();
    void giveBack(std::unique_ptr<Reader> reader) noexcept;

    std::string uri_;
    std::mutex mutex_;
    std::vector<std::unique_ptr<Reader>> idle_;
    unsigned forks_;
};

}  // namespace zano::mediadb::postgresql
