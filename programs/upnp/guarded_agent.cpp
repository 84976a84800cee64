#include "guarded_agent.h"

#include <fcntl.h>
#include <sys/syscall.h>
#include <sys/time.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <charconv>
#include <csignal>
#include <cstring>
#include <iterator>
#include <string_view>
#include <system_error>

namespace vorelix {

namespace {

constexpr std::string_view kMark = "late ";
constexpr unsigned int kMostStart = 400;
constexpr int kMostLooks = 40;
constexpr int kNextLookMs = 10;
constexpr suseconds_t kTickUs = 100'000;
constexpr int kPerSecond = 1000;

/* In the place of an "&" that holds the decoder up: no XML has this byte. */
constexpr char kStandIn = '\x01';

/* What the handlers of signals see. */
struct Guarded {
    DMAgent *agent = nullptr;
    int pipe = -1;
    unsigned int size = 0;
    bool isFreed = false;
    std::array<int, 2> look{-1, -1};  // a pipe from this process to itself
    std::array<char, kMostStart> start{};
    std::size_t startSize = 0;
    int looks = 0;
};
Guarded guarded;

bool isDecoded(const char *text) {
    constexpr std::string_view kEntities[] = {"&apos;", "&quot;", "&nbsp;",
                                              "&lt;",   "&gt;",   "&amp;"};
    return std::any_of(std::begin(kEntities), std::end(kEntities), [&](std::string_view entity) {
        return std::strncmp(text, entity.data(), entity.size()) == 0;
    });
}

/* The decoder looks at the byte that holds it up again and again, so it goes on when another one
 * stands there. What it has written already is put right afterwards too. */
void freeDecoder() {
    char *const end = guarded.agent->response + guarded.agent->responseSize;
    for (char *place = guarded.agent->response; place != end; ++place) {
        if (*place == '&' && !isDecoded(place)) {
            *place = kStandIn;
        }
    }
    guarded.isFreed = true;
}

void handle(int signal, void (*handler)(int)) {
    struct sigaction action {};
    action.sa_handler = handler;
    action.sa_flags = SA_RESTART;
    sigfillset(&action.sa_mask);
    sigaction(signal, &action, nullptr);
}

void startTimer(__itimer_which_t which, suseconds_t everyUs, int onceMs) {
    const suseconds_t once = onceMs % kPerSecond;
    const itimerval timer{{0, everyUs}, {onceMs / kPerSecond, everyUs + once * kPerSecond}};
    setitimer(which, &timer, nullptr);
}

void put(const char *bytes, std::size_t count) {
    [[maybe_unused]] const ssize_t written = write(guarded.pipe, bytes, count);
}

/* The buffer may be on the move, so the system alone takes from it, which refuses an address that
 * is none any more. */
std::size_t takeStart(std::array<char, kMostStart> &start) {
    syscall(SYS_write, guarded.look[1], guarded.agent->response,
            std::min(guarded.agent->responseSize, kMostStart));
    return static_cast<std::size_t>(
        std::max<ssize_t>(read(guarded.look[0], start.data(), start.size()), 0));
}

void report() {
    std::array<char, 16> number{};
    const auto end =
        std::to_chars(number.data(), number.data() + number.size() - 1, guarded.agent->responseSize)
            .ptr;
    *end = ' ';
    put(kMark.data(), kMark.size());
    put(number.data(), static_cast<std::size_t>(end + 1 - number.data()));
    put(guarded.start.data(), guarded.startSize);
    _exit(0);
}

/* The start of an answer does not change, so what is seen twice was not taken from a buffer that
 * had been given back. */
void onLate(int) {
    std::array<char, kMostStart> start{};
    const std::size_t size = takeStart(start);
    if (guarded.looks++ > 0 && size == guarded.startSize && start == guarded.start) {
        report();
    }
    guarded.start = start;
    guarded.startSize = guarded.looks < kMostLooks ? size : 0;
    if (guarded.looks > kMostLooks) {
        report();
    }
    startTimer(ITIMER_REAL, 0, kNextLookMs);
}

/* Comes after so much time of the processor. Where nothing arrived in one of these while an answer
 * is there, it is the decoder that took it. */
void onTick(int signal) {
    const unsigned int size = guarded.agent->responseSize;
    if (LateAnswer{size, {}}.isTooLarge()) {
        onLate(signal);
    }
    if (size != 0 && size == guarded.size && guarded.agent->response != nullptr) {
        freeDecoder();
    }
    guarded.size = size;
}

}  // namespace

int performGuarded(DMAgent &agent, int pipe, int timeoutMs) {
    guarded = {};
    guarded.agent = &agent;
    guarded.pipe = pipe;
    if (pipe2(guarded.look.data(), O_CLOEXEC | O_NONBLOCK) != 0) {
        throw std::system_error(errno, std::generic_category(), "asking a server");
    }
    handle(SIGALRM, onLate);
    handle(SIGPROF, onTick);
    startTimer(ITIMER_REAL, 0, timeoutMs);
    startTimer(ITIMER_PROF, kTickUs, 0);
    const int result = agent.Perform();
    startTimer(ITIMER_PROF, 0, 0);
    if (guarded.isFreed && agent.response != nullptr) {
        std::replace(agent.response, agent.response + std::strlen(agent.response), kStandIn, '&');
    }
    return result;
}

bool readLateAnswer(const std::string &text, LateAnswer &answer) {
    if (!text.starts_with(kMark)) {
        return false;
    }
    const char *const end = text.data() + text.size();
    const auto number = std::from_chars(text.data() + kMark.size(), end, answer.bytes);
    answer.start.assign(std::min(number.ptr + 1, end), end);
    return true;
}

}  // namespace vorelix
