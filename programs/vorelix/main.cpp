/* The command line of the music library. */
#include <syslog.h>
#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <iostream>

#include "commands.h"
#include "failure.h"
#include "options.h"

namespace {

using vorelix::ExitCode;

ExitCode complain(const std::string &text) {
    std::cerr << "vorelix: " << text << '\n';
    return vorelix::kFailed;
}

/* A full disk is seen only when everything was handed over. */
void writeOut(const std::string &text) {
    if (std::fwrite(text.data(), 1, text.size(), stdout) != text.size() ||
        std::fflush(stdout) != 0) {
        throw vorelix::Failure(std::string("could not write the answer: ") + std::strerror(errno));
    }
}

ExitCode run(const vorelix::Request &request) {
    if (request.verbose) {
        openlog("vorelix", LOG_PERROR, LOG_USER);
    }
    const vorelix::Outcome outcome =
        request.command->run(request, vorelix::terminalOfStandardOutput());
    writeOut(outcome.text);
    return outcome.complaint.empty() ? vorelix::kSuccess : complain(outcome.complaint);
}

}  // namespace

int main(int argc, char **argv) {
    // A reader that has seen enough (head) ends the program quietly, whatever was inherited.
    std::signal(SIGPIPE, SIG_DFL);
    // A limit of file sizes is a failed write, which is cleaned up after.
    std::signal(SIGXFSZ, SIG_IGN);
    try {
        const auto parsed = vorelix::parseCommandLine(argc, argv, vorelix::allCommands());
        const auto *request = std::get_if<vorelix::Request>(&parsed);
        return request != nullptr ? run(*request) : std::get<ExitCode>(parsed);
    } catch (const vorelix::Failure &failure) {
        return complain(failure.what());
    } catch (const std::exception &error) {
        return complain(std::string("stopped: ") + error.what());
    }
}
