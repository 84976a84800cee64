#include "child_process.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <chrono>
#include <csignal>
#include <system_error>

#include "descriptor_internal.h"

namespace vorelix {

namespace {

using Clock = std::chrono::steady_clock;

constexpr std::size_t kMostAnswer = std::size_t{256} << 20U;

/* A sanitizer has a map of all memory there could be, and this would leave no room for it. */
#ifdef VORELIX_SANITIZED
constexpr rlim_t kMostMemory = RLIM_INFINITY;
#else
constexpr rlim_t kMostMemory = rlim_t{512} << 20U;
#endif

/* The messages of libraries about what strangers sent would stand among those for the user. */
void silence() {
    const int nowhere = open("/dev/null", O_RDWR | O_CLOEXEC);
    if (nowhere >= 0) {
        dup2(nowhere, STDIN_FILENO);
        dup2(nowhere, STDOUT_FILENO);
        dup2(nowhere, STDERR_FILENO);
    }
}

[[noreturn]] void work(const std::function<void(int)> &task, int pipe, pid_t parent) {
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    int status = 1;
    if (getppid() == parent) {
        silence();
        const rlimit limit{kMostMemory, kMostMemory};
        setrlimit(RLIMIT_AS, &limit);
        try {
            task(pipe);
            status = 0;
        } catch (const std::exception &) {
            // As memory that ran out; the status tells.
        }
    }
    _exit(status);
}

/* A child that is ended and waited for, whatever happens. */
class Child {
  public:
    explicit Child(pid_t pid) : pid_(pid) {}
    ~Child() {
        if (pid_ > 0) {
            kill(pid_, SIGKILL);
            finished();
        }
    }
    Child(const Child &) = delete;
    Child &operator=(const Child &) = delete;

    bool finished() {
        int status = 0;
        while (waitpid(pid_, &status, 0) < 0 && errno == EINTR) {
        }
        pid_ = -1;
        return WIFEXITED(status) && WEXITSTATUS(status) == 0;
    }

  private:
    pid_t pid_;
};

/* False when the time was over first. */
bool readAll(int pipe, Clock::time_point end, std::string &text) {
    std::array<char, 65536> part;
    while (text.size() < kMostAnswer) {
        const auto left = std::chrono::ceil<std::chrono::milliseconds>(end - Clock::now()).count();
        pollfd file{pipe, POLLIN, 0};
        if (left <= 0 || poll(&file, 1, static_cast<int>(left)) == 0) {
            return false;
        }
        const ssize_t got = read(pipe, part.data(), part.size());
        if (got == 0) {
            return true;
        }
        text.append(part.data(), static_cast<std::size_t>(std::max<ssize_t>(got, 0)));
    }
    return false;
}

}  // namespace

ChildAnswer runInChild(const std::function<void(int pipe)> &task, int timeoutMs) {
    std::array<int, 2> ends{};
    if (pipe2(ends.data(), O_CLOEXEC) != 0) {
        throw std::system_error(errno, std::generic_category(), "asking a server");
    }
    const Descriptor readEnd(ends[0]);
    const pid_t parent = getpid();
    const pid_t pid = fork();
    if (pid == 0) {
        close(ends[0]);
        work(task, ends[1], parent);
    }
    close(ends[1]);
    if (pid < 0) {
        throw std::system_error(errno, std::generic_category(), "asking a server");
    }
    Child child(pid);
    ChildAnswer answer;
    const bool isInTime =
        readAll(readEnd.number(), Clock::now() + std::chrono::milliseconds(timeoutMs), answer.text);
    if (!isInTime) {
        answer.end = ChildAnswer::End::TooLate;
    } else if (child.finished()) {
        answer.end = ChildAnswer::End::Finished;
    }
    return answer;
}

bool writeWhole(int file, const std::string &text) {
    for (std::size_t done = 0; done < text.size();) {
        const ssize_t count = write(file, text.data() + done, text.size() - done);
        if (count < 0 && errno != EINTR) {
            return false;
        }
        done += static_cast<std::size_t>(std::max<ssize_t>(count, 0));
    }
    return true;
}

}  // namespace vorelix
