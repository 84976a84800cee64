#include "index_test.h"

#include <fcntl.h>
#include <json/reader.h>
#include <poll.h>
#include <pty.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>
#include <array>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <fstream>
#include <iomanip>
#include <memory>
#include <sstream>

#include <linux/capability.h>

#include "mediadb/query/parse.h"
#include "platform/mediadb/cluster.h"

namespace zano::index {
namespace {

constexpr int kPatienceMs = 60'000;

std::string readAll(int fd) {
    std::string text;
    std::array<char, 4096> bytes;
    for (ssize_t count = 0; (count = read(fd, bytes.data(), bytes.size())) > 0;) {
        text.append(bytes.data(), static_cast<std::size_t>(count));
    }
    return text;
}

int temporaryFile() {
    return open("/tmp", O_TMPFILE | O_RDWR | O_CLOEXEC, 0600);
}

/* In the child: the program's signals and streams are those of a shell. */
[[noreturn]] void become(const std::string &program, const std::vector<std::string> &argv,
                         int output, int errors, bool mayReadEverything) {
    for (const int signal : {SIGINT, SIGTERM, SIGHUP}) {
        std::signal(signal, SIG_DFL);
    }
    if (!mayReadEverything && geteuid() == 0 &&
        (prctl(PR_CAPBSET_DROP, CAP_DAC_OVERRIDE) != 0 ||
         prctl(PR_CAPBSET_DROP, CAP_DAC_READ_SEARCH) != 0)) {
        _exit(99);
    }
    dup2(output, STDOUT_FILENO);
    dup2(errors, STDERR_FILENO);
    std::vector<char *> pointers;
    for (const auto &argument : argv) {
        pointers.push_back(const_cast<char *>(argument.c_str()));
    }
    pointers.push_back(nullptr);
    execv(program.c_str(), pointers.data());
    _exit(98);
}

}  // namespace

Process::Process(const std::string &program, const std::vector<std::string> &argv, Errors errors,
                 bool mayReadEverything)
    : isTerminal_(errors == Errors::kTerminal) {
    std::array<int, 2> pipe{};
    EXPECT_EQ(pipe2(pipe.data(), O_CLOEXEC), 0);
    int childErrors = -1;
    if (isTerminal_) {
        const winsize size = {24, 60, 0, 0};
        EXPECT_EQ(openpty(&errors_, &childErrors, nullptr, nullptr, &size), 0);
        fcntl(errors_, F_SETFD, FD_CLOEXEC);
        fcntl(childErrors, F_SETFD, FD_CLOEXEC);
    } else {
        errors_ = temporaryFile();
        childErrors = dup(errors_);
    }
    pid_ = fork();
    if (pid_ == 0) {
        become(program, argv, pipe[1], childErrors, mayReadEverything);
    }
    close(pipe[1]);
    close(childErrors);
    output_ = pipe[0];
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
    const auto line = out_.substr(0, out_.find('\n'));
    out_.erase(0, line.size() + 1);
    return line;
}

Ended Process::wait() {
    Ended ended;
    while (readMore()) {
    }
    ended.out = out_;
    int status = 0;
    if (isTerminal_) {
        ended.err = readAll(errors_);  // ends when the process has
    }
    EXPECT_EQ(waitpid(pid_, &status, 0), pid_);
    pid_ = -1;
    if (!isTerminal_) {
        lseek(errors_, 0, SEEK_SET);
        ended.err = readAll(errors_);
    }
    ended.status = WIFSIGNALED(status) ? 128 + WTERMSIG(status) : WEXITSTATUS(status);
    rusage usage = {};
    getrusage(RUSAGE_CHILDREN, &usage);
    ended.peakKilobytes = usage.ru_maxrss;
    return ended;
}

IndexTest::IndexTest() {
    std::string pattern = (fs::temp_directory_path() / "zanoindex-XXXXXX").string();
    folder_ = fs::canonical(mkdtemp(pattern.data()));
    fs::create_directory(music());
    location_ = mediadb::locationForTest(databaseFile());
}

IndexTest::~IndexTest() {
    fs::remove_all(folder_);
}

std::string IndexTest::sample(const std::string &suffix) {
    return std::string(ZANOINDEX_SAMPLES) + "/sample." + suffix;
}

std::string IndexTest::add(const std::string &name, const std::string &suffix) const {
    const fs::path path = music() + "/" + name;
    fs::create_directories(path.parent_path());
    fs::copy_file(sample(suffix), path, fs::copy_options::overwrite_existing);
    return path;
}

void IndexTest::write(const fs::path &path, const std::string &content) {
    std::ofstream(path, std::ios::binary) << content;
}

std::string IndexTest::contentOf(const fs::path &path) {
    std::stringstream content;
    content << std::ifstream(path, std::ios::binary).rdbuf();
    return content.str();
}

std::vector<std::string> IndexTest::argumentsOf(const std::vector<std::string> &arguments) const {
    std::vector<std::string> all = {"zanoindex", "--database", location()};
    all.insert(all.end(), arguments.begin(), arguments.end());
    return all;
}

Ended IndexTest::run(const std::vector<std::string> &arguments) const {
    return Process(ZANOINDEX_PROGRAM, argumentsOf(arguments)).wait();
}

Ended IndexTest::runFaulty(const std::vector<std::string> &arguments) const {
    return Process(ZANOINDEX_FAULTY, argumentsOf(arguments)).wait();
}

Json::Value IndexTest::parsed(const std::string &line) {
    Json::Value value;
    std::istringstream stream(line);
    std::string errors;
    EXPECT_TRUE(Json::parseFromStream(Json::CharReaderBuilder(), stream, &value, &errors))
        << errors << line;
    return value;
}

Json::Value IndexTest::summaryOf(std::vector<std::string> arguments, int status) const {
    arguments.insert(arguments.begin(), "--json");
    const auto ended = run(arguments);
    EXPECT_EQ(ended.status, status) << ended.err;
    return parsed(ended.out);
}

std::string IndexTest::nameOf(const ZANO_MEDIA_INFO &row) const {
    return fs::path(row.path).lexically_relative(music()).string();
}

std::vector<std::string> IndexTest::rows(
    const std::function<std::string(const ZANO_MEDIA_INFO &)> &toLine, const char *select,
    mediadb::Table table) const {
    const auto engine = this->engine();
    mediadb::Query query;
    query.table = table;
    query.select = mediadb::parseSelect(table, select);
    mediadb::parseOrder("path", query);
    const auto cursor = engine->open(query);
    std::vector<std::string> lines;
    const auto row = std::make_unique<ZANO_MEDIA_INFO>();
    while (cursor->next(*row)) {
        lines.push_back(toLine(*row));
    }
    return lines;
}

std::vector<std::string> IndexTest::songs() const {
    const auto albumArtists = rows(
        [](const ZANO_MEDIA_INFO &row) { return std::string(row.title); }, "album_artist as title");
    auto albumArtist = albumArtists.begin();
    return rows([&](const ZANO_MEDIA_INFO &row) {
        std::ostringstream line;
        line << nameOf(row) << '|' << row.title << '|' << row.artist << '|' << row.album << '|'
             << *albumArtist++ << '|' << row.genre << '|' << row.year << '|' << row.track << '|'
             << row.disc;
        return line.str();
    });
}

std::vector<std::string> IndexTest::playlists() const {
    return rows(
        [this](const ZANO_MEDIA_INFO &row) {
            return nameOf(row) + '|' + row.title + '|' + row.album;
        },
        nullptr, mediadb::Table::Playlists);
}

std::vector<std::string> IndexTest::paths() const {
    return rows([this](const ZANO_MEDIA_INFO &row) { return nameOf(row); });
}

std::vector<std::string> IndexTest::sounds() const {
    return rows([this](const ZANO_MEDIA_INFO &row) {
        std::ostringstream line;
        line << nameOf(row) << ' ' << std::fixed << std::setprecision(1) << row.duration << " s "
             << row.bitrate << " bit/s " << row.frequency << " Hz";
        return line.str();
    });
}

std::string counts(const Json::Value &summary) {
    std::string text;
    for (const char *name : {"added", "updated", "unchanged", "removed", "kept"}) {
        text += std::string(name) + " " + summary[name].asString() + ", ";
    }
    return text + "failed " + std::to_string(summary["failed"].size());
}

}  // namespace zano::index
