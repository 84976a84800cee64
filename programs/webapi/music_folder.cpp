#include "music_folder.h"

#include <fcntl.h>
#include <unistd.h>
#include <array>
#include <cerrno>
#include <climits>
#include <cstdlib>
#include <memory>

#include "refusal.h"
#include "system_paths_internal.h"

namespace webapi {

namespace {

struct FreeText {
    void operator()(char *text) const { std::free(text); }
};

/* "" when it leads nowhere. */
std::string realPath(const std::string &path) {
    const std::unique_ptr<char, FreeText> real(realpath(path.c_str(), nullptr));
    return real != nullptr ? real.get() : "";
}

bool isBelow(const std::string &folder, const std::string &path) {
    return path.size() > folder.size() + 1 && path.starts_with(folder) &&
           (path[folder.size()] == '/' || folder == "/");
}

std::string linkText(const std::string &link) {
    std::array<char, PATH_MAX> text{};
    const ssize_t length = readlink(link.c_str(), text.data(), text.size());
    return length > 0 ? std::string(text.data(), static_cast<std::size_t>(length)) : "";
}

}  // namespace

MusicFolder::MusicFolder() : path_(linkText(ZANO_PATH_MUSIC_LINK)) {
    if (path_.empty()) {
        throw Refusal(kFailed, "music");
    }
}

bool MusicFolder::lists(const std::string &path) const {
    return isBelow(path_, path);
}

std::string MusicFolder::resolved(const std::string &path) const {
    const std::string folder = realPath(ZANO_PATH_MUSIC_LINK);
    std::string real = realPath(path);
    if (folder.empty() || !isBelow(folder, real)) {
        throw Refusal(kNotFound, "file");
    }
    return real;
}

MusicFile::MusicFile(const MusicFolder &folder, const std::string &path) {
    const std::string real = folder.resolved(path);
    // Not waiting for the other end of what turns out to be a pipe.
    descriptor_ = open(real.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK | O_NOCTTY);
    if (descriptor_ == -1) {
        const bool isGone = errno == ENOENT || errno == ENOTDIR || errno == ELOOP;
        throw Refusal(isGone ? kNotFound : kFailed, "file");
    }
    // What is open is what was looked at: a folder on the way may have become a link meanwhile.
    const bool isTheOne = linkText("/proc/self/fd/" + std::to_string(descriptor_)) == real;
    if (!isTheOne || fstat(descriptor_, &status_) != 0 || !S_ISREG(status_.st_mode)) {
        close(descriptor_);
        throw Refusal(kNotFound, "file");
    }
}

MusicFile::~MusicFile() {
    close(descriptor_);
}

}  // namespace webapi
