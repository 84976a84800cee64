#include "guarded_agent.h"

#include <sys/time.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <charconv>
#include <csignal>
#include <cstring>
#include <iterator>
#include <string_view>

namespace vorelix {

namespace {

constexpr std::string_view kMark = "late ";
constexpr unsigned int kMostStart = 400;
constexpr int kMostLooks = 40;
constexpr int kNextLookMs = 10;
constexpr suseconds_t kTickUs = 10'000;
constexpr int kTicksOfALook = 10;
constexpr int kPerSecond = 1000;

/* In the place of an "&" that holds the decoder up: no XML has this byte. */
constexpr char kStandIn = '\x01';

/* What the handlers of signals see. */
struct Guarded {
    DMAgent *agent = nullptr;
    int pipe = -1;
    unsigned int size = 0;
    bool isFreed = false;
    std::array<char, kMostStart> start{};
    std::size_t startSize = 0;
    int looks = 0;
    int ticks = 0;
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

/* false: the buffer is on the move, and there is nothing to see. */
bool takeStart() {
    const char *const response = guarded.agent->response;
    const std::size_t size = std::min(guarded.agent->responseSize, kMostStart);
    if (response == nullptr && size > 0) {
        return false;
    }
    std::copy_n(response, size, guarded.start.data());
    guarded.startSize = size;
    return true;
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

/* Memory that has run out leaves no buffer at all. */
void onLate(int) {
    if (takeStart() || guarded.startSize == kMostStart || ++guarded.looks > kMostLooks) {
        report();
    }
    startTimer(ITIMER_REAL, 0, kNextLookMs);
}

/* Comes after so much time of the processor. A large buffer is nearly always on the move, so its
 * start is taken early. Where nothing arrived in some of these while an answer is there, it is the
 * decoder that took them. */
void onTick(int signal) {
    if (guarded.startSize < kMostStart) {
        takeStart();
    }
    if (++guarded.ticks % kTicksOfALook != 0) {
        return;
    }
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
