/* Bounds how often something outside of the process is looked at again. */
#pragma once

#include <atomic>
#include <cstdint>
#include <ctime>

namespace zano::mediadb {

/* A file that every query would look at is looked at once in a tick of the system's coarse clock,
 * 1 to 10 ms; reading that clock costs a hundredth of the look. From several threads at once. */
class ClockTick {
  public:
    /* Whether it is another tick than at the last call. */
    bool isAnother() {
        timespec now{};
        clock_gettime(CLOCK_MONOTONIC_COARSE, &now);
        const std::int64_t tick = std::int64_t{now.tv_sec} * 1'000'000'000 + now.tv_nsec;
        return last_.exchange(tick, std::memory_order_relaxed) != tick;
    }

  private:
    std::atomic<std::int64_t> last_{-1};
};

}  // namespace zano::mediadb
