#include "reader_pool.h"

#include <poll.h>
#include <algorithm>
#include <ctime>
#include <iterator>
#include <stdexcept>
#include <utility>

namespace zano::index {
namespace {

/* Files in line at a reader: enough for it to work on while the indexer writes a batch. */
constexpr std::size_t kLine = 128;
constexpr std::size_t kShortLine = kLine / 2;

/* The most that one look at the clock adds to a file's time: the indexer itself may have been
 * stopped, suspended or busy in between, and that is not the reader's fault. */
constexpr std::chrono::nanoseconds kLongestTick = std::chrono::milliseconds(500);

constexpr timespec kNap = {0, 1'000'000};

}  // namespace

struct ReaderPool::Reader {
    std::unique_ptr<ReaderProcess> process;
    bool hasGreeted = false;
    std::deque<ListedFile> line;  // the first is what it is at
    std::chrono::nanoseconds waited{};
    std::optional<std::chrono::nanoseconds> processorTimeBefore;

    void noteLife() {
        waited = {};
        processorTimeBefore.reset();
    }
};

ReaderPool::ReaderPool(ReadJobs &jobs, std::size_t readers, const ReaderLimits &limits)
    : jobs_(jobs), limits_(limits), lastPump_(Clock::now()) {
    readers_.resize(std::max<std::size_t>(readers, 1));
    std::generate(readers_.begin(), readers_.end(), [] { return std::make_unique<Reader>(); });
}

ReaderPool::~ReaderPool() = default;

std::optional<ListedFile> ReaderPool::nextJob() {
    if (returned_.empty()) {
        return jobs_.next();
    }
    auto job = std::move(returned_.front());
    returned_.pop_front();
    return job;
}

void ReaderPool::start(Reader &reader) {
    reader.process = std::make_unique<ReaderProcess>();
    reader.hasGreeted = false;
    reader.noteLife();
}

void ReaderPool::supply(Reader &reader) {
    if (reader.line.size() > kShortLine) {
        return;
    }
    while (reader.line.size() < kLine) {
        auto job = nextJob();
        if (!job) {
            break;
        }
        if (!reader.process) {
            start(reader);
        }
        reader.process->request(job->path);
        reader.line.push_back(std::move(*job));
    }
}

void ReaderPool::settle(Reader &reader, ReadAnswer &&answer) {
    const auto job = std::move(reader.line.front());
    reader.line.pop_front();
    jobs_.answer(job, std::move(answer));
}

/* Gives up a reader. blame is the answer for the file that it was at; without one that file
 * goes back with the others. */
void ReaderPool::replace(Reader &reader, std::optional<ReadAnswer> blame) {
    reader.process.reset();
    if (blame && !reader.line.empty()) {
        settle(reader, std::move(*blame));
    }
    returned_.insert(returned_.begin(), std::make_move_iterator(reader.line.begin()),
                     std::make_move_iterator(reader.line.end()));
    reader.line.clear();
}

/* One frame of a reader; false when it cannot be trusted any more. */
bool ReaderPool::take(Reader &reader, std::string_view frame) {
    reader.noteLife();
    if (!reader.hasGreeted) {
        reader.hasGreeted = true;
        return frame == kReaderGreeting;
    }
    auto answer = decodeAnswer(frame);
    if (!answer || reader.line.empty()) {
        return false;
    }
    const bool isSpent = isFaultOfFile(answer->status);
    settle(reader, std::move(*answer));
    if (isSpent) {
        replace(reader, std::nullopt);
    }
    return true;
}

bool ReaderPool::takeAll(Reader &reader) {
    while (reader.process) {
        const auto frame = reader.process->frames().next();
        if (!frame) {
            return !reader.process->frames().isBroken();
        }
        if (!take(reader, *frame)) {
            return false;
        }
    }
    return true;
}

void ReaderPool::collect(Reader &reader) {
    const bool isAlive = reader.process->receive();
    if (!takeAll(reader)) {
        replace(reader, ReadAnswer{ReadStatus::kCrashed, "its answer made no sense", {}});
    }
    if (isAlive || !reader.process) {
        return;
    }
    auto blame = reader.process->end();
    if (!reader.hasGreeted) {
        throw std::runtime_error("the tag reader does not start: " + reasonText(blame));
    }
    replace(reader, std::move(blame));
}

/* Waits with poll() for what readers say, and lets each say it. */
void ReaderPool::listen(std::chrono::milliseconds wait) {
    std::vector<pollfd> sockets;
    for (const auto &reader : readers_) {
        const bool isAtWork = reader->process && !reader->line.empty();
        const auto sending = isAtWork && reader->process->hasUnsent() ? POLLOUT : 0;
        sockets.push_back({isAtWork ? reader->process->descriptor() : -1,
                           static_cast<short>(POLLIN | sending), 0});
    }
    if (poll(sockets.data(), sockets.size(), static_cast<int>(wait.count())) <= 0) {
        return;
    }
    for (std::size_t i = 0; i < readers_.size(); ++i) {
        if ((sockets[i].revents & (POLLIN | POLLHUP | POLLERR)) != 0) {
            collect(*readers_[i]);
        }
    }
}

void ReaderPool::watchTime(Reader &reader, std::chrono::nanoseconds passed) {
    if (!reader.process || reader.line.empty()) {
        return;
    }
    if (!reader.processorTimeBefore) {
        reader.processorTimeBefore = reader.process->processorTime();
    }
    reader.waited += passed;
    if (reader.waited < limits_.time) {
        return;
    }
    // A reader that did not use its time was waiting for the disk.
    const auto used = reader.process->processorTime() - *reader.processorTimeBefore;
    const auto status = used > reader.waited / 10 ? ReadStatus::kOutOfTime : ReadStatus::kNoAnswer;
    replace(reader, ReadAnswer{status, {}, {}});
}

/* Gives work to all; whether any has so little that it could run out of it. */
bool ReaderPool::supplyAll() {
    bool isAnyShort = false;
    for (const auto &reader : readers_) {
        supply(*reader);
        if (reader->process) {
            reader->process->send();
        }
        isAnyShort = isAnyShort || reader->line.size() <= kShortLine;
    }
    return isAnyShort;
}

bool ReaderPool::pump(std::chrono::milliseconds wait) {
    const bool isAnyShort = supplyAll();
    if (std::all_of(readers_.begin(), readers_.end(),
                    [](const auto &reader) { return reader->line.empty(); })) {
        return false;
    }
    // With work in every line, waking up for each answer would cost the readers a processor.
    if (wait.count() > 0 && !isAnyShort) {
        nanosleep(&kNap, nullptr);
    }
    listen(wait);
    const auto now = Clock::now();
    const auto passed = std::min<std::chrono::nanoseconds>(now - lastPump_, kLongestTick);
    lastPump_ = now;
    for (const auto &reader : readers_) {
        watchTime(*reader, passed);
    }
    return true;
}

}  // namespace zano::index
