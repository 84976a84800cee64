#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <unistd.h>
#include <array>
#include <cerrno>
#include <csignal>
#include <new>
#include <system_error>

#include "reader_process.h"
#include "text.h"

#if defined(__SANITIZE_ADDRESS__)
#define ZANOINDEX_ADDRESS_SANITIZER 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
#define ZANOINDEX_ADDRESS_SANITIZER 1
#endif
#endif

#ifdef ZANOINDEX_ADDRESS_SANITIZER
/* The sanitizer reserves terabytes of addresses, so no limit of the system can be set under it;
 * it has limits of its own. */
extern "C" __attribute__((visibility("default"))) const char *__asan_default_options();
extern "C" const char *__asan_default_options() {
    return "max_allocation_size_mb=512:hard_rss_limit_mb=600";
}
#endif

namespace zano::index {
namespace {

void limit(int resource, rlim_t value) {
    const rlimit limits = {value, value};
    if (setrlimit(static_cast<__rlimit_resource>(resource), &limits) != 0) {
        throw std::system_error(errno, std::generic_category(), "limiting the tag reader");
    }
}

/* Dies with the indexer, leaves no core file, and keeps to its memory. */
void limitProcess([[maybe_unused]] const ReaderLimits &limits) {
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    limit(RLIMIT_CORE, 0);
#ifndef ZANOINDEX_ADDRESS_SANITIZER
    limit(RLIMIT_AS, limits.memoryBytes);
#endif
}

void sendFrame(std::string_view content) {
    std::string frame;
    appendFrame(frame, content);
    std::string_view rest = frame;
    while (!rest.empty()) {
        const auto count = send(STDIN_FILENO, rest.data(), rest.size(), MSG_NOSIGNAL);
        if (count < 0 && errno != EINTR) {
            throw std::system_error(errno, std::generic_category(), "answering the indexer");
        }
        rest.remove_prefix(count < 0 ? 0 : static_cast<std::size_t>(count));
    }
}

ReadAnswer readGuarded(TagReader reader, const std::string &path) {
    try {
        return reader(path);
    } catch (const std::bad_alloc &) {
        return {ReadStatus::kOutOfMemory, {}, {}};
    } catch (const std::exception &error) {
        return {ReadStatus::kCrashed, storableText(error.what()), {}};
    }
}

/* false when the process is not to be used any more: what was thrown through the tag library
 * has left memory behind. */
bool answerRequest(TagReader reader, std::string_view path) {
    const auto answer = readGuarded(reader, std::string(path));
    sendFrame(encodeAnswer(answer));
    return !isFaultOfFile(answer.status);
}

bool answerAll(TagReader reader, FrameReader &frames) {
    while (const auto path = frames.next()) {
        if (!answerRequest(reader, *path)) {
            return false;
        }
    }
    return true;
}

}  // namespace

int serveTags(TagReader reader, const ReaderLimits &limits) {
    limitProcess(limits);
    sendFrame(kReaderGreeting);
    FrameReader frames;
    std::array<char, std::size_t{16} << 10U> bytes{};
    while (answerAll(reader, frames)) {
        const auto count = recv(STDIN_FILENO, bytes.data(), bytes.size(), 0);
        if (count == 0 || (count < 0 && errno != EINTR)) {
            return 0;
        }
        frames.add(bytes.data(), count < 0 ? 0 : static_cast<std::size_t>(count));
    }
    return 1;
}

}  // namespace zano::index
