#include "command_line.h"

#include <fcntl.h>
#include <json/reader.h>
#include <pty.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <cstdlib>
#include <fstream>
#include <iterator>
#include <sstream>

#include "platform/mediadb/cluster.h"
#include "system_paths_internal.h"

namespace command_line {

namespace {

namespace fs = std::filesystem;

/* Without a name, so that it is gone with the last descriptor. */
int temporaryFile() {
    return open(fs::temp_directory_path().c_str(), O_TMPFILE | O_RDWR, 0600);
}

std::string readAll(int descriptor) {
    std::string text;
    char buffer[4096];
    ssize_t got = 0;
    while ((got = read(descriptor, buffer, sizeof buffer)) > 0) {
        text.append(buffer, static_cast<size_t>(got));
    }
    return text;
}

std::string wholeFile(int descriptor) {
    lseek(descriptor, 0, SEEK_SET);
    std::string text = readAll(descriptor);
    close(descriptor);
    return text;
}

/* The end that the program writes to, and the one to read from; -1: nothing to read. */
struct Ends {
    int written;
    int read;
};

Ends openOutput(const Invocation &invocation) {
    int ends[2] = {-1, -1};
    winsize size{};
    size.ws_col = invocation.columns;
    switch (invocation.output) {
        case Output::File:
            return {temporaryFile(), -1};
        case Output::Full:
            return {open("/dev/full", O_WRONLY), -1};
        case Output::ClosedPipe:
            EXPECT_EQ(pipe(ends), 0);
            close(ends[0]);
            return {ends[1], -1};
        case Output::Terminal:
            EXPECT_EQ(openpty(&ends[0], &ends[1], nullptr, nullptr, &size), 0);
            return {ends[1], ends[0]};
    }
    return {-1, -1};
}

std::vector<char *> pointersTo(std::vector<std::string> &texts) {
    std::vector<char *> pointers;
    for (std::string &text : texts) {
        pointers.push_back(text.data());
    }
    pointers.push_back(nullptr);
    return pointers;
}

/* At its start, for a program to read. */
int inputOf(const std::string &text) {
    const int descriptor = temporaryFile();
    EXPECT_EQ(write(descriptor, text.data(), text.size()), static_cast<ssize_t>(text.size()));
    lseek(descriptor, 0, SEEK_SET);
    return descriptor;
}

[[noreturn]] void become(const Invocation &invocation, int out, int err) {
    std::vector<std::string> words = {"vorelix"};
    words.insert(words.end(), invocation.arguments.begin(), invocation.arguments.end());
    std::vector<std::string> variables;
    for (const auto &[name, value] : invocation.environment) {
        variables.push_back(name + "=" + value);
    }
    dup2(inputOf(invocation.input), STDIN_FILENO);
    if (invocation.fileSizeLimit > 0) {
        const rlimit limit{invocation.fileSizeLimit, invocation.fileSizeLimit};
        setrlimit(RLIMIT_FSIZE, &limit);
    }
    dup2(out, STDOUT_FILENO);
    dup2(err, STDERR_FILENO);
    std::signal(SIGPIPE, SIG_IGN);  // as some callers leave it
    execve(VORELIX_PROGRAM, pointersTo(words).data(), pointersTo(variables).data());
    _exit(127);
}

}  // namespace

Ended run(const Invocation &invocation) {
    const Ends output = openOutput(invocation);
    const int errors = temporaryFile();
    const pid_t child = fork();
    if (child == 0) {
        become(invocation, output.written, errors);
    }
    Ended ended{};
    if (output.read >= 0) {  // the terminal ends when its last writer does
        close(output.written);
        ended.out = readAll(output.read);
        close(output.read);
    }
    ended.status = statusOf(child);
    if (invocation.output == Output::File) {
        ended.out = wholeFile(output.written);
    } else if (output.read < 0) {
        close(output.written);
    }
    ended.err = wholeFile(errors);
    return ended;
}

pid_t start(const Invocation &invocation) {
    const pid_t child = fork();
    if (child == 0) {
        const int nowhere = open("/dev/null", O_WRONLY);
        become(invocation, nowhere, nowhere);
    }
    return child;
}

int statusOf(pid_t child) {
    int status = 0;
    EXPECT_EQ(waitpid(child, &status, 0), child);
    return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
}

CommandLine::CommandLine() {
    std::string name = fs::temp_directory_path() / "vorelix-test-XXXXXX";
    folder_ = mkdtemp(name.data());
    database_ = folder_ / "media.db";
    fs::create_directories(fs::path(ZANO_PATH_CONF).parent_path());
    location_ = zano::mediadb::locationForTest(database_);
    std::ofstream(ZANO_PATH_CONF) << "mediadb=\"" << location_ << "\"\n";
}

CommandLine::~CommandLine() {
    std::error_code ignored;
    fs::remove(ZANO_PATH_CONF, ignored);
    fs::remove_all(folder_, ignored);
}

void CommandLine::fill(const std::vector<zano::mediadb::Song> &songs) const {
    const auto catalogue = zano::mediadb::openCatalogue(location_);
    catalogue->begin();
    for (const auto &song : songs) {
        catalogue->putSong(song);
    }
    catalogue->commit();
    catalogue->finish({});
}

Json::Value CommandLine::answerOf(std::vector<std::string> arguments) {
    arguments.emplace_back("--json");
    const Ended ended = run({arguments});
    EXPECT_EQ(ended.err, "");
    std::istringstream text(ended.out);
    Json::Value answer;
    std::string errors;
    EXPECT_TRUE(Json::parseFromStream(Json::CharReaderBuilder(), text, &answer, &errors))
        << errors << ended.out;
    return answer;
}

}  // namespace command_line
