/* Reads the tags of the files of a plan and puts them into the catalogue, batch by batch.
 *
 * Songs are collected first and then written in one short transaction, so that other programs
 * that write are not kept waiting while files are read. */
#pragma once

#include <chrono>
#include <cstddef>
#include <optional>
#include <vector>

#include "path_list.h"
#include "reader_pool.h"
#include "session.h"

namespace zano::index {

class TagPhase : private ReadJobs {
  public:
    struct Options {
        std::size_t readers = 1;  // processes at most
        ReaderLimits limits;
        std::size_t batchSongs = 5000;  // in one transaction at most
    };

    /* The list must stay while this does. */
    TagPhase(Session &session, const PathList &files, const Options &options);

    /* Until all is read and written, or a stop request is made; what was read is written then
     * too. */
    void run();

  private:
    using Clock = std::chrono::steady_clock;
    struct PendingSong {
        mediadb::Song song;
        std::int64_t Summary::*count;
    };

    std::optional<ListedFile> next() override { return files_.next(); }
    void answer(const ListedFile &file, ReadAnswer &&answer) override;
    void addPending(PendingSong &&pending);
    bool isBatchDue() const;
    void writeBatch();

    Session &session_;
    PathList::Reader files_;
    std::int64_t total_;
    std::int64_t done_ = 0;
    std::size_t batchSongs_;
    ReaderPool pool_;
    std::vector<PendingSong> pending_;
    std::size_t pendingBytes_ = 0;
    Clock::time_point firstPending_;
};

}  // namespace zano::index
