/* Tag readers at work: hands out files, collects answers, replaces readers that die.
 *
 * A file that kills its reader, or keeps it longer than the limit, gets that as its answer; the
 * files in line behind it go to the next reader. Each reader has several files in line, so that
 * none waits for the indexer. One thread. */
#pragma once

#include <chrono>
#include <deque>
#include <memory>
#include <optional>
#include <vector>

#include "path_list.h"
#include "reader_process.h"

namespace zano::index {

/* Where the pool gets its work, and where the answers go, in any order. */
class ReadJobs {
  public:
    virtual ~ReadJobs() = default;
    ReadJobs() = default;
    ReadJobs(const ReadJobs &) = delete;
    ReadJobs &operator=(const ReadJobs &) = delete;

    virtual std::optional<ListedFile> next() = 0;
    virtual void answer(const ListedFile &file, ReadAnswer &&answer) = 0;
};

class ReaderPool {
  public:
    /* Starts nothing yet. Keeps a reference to jobs. */
    ReaderPool(ReadJobs &jobs, std::size_t readers, const ReaderLimits &limits);
    ~ReaderPool();

    /* Hands out work and takes in the answers that are there, waiting for one up to `wait`.
     * false when no job is left and every answer was given. Throws std::runtime_error when
     * readers do not start at all. */
    bool pump(std::chrono::milliseconds wait);

  private:
    struct Reader;
    using Clock = std::chrono::steady_clock;

    void supply(Reader &reader);
    bool supplyAll();
    std::optional<ListedFile> nextJob();
    void start(Reader &reader);
    void listen(std::chrono::milliseconds wait);
    void collect(Reader &reader);
    bool take(Reader &reader, std::string_view frame);
    bool takeAll(Reader &reader);
    void settle(Reader &reader, ReadAnswer &&answer);
    void replace(Reader &reader, std::optional<ReadAnswer> blame);
    void watchTime(Reader &reader, std::chrono::nanoseconds passed);

    ReadJobs &jobs_;
    ReaderLimits limits_;
    std::vector<std::unique_ptr<Reader>> readers_;
    std::deque<ListedFile> returned_;  // were in line behind a file that killed its reader
    Clock::time_point lastPump_;
};

}  // namespace zano::index
