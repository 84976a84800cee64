#include "new_folder.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <stdexcept>
#include <string_view>

#include "descriptor_internal.h"

namespace zano::ipod {
namespace {

namespace fs = std::filesystem;
using vorelix::Descriptor;

[[noreturn]] void fail(const std::string &what) {
    throw std::runtime_error("could not " + what + ": " + std::strerror(errno));
}

/* Some file systems have nothing to synchronise of a folder, and say so. */
void synchronise(const Descriptor &file, const std::string &path) {
    if (fsync(file.number()) != 0 && errno != EINVAL) {
        fail("write " + path);
    }
}

Descriptor openFolder(const std::string &path) {
    const int number = open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (number == -1) {
        fail("open the folder " + path);
    }
    return Descriptor(number);
}

void writeFile(const std::string &path, std::string_view contents) {
    const Descriptor file(open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0644));
    if (file.number() == -1) {
        fail("make " + path);
    }
    while (!contents.empty()) {
        const ssize_t count = write(file.number(), contents.data(), contents.size());
        if (count < 0) {
            fail("write " + path);
        }
        contents.remove_prefix(static_cast<std::size_t>(count));
    }
    synchronise(file, path);
}

/* The new folder, which is removed with all that it has when the object goes: what was put into its
 * place by then, too. */
class NewFolder {
  public:
    explicit NewFolder(std::string path) : path_(std::move(path)) {
        fs::remove_all(path_);  // what a killed program left
        if (mkdir(path_.c_str(), 0755) != 0) {
            fail("make the folder " + path_);
        }
    }
    ~NewFolder() {
        std::error_code ignored;
        fs::remove_all(path_, ignored);
    }
    NewFolder(const NewFolder &) = delete;
    NewFolder &operator=(const NewFolder &) = delete;

    void fill(const Files &files) const {
        for (const auto &[name, contents] : files) {
            writeFile(path_ + "/" + name, contents);
        }
        synchronise(openFolder(path_), path_);
    }

    void takePlaceOf(const std::string &folder) const {
        const bool isFirst = access(folder.c_str(), F_OK) != 0;
        const unsigned flags = isFirst ? RENAME_NOREPLACE : RENAME_EXCHANGE;
        if (renameat2(AT_FDCWD, path_.c_str(), AT_FDCWD, folder.c_str(), flags) != 0) {
            fail("put the new lists in the place of " + folder);
        }
    }

  private:
    std::string path_;
};

}  // namespace

void replaceFolder(const std::string &folder, const Files &files) {
    const fs::path path(folder);
    const std::string parent = path.parent_path();
    fs::create_directories(parent);
    const Descriptor lock = openFolder(parent);
    while (flock(lock.number(), LOCK_EX) != 0) {
        if (errno != EINTR) {
            fail("lock the folder " + parent);
        }
    }
    const NewFolder draft(parent + "/." + path.filename().string() + ".new");
    draft.fill(files);
    draft.takePlaceOf(folder);
    synchronise(lock, parent);
}

}  // namespace zano::ipod
