/* Programs that tests run as a shell would, and what becomes of them. */
#pragma once

#include <sys/types.h>

#include <map>
#include <optional>
#include <string>
#include <vector>

#include "support/process.h"

namespace program {

using process::statusOf;

/* A port of the loopback interface on which nobody listens. */
int freePort();

struct Ended {
    int status;  // exit code, or 128 and the number of the signal
    std::string out;
    std::string err;
    long peakKilobytes = 0;  // of the largest of all processes up to now
};

/* What standard output or standard error of a program is. */
enum class Stream { Kept, Terminal, ClosedPipe, Full, Nowhere };

struct Start {
    std::string path;
    std::vector<std::string> argv;  // with the name that the program sees as its own
    std::optional<std::map<std::string, std::string>> environment = {};  // else the test's
    Stream output = Stream::Kept;
    Stream errors = Stream::Kept;
    unsigned short columns = 60;  // of the terminal
    std::string input = {};
    unsigned long fileSizeLimit = 0;  // in bytes, as of a full disk; 0: none
    bool mayReadEverything = true;    // as root may
};

/* A process; killed if it is still there at the end, or when its test has died. */
class Process {
  public:
    explicit Process(const Start &start);
    Process(const Process &) = delete;
    Process &operator=(const Process &) = delete;
    ~Process();

    pid_t pid() const { return pid_; }
    /* For poll(): hung up when the process has ended. */
    int output() const { return output_; }
    /* The next line of standard output; fails the test when none comes within a minute. */
    std::string readLine();
    Ended wait();
    /* Sends a signal and waits. */
    Ended stop(int signal);
    bool isRunning() const;
    /* Leaves the process to the caller. */
    pid_t release();

  private:
    bool readMore();

    pid_t pid_;
    int output_;
    int errors_;
    bool haveErrorsAnEnd_;  // as those of a terminal, that ends with its last writer
    std::string out_;
};

}  // namespace program
