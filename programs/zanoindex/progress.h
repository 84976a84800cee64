/* What the user sees while the indexer, or another program, works: a bar on a terminal, lines at
 * intervals elsewhere, on standard error; and messages between them. */
#pragma once

#include <chrono>
#include <cstdint>
#include <string>
#include <string_view>

namespace zano::index {

enum class ProgressStyle : std::uint8_t { kNone, kLines, kBar };

enum class Phase : std::uint8_t { kLooking, kReading, kIndexing, kCopying };

/* How far a phase is. total 0: not known. */
struct PhaseState {
    Phase phase = Phase::kLooking;
    std::int64_t done = 0;
    std::int64_t total = 0;
    double seconds = 0;  // since the phase began
};

/* "reading tags: 1200 of 5000 files, 800 files/s, 0:05 left" */
std::string progressText(const PhaseState &state);

/* The same with a bar in front where there is room, at most width columns. */
std::string progressBar(const PhaseState &state, std::size_t width, bool hasColour);

/* What suits standard error: a bar on a terminal that can, else lines. */
ProgressStyle styleForStandardError();

class Progress {
  public:
    explicit Progress(ProgressStyle style);
    Progress(const Progress &) = delete;
    Progress &operator=(const Progress &) = delete;
    ~Progress() { clear(); }

    /* Cheap to call for every file: shows something only now and then. */
    void show(Phase phase, std::int64_t done, std::int64_t total);

    /* Takes the bar away. */
    void clear();

    /* "zanoindex: text" on standard error, in every style. */
    void message(std::string_view text);

  private:
    using Clock = std::chrono::steady_clock;

    ProgressStyle style_;
    bool hasColour_;
    bool isBarShown_ = false;
    PhaseState state_;
    Clock::time_point phaseStart_;
    Clock::time_point lastShown_;
    std::chrono::milliseconds interval_;
};

}  // namespace zano::index
