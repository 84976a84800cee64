#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>
#include <vorelix/misc/misc.h>

#include <cerrno>
#include <csignal>

namespace {

/* While it lives, ended children of the process leave a status. It changes the action of the
 * whole process, so one thread at a time may have one. */
class ChildStatusKept {
  public:
    ChildStatusKept() {
        struct sigaction action {};
        sigaction(SIGCHLD, nullptr, &action);
        wasDiscarded_ = (action.sa_flags & SA_NOCLDWAIT) != 0;
        action.sa_flags &= ~SA_NOCLDWAIT;
        sigaction(SIGCHLD, &action, nullptr);
    }
    ~ChildStatusKept() {
        if (wasDiscarded_) {
            // Read anew: the action itself may have been changed in the meantime.
            struct sigaction action {};
            sigaction(SIGCHLD, nullptr, &action);
            action.sa_flags |= SA_NOCLDWAIT;
            sigaction(SIGCHLD, &action, nullptr);
        }
    }
    ChildStatusKept(const ChildStatusKept &) = delete;
    ChildStatusKept &operator=(const ChildStatusKept &) = delete;

  private:
    bool wasDiscarded_;
};

[[noreturn]] void runProgram(const char *program, char *const argv[]) {
    const int null = open("/dev/null", O_RDWR);
    if (null != -1) {
        dup2(null, STDIN_FILENO);
        dup2(null, STDOUT_FILENO);
        dup2(null, STDERR_FILENO);
        if (null > STDERR_FILENO) {
            close(null);
        }
    }
    execv(program, argv);
    // Not exit(): the output that the caller has buffered is the caller's to write.
    _exit(-1);
}

int exitStatusOf(pid_t child) {
    int status = 0;
    pid_t ended = -1;
    do {
        ended = waitpid(child, &status, 0);
    } while (ended == -1 && errno == EINTR);
    return ended != -1 && WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

}  // namespace

int ZANOExec(const char *program, char *const argv[], int wait) {
    const ChildStatusKept kept;
    const pid_t child = fork();
    if (child == 0) {
        runProgram(program, argv);
    }
    if (child == -1) {
        return -1;
    }
    return wait != 0 ? exitStatusOf(child) : 0;
}
