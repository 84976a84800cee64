/* A connection for reading with what belongs to it, and the pool that keeps idle ones: connecting
 * costs more than reading a page. A result that its caller never closes keeps its connection. */
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <utility>

#include "../reader_lease.h"
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
    using Lease = ReaderLease<ReaderPool, Reader>;

    explicit ReaderPool(std::string uri) : uri_(std::move(uri)) {}

    Lease lease();

  private:
    friend Lease;

    void giveBack(std::unique_ptr<Reader> reader) noexcept;

    std::string uri_;
    IdleReaders<Reader> idle_;
};

}  // namespace zano::mediadb::postgresql
