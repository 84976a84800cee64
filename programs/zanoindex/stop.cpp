#include "stop.h"

#include <sys/eventfd.h>
#include <unistd.h>
#include <array>
#include <atomic>
#include <cerrno>
#include <csignal>
#include <cstdint>
#include <system_error>

namespace zano::index {
namespace {

constexpr std::array kSignals = {SIGINT, SIGTERM, SIGHUP};

std::atomic<int> noted = 0;
std::atomic<int> event = -1;
static_assert(std::atomic<int>::is_always_lock_free);

extern "C" void noteStop(int signal) {
    int none = 0;
    if (!noted.compare_exchange_strong(none, signal)) {
        _exit(128 + signal);
    }
    const int before = errno;
    const std::uint64_t one = 1;
    [[maybe_unused]] const auto written = write(event, &one, sizeof one);
    errno = before;
}

}  // namespace

StopRequest::StopRequest() {
    if (event < 0) {
        event = eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
    }
    if (event < 0) {
        throw std::system_error(errno, std::generic_category(), "preparing for Ctrl-C");
    }
    for (const int number : kSignals) {
        struct sigaction action = {};
        sigaction(number, nullptr, &action);
        if (action.sa_handler != SIG_IGN) {
            action = {};
            action.sa_handler = noteStop;
            action.sa_flags = SA_RESTART;  // what waits with poll() is woken all the same
            sigaction(number, &action, nullptr);
        }
    }
}

int StopRequest::signal() const {
    return noted;
}

int StopRequest::descriptor() const {
    return event;
}

}  // namespace zano::index
