#include "cluster.h"

#include <fcntl.h>
#include <libpq-fe.h>
#include <pwd.h>
#include <signal.h>
#include <sys/prctl.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <memory>
#include <stdexcept>
#include <utility>
#include <vector>

namespace zano::mediadb {
namespace {

constexpr const char *kPrograms = ZANO_POSTGRESQL_PROGRAMS;
constexpr const char *kOwner = "zano";

void require(bool isTrue, const std::string &what) {
    if (!isTrue) {
        throw std::runtime_error("the test's PostgreSQL server: " + what);
    }
}

/* Before the child lives its own life: it dies with its parent, and is not root. */
void becomeServer(const passwd *user, const std::string &log) {
    if (user != nullptr && (setgid(user->pw_gid) != 0 || setuid(user->pw_uid) != 0)) {
        _exit(126);
    }
    prctl(PR_SET_PDEATHSIG, SIGQUIT);
    if (std::freopen(log.c_str(), "a", stdout) == nullptr || dup2(1, 2) < 0) {
        _exit(126);
    }
}

pid_t start(const passwd *user, const std::string &log, std::vector<std::string> words) {
    const pid_t child = fork();
    if (child == 0) {
        becomeServer(user, log);
        std::vector<char *> arguments;
        for (std::string &word : words) {
            arguments.push_back(word.data());
        }
        arguments.push_back(nullptr);
        execv(arguments[0], arguments.data());
        _exit(127);
    }
    return child;
}

bool succeeds(pid_t child) {
    int status = -1;
    return waitpid(child, &status, 0) == child && WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

/* The life of the guard: says "+" when the data are there, and waits for the lifeline's end. The
 * data are those of the server in the folder `primary`, or new where that is empty. */
int guardServer(const std::string &folder, const std::string &primary, int lifeline, int report) {
    signal(SIGINT, SIG_IGN);  // ended by the lifeline alone
    const passwd *user = geteuid() == 0 ? getpwnam("nobody") : nullptr;
    const std::string log = folder + "/log";
    const std::string programs = kPrograms;
    const std::string data = folder + "/data";
    bool isMade = user == nullptr || chown(folder.c_str(), user->pw_uid, user->pw_gid) == 0;
    isMade =
        isMade &&
        succeeds(primary.empty()
                     ? start(user, log,
                             {programs + "/initdb", "-D", data, "-U", kOwner, "--no-sync", "-A",
                              "trust", "--encoding=UTF8", "--locale=C.UTF-8"})
                     : start(user, log,
                             {programs + "/pg_basebackup", "-D", data, "-U", kOwner, "--no-sync",
                              "-h", primary, "-R", "-X", "stream", "-c", "fast"}));
    pid_t server = -1;
    if (isMade) {
        server = start(user, log,
                       {programs + "/postgres", "-D", data, "-k", folder, "-c",
                        "listen_addresses=", "-c", "fsync=off", "-c", "max_connections=50"});
    }
    const bool isReported = write(report, isMade ? "+" : "-", 1) == 1;
    close(report);
    char none = 0;
    while (isReported && read(lifeline, &none, 1) > 0) {
    }
    if (server > 0) {
        ::kill(server, SIGQUIT);
        waitpid(server, nullptr, 0);
    }
    std::error_code error;
    std::filesystem::remove_all(folder, error);
    return 0;
}

/* The ends of other lifelines too, which would not end while this process has them. */
void closeAllBut(int one, int other) {
    for (int descriptor = 3; descriptor < 1024; ++descriptor) {
        if (descriptor != one && descriptor != other) {
            close(descriptor);
        }
    }
}

using Server = std::unique_ptr<PGconn, decltype(&PQfinish)>;

Server connect(const std::string &address) {
    return {PQconnectdb(address.c_str()), PQfinish};
}

}  // namespace

Cluster &Cluster::get() {
    static Cluster cluster;
    return cluster;
}

Cluster::Cluster(const Cluster *primary) {
    std::string pattern = (std::filesystem::temp_directory_path() / "zano-pg-XXXXXX").string();
    require(mkdtemp(pattern.data()) != nullptr, "no folder");
    folder_ = pattern;
    /* A test may give up what lets root enter folders of others. */
    require(chmod(pattern.data(), 0711) == 0, "chmod");
    std::array<int, 2> lifeline{};
    std::array<int, 2> report{};
    require(pipe2(lifeline.data(), O_CLOEXEC) == 0 && pipe2(report.data(), O_CLOEXEC) == 0, "pipe");
    guard_ = fork();
    require(guard_ >= 0, "fork");
    if (guard_ == 0) {
        setsid();
        closeAllBut(lifeline[0], report[1]);
        _exit(guardServer(folder_, primary != nullptr ? primary->folder_ : "", lifeline[0],
                          report[1]));
    }
    close(lifeline[0]);
    close(report[1]);
    lifeline_ = lifeline[1];
    char made = 0;
    const bool isTold = read(report[0], &made, 1) == 1;
    close(report[0]);
    require(isTold && made == '+', "initdb failed; is postgresql installed?");
    /* It answers "starting up" until it is ready. */
    const std::string address = this->address("postgres", kOwner);
    for (PGPing state = PQPING_NO_RESPONSE; state != PQPING_OK; state = PQping(address.c_str())) {
        require(waitpid(guard_, nullptr, WNOHANG) == 0, "it ended");
        usleep(1000);
    }
}

Cluster::~Cluster() {
    kill();
}

void Cluster::kill() {
    if (lifeline_ >= 0) {
        close(std::exchange(lifeline_, -1));
        waitpid(guard_, nullptr, 0);
    }
}

std::string Cluster::address(const std::string &database, const std::string &role) const {
    std::string host;
    for (const char c : folder_) {
        host += c == '/' ? "%2F" : std::string(1, c);
    }
    return "postgresql://" + role + "@/" + database + "?host=" + host;
}

std::string Cluster::addressWith(const Cluster &other, const std::string &database) const {
    const std::string there = other.address("", "");
    return address(database, kOwner) + "," + there.substr(there.rfind('=') + 1);
}

std::string Cluster::newDatabase() {
    const std::string name = "media" + std::to_string(++databases_);
    run(address("postgres", kOwner), "CREATE DATABASE " + name);
    return address(name, kOwner);
}

std::string Cluster::run(const std::string &address, const std::string &sql) {
    const Server server = connect(address);
    PGresult *result = PQexec(server.get(), sql.c_str());
    const std::string words = PQresultErrorMessage(result);
    const bool hasRow = PQntuples(result) > 0;
    const bool isDone = hasRow || PQresultStatus(result) == PGRES_COMMAND_OK ||
                        PQresultStatus(result) == PGRES_TUPLES_OK;
    std::string value = hasRow ? PQgetvalue(result, 0, 0) : "";
    PQclear(result);
    require(isDone, sql + ": " + words + PQerrorMessage(server.get()));
    return value;
}

std::string locationForTest(const std::string &file) {
    return std::getenv("ZANO_TEST_ON_POSTGRESQL") != nullptr ? Cluster::get().newDatabase()
                                                             : "sqlite:" + file;
}

void Cluster::endConnections() {
    run(address("postgres", kOwner),
        "SELECT pg_terminate_backend(pid, 5000) FROM pg_stat_activity WHERE datname LIKE 'media%'");
}

}  // namespace zano::mediadb
