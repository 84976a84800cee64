#include "support/program.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <pty.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <csignal>
#include <filesystem>
#include <utility>

#include <linux/capability.h>

#include "support/loopback.h"

namespace program {
namespace {

constexpr int kPatienceMs = 60'000;

/* Without a name, so that it is gone with the last descriptor. */
int temporaryFile() {
    return open(std::filesystem::temp_directory_path().c_str(), O_TMPFILE | O_RDWR | O_CLOEXEC,
                0600);
}

std::string readAll(int descriptor) {
    std::string text;
    std::array<char, 4096> bytes;
    for (ssize_t count = 0; (count = read(descriptor, bytes.data(), bytes.size())) > 0;) {
        text.append(bytes.data(), static_cast<std::size_t>(count));
    }
    return text;
}

/* The end that a program writes to, and the one to read from. */
struct Ends {
    int written;
    int read;
};

Ends openStream(Stream stream, unsigned short columns) {
    std::array<int, 2> ends{-1, -1};
    const winsize size = {24, columns, 0, 0};
    switch (stream) {
        case Stream::Terminal:
            EXPECT_EQ(openpty(&ends[0], &ends[1], nullptr, nullptr, &size), 0);
            fcntl(ends[0], F_SETFD, FD_CLOEXEC);
            fcntl(ends[1], F_SETFD, FD_CLOEXEC);
            break;
        case Stream::ClosedPipe:
            EXPECT_EQ(pipe2(ends.data(), O_CLOEXEC), 0);
            close(std::exchange(ends[0], open("/dev/null", O_RDONLY | O_CLOEXEC)));
            break;
        case Stream::Kept:
            EXPECT_EQ(pipe2(ends.data(), O_CLOEXEC), 0);
            break;
        default:
            ends = {open("/dev/null", O_RDONLY | O_CLOEXEC),
                    open(stream == Stream::Full ? "/dev/full" : "/dev/null", O_WRONLY | O_CLOEXEC)};
    }
    return {ends[1], ends[0]};
}

/* Errors are kept in a file, since nobody reads them before the end. */
Ends openErrors(const Start &start) {
    if (start.errors != Stream::Kept) {
        return openStream(start.errors, start.columns);
    }
    const int file = temporaryFile();
    return {dup(file), file};
}

std::vector<char *> pointersTo(std::vector<std::string> &texts) {
    std::vector<char *> pointers;
    pointers.reserve(texts.size() + 1);
    for (std::string &text : texts) {
        pointers.push_back(text.data());
    }
    pointers.push_back(nullptr);
    return pointers;
}

/* At its start, for a program to read. */
int inputOf(const std::string &text) {
    const int file = temporaryFile();
    EXPECT_EQ(write(file, text.data(), text.size()), static_cast<ssize_t>(text.size()));
    lseek(file, 0, SEEK_SET);
    return file;
}

/* In the child. */
[[noreturn]] void become(const Start &start, int output, int errors) {
    for (const int signal : {SIGINT, SIGTERM, SIGHUP}) {
        std::signal(signal, SIG_DFL);
    }
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    std::signal(SIGPIPE, SIG_IGN);  // as some callers leave it
    if (!start.mayReadEverything && geteuid() == 0 &&
        (prctl(PR_CAPBSET_DROP, CAP_DAC_OVERRIDE) != 0 ||
         prctl(PR_CAPBSET_DROP, CAP_DAC_READ_SEARCH) != 0)) {
        _exit(99);
    }
    dup2(inputOf(start.input), STDIN_FILENO);
    if (start.fileSizeLimit > 0) {
        const rlimit limit{start.fileSizeLimit, start.fileSizeLimit};
        setrlimit(RLIMIT_FSIZE, &limit);
    }
    dup2(output, STDOUT_FILENO);
    dup2(errors, STDERR_FILENO);
    std::vector<std::string> words = start.argv;
    std::vector<std::string> variables;
    if (start.environment) {
        for (const auto &[name, value] : *start.environment) {
            variables.push_back(name);
            variables.back().append("=").append(value);
        }
    }
    execve(start.path.c_str(), pointersTo(words).data(),
           start.environment ? pointersTo(variables).data() : environ);
    _exit(98);
}

}  // namespace

int freePort() {
    const int file = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    const int port = loopback::bindToFreePort(file);
    close(file);
    return port;
}

Process::Process(const Start &start) : haveErrorsAnEnd_(start.errors != Stream::Kept) {
    const Ends output = openStream(start.output, start.columns);
    const Ends errors = openErrors(start);
    pid_ = fork();
    if (pid_ == 0) {
        become(start, output.written, errors.written);
    }
    EXPECT_GT(pid_, 0);
    close(output.written);
    close(errors.written);
    output_ = output.read;
    errors_ = errors.read;
}

Process::~Process() {
    if (pid_ > 0) {
        kill(pid_, SIGKILL);
        waitpid(pid_, nullptr, 0);
    }
    close(output_);
    close(errors_);
}

bool Process::readMore() {
    pollfd source = {output_, POLLIN, 0};
    if (poll(&source, 1, kPatienceMs) <= 0) {
        ADD_FAILURE() << "nothing was printed for a minute; up to then:\n" << out_;
        return false;
    }
    std::array<char, 4096> bytes;
    const auto count = read(output_, bytes.data(), bytes.size());
    if (count > 0) {
        out_.append(bytes.data(), static_cast<std::size_t>(count));
    }
    return count > 0;
}

std::string Process::readLine() {
    while (out_.find('\n') == std::string::npos) {
        if (!readMore()) {
            ADD_FAILURE() << "no line: " << wait().err;
            return {};
        }
    }
    auto line = out_.substr(0, out_.find('\n'));
    out_.erase(0, line.size() + 1);
    return line;
}

Ended Process::wait() {
    Ended ended{};
    while (readMore()) {
    }
    ended.out = out_;
    if (haveErrorsAnEnd_) {
        ended.err = readAll(errors_);
    }
    ended.status = statusOf(release());
    if (!haveErrorsAnEnd_) {
        lseek(errors_, 0, SEEK_SET);
        ended.err = readAll(errors_);
    }
    rusage usage = {};
    getrusage(RUSAGE_CHILDREN, &usage);
    ended.peakKilobytes = usage.ru_maxrss;
    return ended;
}

Ended Process::stop(int signal) {
    kill(pid_, signal);
    return wait();
}

bool Process::isRunning() const {
    siginfo_t ended{};
    return waitid(P_PID, static_cast<id_t>(pid_), &ended, WEXITED | WNOHANG | WNOWAIT) == 0 &&
           ended.si_pid == 0;
}

pid_t Process::release() {
    return std::exchange(pid_, -1);
}

}  // namespace program
