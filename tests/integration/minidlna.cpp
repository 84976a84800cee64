#include "minidlna.h"

#include <csignal>

namespace integration {

MiniDlna::MiniDlna(const std::string &music)

    : port_(program::freePort()), name_("R & B " + std::to_string(port_)) {
    const std::string settings = folder_.path("minidlna.conf");
    files::write(settings,
                 "port=" + std::to_string(port_) + "\nnetwork_interface=lo\nmedia_dir=A," + music +
                     "\nfriendly_name=" + name_ + "\ndb_dir=" + folder_.path("") +
                     "\nlog_dir=" + folder_.path("") + "\ninotify=no\nnotify_interval=60\n");
    // In the foreground, as system managers want it.
    program_.emplace(
        program::Start{.path = VORELIX_MINIDLNAD,
                       .argv = {"minidlnad", "-S", "-f", settings, "-P", folder_.path("pid")},
                       .output = program::Stream::Nowhere,
                       .errors = program::Stream::Nowhere});
}

MiniDlna::~MiniDlna() {
    program_->stop(SIGTERM);
}

std::string MiniDlna::url(const std::string &path) const {
    return "http://127.0.0.1:" + std::to_string(port_) + path;
}

}  // namespace integration
