/* A process of its own that reads tags, so that no file can stop a scan.
 *
 * The process is this same program, started again with kReaderArgument, with a socket as its
 * standard input. It answers requests in their order, each before it looks at the next, so the
 * oldest request without an answer is always the file that it is at. */
#pragma once

#include <chrono>
#include <cstddef>
#include <string>
#include <string_view>

#include "descriptor.h"
#include "tags.h"
#include "wire.h"

namespace zano::index {

inline constexpr std::string_view kReaderArgument = "--read-tags";

/* What one file may cost. */
struct ReaderLimits {
    std::size_t memoryBytes = std::size_t{512} << 20U;
    std::chrono::milliseconds time = std::chrono::seconds(10);
};

/* The life of such a process: serves requests from standard input until it ends, under the
 * memory limit. Returns the exit code. */
int serveTags(TagReader reader, const ReaderLimits &limits);

/* The other end: starts a process, and kills it when destroyed. */
class ReaderProcess {
  public:
    /* Throws std::system_error when no process can be made. */
    ReaderProcess();
    ReaderProcess(const ReaderProcess &) = delete;
    ReaderProcess &operator=(const ReaderProcess &) = delete;
    ~ReaderProcess();

    /* For poll(); the socket blocks neither end of these calls. */
    int descriptor() const { return socket_.get(); }

    void request(std::string_view path) { appendFrame(unsent_, path); }
    bool hasUnsent() const { return !unsent_.empty(); }
    /* Sends what the socket takes; what is left is for the next call. */
    void send();

    /* Takes in what the process said; false when it is at its end. */
    bool receive();
    /* The frames that came in. */
    FrameReader &frames() { return frames_; }

    /* The processor time that it has used. */
    std::chrono::nanoseconds processorTime() const;

    /* Ends it and says how it ended: kCrashed with the signal or exit code, or kKilled. */
    ReadAnswer end();

  private:
    pid_t pid_ = -1;
    Descriptor socket_;
    std::string unsent_;
    FrameReader frames_;
};

}  // namespace zano::index
