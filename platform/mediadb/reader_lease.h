/* Connections for reading that wait to be used again, and the loan of one: connecting costs more
 * than reading a page. A result that its caller never closes keeps its connection. */
#pragma once

#include <zanoplatform/error.h>

#include <memory>
#include <mutex>
#include <utility>
#include <vector>

#include "engine.h"
#include "forks.h"

namespace zano::mediadb {

/* From several threads at once. */
template <typename Reader>
class IdleReaders {
  public:
    IdleReaders() { readers_.reserve(kMost); }
    ~IdleReaders() { forgetOthers(); }
    IdleReaders(const IdleReaders &) = delete;
    IdleReaders &operator=(const IdleReaders &) = delete;

    /* Null: there is none. */
    std::unique_ptr<Reader> take() {
        const std::lock_guard lock(mutex_);
        forgetOthers();
        if (readers_.empty()) {
            return nullptr;
        }
        auto reader = std::move(readers_.back());
        readers_.pop_back();
        return reader;
    }

    void put(std::unique_ptr<Reader> reader) noexcept {
        const std::lock_guard lock(mutex_);
        if (readers_.size() < kMost) {
            readers_.push_back(std::move(reader));
        }
    }

    void clear() {
        const std::lock_guard lock(mutex_);
        forgetOthers();
        readers_.clear();
    }

  private:
    static constexpr std::size_t kMost = 4;

    /* Connections must not be used in a process that was forked off, not even to close them. */
    void forgetOthers() {
        if (forks_ != forksSoFar()) {
            for (auto &reader : readers_) {
                static_cast<void>(reader.release());
            }
            readers_.clear();
            forks_ = forksSoFar();
        }
    }

    std::mutex mutex_;
    std::vector<std::unique_ptr<Reader>> readers_;
    unsigned forks_ = forksSoFar();
};

/* A reader of a pool with a snapshot begun; it goes back (Pool::giveBack) when the lease ends. */
template <typename Pool, typename Reader>
class ReaderLease {
  public:
    ReaderLease(std::shared_ptr<Pool> pool, std::unique_ptr<Reader> reader)
        : pool_(std::move(pool)), reader_(std::move(reader)), forks_(forksSoFar()) {}
    ~ReaderLease() {
        if (reader_ != nullptr && isOurs()) {
            pool_->giveBack(std::move(reader_));
        } else {
            static_cast<void>(reader_.release());
        }
    }
    ReaderLease(ReaderLease &&) noexcept = default;
    ReaderLease &operator=(ReaderLease &&) = delete;
    ReaderLease(const ReaderLease &) = delete;
    ReaderLease &operator=(const ReaderLease &) = delete;

    /* Throws in a process that was forked off since: the connection is its parent's, and what it
     * would read there need not be of one moment, nor whole. */
    Reader &operator*() const {
        if (!isOurs()) {
            throw DatabaseError(KLIB_ERR_DATABASE_FAILED,
                                "the result was opened before this process was forked off");
        }
        return *reader_;
    }
    /* false in such a process. */
    bool isOurs() const { return forks_ == forksSoFar(); }

  private:
    std::shared_ptr<Pool> pool_;
    std::unique_ptr<Reader> reader_;
    unsigned forks_;
};

}  // namespace zano::mediadb
