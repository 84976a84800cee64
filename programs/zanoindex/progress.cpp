#include "progress.h"

#include <sys/ioctl.h>
#include <unistd.h>
#include <algorithm>
#include <array>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <utility>

namespace zano::index {
namespace {

using std::chrono::milliseconds;

constexpr milliseconds kBarInterval(100);
constexpr milliseconds kLineInterval(5000);
constexpr std::size_t kDefaultWidth = 80;
constexpr std::size_t kWidestBar = 30;
constexpr std::size_t kNarrowestBar = 8;
/* Before this a rate says little. */
constexpr double kRateSeconds = 1.0;

struct PhaseRow {
    Phase phase;
    std::string_view name;
    std::string_view unit;
    bool hasRate;
};

constexpr std::array kPhases = {
    PhaseRow{Phase::kLooking, "looking for files", "files", true},
    PhaseRow{Phase::kReading, "reading tags", "files", true},
    PhaseRow{Phase::kIndexing, "updating orders and search", "steps", false},
    PhaseRow{Phase::kCopying, "copying", "rows", true},
};

const PhaseRow &rowOf(Phase phase) {
    return kPhases.at(static_cast<std::size_t>(phase));
}

std::string clockText(double seconds) {
    const auto all = static_cast<long long>(std::ceil(seconds));
    std::array<char, 32> text{};
    if (all >= 3600) {
        std::snprintf(text.data(), text.size(), "%lld:%02lld:%02lld", all / 3600, all / 60 % 60,
                      all % 60);
    } else {
        std::snprintf(text.data(), text.size(), "%lld:%02lld", all / 60, all % 60);
    }
    return text.data();
}

bool isSet(const char *variable) {
    const char *value = std::getenv(variable);
    return value != nullptr && *value != '\0';
}

std::size_t terminalWidth() {
    winsize size = {};
    if (ioctl(STDERR_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col > 0) {
        return size.ws_col;
    }
    return kDefaultWidth;
}

}  // namespace

std::string progressText(const PhaseState &state) {
    const auto &row = rowOf(state.phase);
    std::string text(row.name);
    text += ": " + std::to_string(state.done);
    if (state.total > 0) {
        text += " of " + std::to_string(state.total);
    }
    text += " " + std::string(row.unit);
    if (!row.hasRate || state.seconds < kRateSeconds || state.done == 0) {
        return text;
    }
    const double rate = static_cast<double>(state.done) / state.seconds;
    text += ", " + std::to_string(std::llround(rate)) + " ";
    text.append(row.unit).append("/s");
    if (state.total > state.done) {
        text += ", " + clockText(static_cast<double>(state.total - state.done) / rate) + " left";
    }
    return text;
}

std::string progressBar(const PhaseState &state, std::size_t width, bool hasColour) {
    auto text = progressText(state);
    const std::size_t around = 3;  // brackets and a blank
    if (state.total <= 0 || text.size() + around + kNarrowestBar > width) {
        return text.substr(0, width);
    }
    const auto size = std::min(kWidestBar, width - text.size() - around);
    const auto part = static_cast<double>(state.done) / static_cast<double>(state.total);
    const auto filled = static_cast<std::size_t>(static_cast<double>(size) * std::min(part, 1.0));
    const std::string_view on = hasColour ? "\033[32m" : "";
    const std::string_view off = hasColour ? "\033[0m" : "";
    std::string bar = "[";
    bar.append(on).append(filled, '=').append(off).append(size - filled, ' ').append("] ");
    return bar + text;
}

ProgressStyle styleForStandardError() {
    const char *terminal = std::getenv("TERM");
    const bool isDumb = terminal == nullptr || std::string_view(terminal) == "dumb";
    return isatty(STDERR_FILENO) != 0 && !isDumb ? ProgressStyle::kBar : ProgressStyle::kLines;
}

Progress::Progress(ProgressStyle style)
    : style_(style),
      hasColour_(!isSet("NO_COLOR")),
      phaseStart_(Clock::now()),
      lastShown_(phaseStart_),
      interval_(style == ProgressStyle::kBar ? kBarInterval : kLineInterval) {}

void Progress::show(Phase phase, std::int64_t done, std::int64_t total) {
    if (style_ == ProgressStyle::kNone) {
        return;
    }
    const auto now = Clock::now();
    if (phase != state_.phase || done < state_.done) {
        phaseStart_ = now;
    }
    state_ = {phase, done, total, std::chrono::duration<double>(now - phaseStart_).count()};
    if (now - lastShown_ < interval_) {
        return;
    }
    lastShown_ = now;
    if (style_ == ProgressStyle::kLines) {
        message(progressText(state_));
        return;
    }
    // The last column stays free: some terminals begin a new line there.
    std::fprintf(stderr, "\r\033[K%s",
                 progressBar(state_, terminalWidth() - 1, hasColour_).c_str());
    isBarShown_ = true;
}

void Progress::clear() {
    if (std::exchange(isBarShown_, false)) {
        std::fputs("\r\033[K", stderr);
    }
}

void Progress::message(std::string_view text) {
    clear();
    std::fprintf(stderr, "zanoindex: %.*s\n", static_cast<int>(text.size()), text.data());
}

}  // namespace zano::index
