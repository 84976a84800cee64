#include "minidlna.h"

#include <arpa/inet.h>
#include <fcntl.h>
#include <netinet/in.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>

namespace integration {

namespace {

int freePort() {
    const int file = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    socklen_t size = sizeof address;
    auto *general = reinterpret_cast<sockaddr *>(&address);
    EXPECT_EQ(bind(file, general, size), 0);
    EXPECT_EQ(getsockname(file, general, &size), 0);
    close(file);
    return ntohs(address.sin_port);
}

/* In the foreground, as system managers want it. */
[[noreturn]] void become(const std::string &settings, const std::string &pidFile, pid_t parent) {
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    const int nowhere = open("/dev/null", O_RDWR);
    dup2(nowhere, STDOUT_FILENO);
    dup2(nowhere, STDERR_FILENO);
    if (getppid() == parent) {
        execl(VORELIX_MINIDLNAD, "minidlnad", "-S", "-f", settings.c_str(), "-P", pidFile.c_str(),
              nullptr);
    }
    _exit(127);
}

}  // namespace

MiniDlna::MiniDlna(const std::string &music)
    : port_(freePort()), name_("R & B " + std::to_string(port_)) {
    const std::string settings = folder_.path("minidlna.conf");
    files::write(settings,
                 "port=" + std::to_string(port_) + "\nnetwork_interface=lo\nmedia_dir=A," + music +
                     "\nfriendly_name=" + name_ + "\ndb_dir=" + folder_.path("") +
                     "\nlog_dir=" + folder_.path("") + "\ninotify=no\nnotify_interval=60\n");
    const pid_t parent = getpid();
    pid_ = fork();
    if (pid_ == 0) {
        become(settings, folder_.path("pid"), parent);
    }
}

MiniDlna::~MiniDlna() {
    kill(pid_, SIGTERM);
    waitpid(pid_, nullptr, 0);
}

std::string MiniDlna::url(const std::string &path) const {
    return "http://127.0.0.1:" + std::to_string(port_) + path;
}

}  // namespace integration
