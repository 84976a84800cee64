#include "reader_process.h"

#include <spawn.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <array>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <ctime>
#include <new>
#include <system_error>

#include "text.h"

namespace zano::index {
namespace {

/* The program by what it is and not by where it stood: an update may have replaced the file. */
constexpr const char *kThisProgram = "/proc/self/exe";

constexpr std::size_t kReceiveBytes = std::size_t{64} << 10U;

void check(int error, const char *what) {
    if (error != 0) {
        throw std::system_error(error, std::generic_category(), what);
    }
}

struct SpawnSettings {
    posix_spawn_file_actions_t actions{};
    posix_spawnattr_t attributes{};

    explicit SpawnSettings(int standardInput) {
        check(posix_spawn_file_actions_init(&actions), "starting a tag reader");
        check(posix_spawnattr_init(&attributes), "starting a tag reader");
        check(posix_spawn_file_actions_adddup2(&actions, standardInput, STDIN_FILENO),
              "starting a tag reader");
        // Ctrl-C goes to every process of the terminal, but only the indexer may act on it.
        sigset_t blocked;
        sigemptyset(&blocked);
        for (const int signal : {SIGINT, SIGTERM, SIGHUP}) {
            sigaddset(&blocked, signal);
        }
        check(posix_spawnattr_setsigmask(&attributes, &blocked), "starting a tag reader");
        check(posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSIGMASK),
              "starting a tag reader");
    }
    SpawnSettings(const SpawnSettings &) = delete;
    SpawnSettings &operator=(const SpawnSettings &) = delete;
    ~SpawnSettings() {
        posix_spawn_file_actions_destroy(&actions);
        posix_spawnattr_destroy(&attributes);
    }
};

pid_t spawnReader(int standardInput) {
    const SpawnSettings settings(standardInput);
    std::string name = "zanoindex";
    std::string argument(kReaderArgument);
    std::array<char *, 3> arguments = {name.data(), argument.data(), nullptr};
    pid_t pid = -1;
    check(posix_spawn(&pid, kThisProgram, &settings.actions, &settings.attributes, arguments.data(),
                      environ),
          "starting a tag reader");
    return pid;
}

/* A process that waits for a disk that is gone does not die before the disk is back, so there
 * is an end to the waiting; the system collects what is left when the indexer ends. */
bool reap(pid_t pid, int *status) {
    constexpr int kTries = 200;
    const timespec pause = {0, 5'000'000};
    for (int i = 0; i < kTries; ++i) {
        if (waitpid(pid, status, WNOHANG) == pid) {
            return true;
        }
        nanosleep(&pause, nullptr);
    }
    return false;
}

}  // namespace

ReaderProcess::ReaderProcess() {
    std::array<int, 2> ends{};
    if (socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends.data()) != 0) {
        check(errno, "starting a tag reader");
    }
    socket_ = Descriptor(ends[0]);
    const Descriptor theirs(ends[1]);
    pid_ = spawnReader(theirs.get());
}

ReaderProcess::~ReaderProcess() {
    if (pid_ > 0) {
        int status = 0;
        kill(pid_, SIGKILL);
        reap(pid_, &status);
    }
}

void ReaderProcess::send() {
    while (!unsent_.empty()) {
        const auto count =
            ::send(socket_.get(), unsent_.data(), unsent_.size(), MSG_DONTWAIT | MSG_NOSIGNAL);
        if (count <= 0) {
            return;  // full, or the process is dead, which receive() finds out
        }
        unsent_.erase(0, static_cast<std::size_t>(count));
    }
}

bool ReaderProcess::receive() {
    std::array<char, kReceiveBytes> bytes;
    const auto count = recv(socket_.get(), bytes.data(), bytes.size(), MSG_DONTWAIT);
    if (count > 0) {
        frames_.add(bytes.data(), static_cast<std::size_t>(count));
        return true;
    }
    return count < 0 && (errno == EAGAIN || errno == EINTR);
}

std::chrono::nanoseconds ReaderProcess::processorTime() const {
    clockid_t clock{};
    timespec time{};
    if (clock_getcpuclockid(pid_, &clock) != 0 || clock_gettime(clock, &time) != 0) {
        return {};
    }
    return std::chrono::seconds(time.tv_sec) + std::chrono::nanoseconds(time.tv_nsec);
}

ReadAnswer ReaderProcess::end() {
    socket_ = Descriptor();
    const pid_t pid = std::exchange(pid_, -1);
    int status = 0;
    if (!reap(pid, &status)) {
        kill(pid, SIGKILL);
        return {ReadStatus::kNoAnswer, {}, {}};
    }
    if (!WIFSIGNALED(status)) {
        return {ReadStatus::kCrashed, "exit code " + std::to_string(WEXITSTATUS(status)), {}};
    }
    if (WTERMSIG(status) == SIGKILL) {
        return {ReadStatus::kKilled, "is the machine out of memory?", {}};
    }
    return {ReadStatus::kCrashed, strsignal(WTERMSIG(status)), {}};
}

}  // namespace zano::index
