#include <zanoplatform/key_value_file.h>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>
#include <zanoplatform/error.h>

#include <array>
#include <cerrno>
#include <cstddef>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>

#include "descriptor_internal.h"
#include "settings/key_value_line.h"
#include "strings/error_internal.h"

using vorelix::Descriptor;
using zano::settings::readKeyValue;
using zano::settings::takeLine;

namespace {

constexpr std::size_t kMaxFileBytes = std::size_t{1} << 20U;
constexpr std::size_t kMaxLineBytes = 1023;

class SettingError : public std::runtime_error {
  public:
    SettingError(int code, const std::string &text) : std::runtime_error(text), code_(code) {}
    int code() const { return code_; }

  private:
    int code_;
};

void require(bool isSo, const char *otherwise) {
    if (!isSo) {
        throw SettingError(KLIB_ERR_BAD_PARAMETER, otherwise);
    }
}

/* For what set errno. */
[[noreturn]] void failFile(const std::string &attempt) {
    throw SettingError(KLIB_ERR_FILE_FAILED, attempt + ": " + std::strerror(errno));
}

/* The format with its two %s replaced. Not by printf, for it comes from the caller. */
std::string filled(std::string_view format, const std::array<const char *, 2> &texts) {
    std::string line;
    std::size_t used = 0;
    for (std::size_t at = 0; at < format.size(); ++at) {
        const std::string_view marker = format.substr(at, 2);
        if (marker.front() != '%') {
            line += marker.front();
            continue;
        }
        if (marker == "%%") {
            line += '%';
        } else {
            require(marker == "%s" && used < texts.size(), "the format of the line is not known");
            line += texts.at(used++);
        }
        ++at;
    }
    require(used == texts.size(), "the format of the line is not known");
    return line;
}

std::string lineOf(const char *key, const char *value, const char *format) {
    require(*key != '\0', "the key is empty");
    std::string line = filled(format, {key, value});
    require(line.find('\n') == line.size() - 1, "key, value and format do not make one line");
    require(line.size() - 1 <= kMaxLineBytes, "the line would have more than 1023 bytes");
    const auto read = readKeyValue(line);
    require(read && read->key == key && read->value == value,
            "key or value would not be read again as they are");
    return line;
}

std::string withLine(std::string_view text, std::string_view key, const std::string &line) {
    std::string changed;
    bool isThere = false;
    while (!text.empty()) {
        const std::string_view old = takeLine(text);
        const auto read = readKeyValue(old);
        const bool isOfKey = read && read->key == key;
        changed += isOfKey ? line : old;
        isThere = isThere || isOfKey;
    }
    if (!isThere) {
        changed.append(changed.empty() || changed.back() == '\n' ? "" : "\n").append(line);
    }
    return changed;
}

/* The folder of a file, locked against all others that change its files this way. The lock ends
 * with the object. */
class LockedFolder {
  public:
    explicit LockedFolder(const std::string &path)
        : descriptor_(open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC)) {
        if (descriptor_.number() == -1) {
            failFile("cannot open the folder " + path);
        }
        while (flock(descriptor_.number(), LOCK_EX) != 0) {
            if (errno != EINTR) {
                failFile("cannot lock the folder " + path);
            }
        }
    }

    int number() const { return descriptor_.number(); }

  private:
    Descriptor descriptor_;
};

struct Contents {
    std::string text;
    struct stat status {};
};

/* Null when there is no file. */
std::optional<Contents> contentsOf(const LockedFolder &folder, const std::string &name) {
    // A pipe in its place is not waited for.
    const Descriptor file(openat(folder.number(), name.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
    if (file.number() == -1) {
        if (errno == ENOENT) {
            return std::nullopt;
        }
        failFile("cannot open " + name);
    }
    Contents contents;
    if (fstat(file.number(), &contents.status) != 0) {
        failFile("cannot examine " + name);
    }
    if (!S_ISREG(contents.status.st_mode)) {
        throw SettingError(KLIB_ERR_FILE_FAILED, name + " is not a file");
    }
    std::array<char, 4096> piece;
    ssize_t count = 0;
    while ((count = read(file.number(), piece.data(), piece.size())) > 0) {
        contents.text.append(piece.data(), static_cast<std::size_t>(count));
        if (contents.text.size() > kMaxFileBytes) {
            throw SettingError(KLIB_ERR_FILE_FAILED, name + " is larger than 1 MiB");
        }
    }
    if (count != 0) {
        failFile("cannot read " + name);
    }
    return contents;
}

/* The new contents beside the file; gone with the object when they do not take its place. */
class Draft {
  public:
    Draft(const LockedFolder &folder, const std::string &name)
        : folder_(folder), name_(name + ".new"), descriptor_(makeFile()) {}
    ~Draft() {
        if (!isInPlace_) {
            unlinkat(folder_.number(), name_.c_str(), 0);
        }
    }
    Draft(const Draft &) = delete;
    Draft &operator=(const Draft &) = delete;

    void write(std::string_view text) const {
        while (!text.empty()) {
            const ssize_t count = ::write(descriptor_.number(), text.data(), text.size());
            if (count < 0) {
                failFile("cannot write " + name_);
            }
            text.remove_prefix(static_cast<std::size_t>(count));
        }
    }

    void keepRights(const struct stat &status) const {
        // Only the system's own user may give the owner; the mode alone is what matters then.
        [[maybe_unused]] const int given =
            fchown(descriptor_.number(), status.st_uid, status.st_gid);
        if (fchmod(descriptor_.number(), status.st_mode & ALLPERMS) != 0) {
            failFile("cannot set the mode of " + name_);
        }
    }

    void takePlaceOf(const std::string &name) {
        if (fsync(descriptor_.number()) != 0) {
            failFile("cannot write " + name_);
        }
        if (renameat(folder_.number(), name_.c_str(), folder_.number(), name.c_str()) != 0) {
            failFile("cannot rename " + name_ + " to " + name);
        }
        isInPlace_ = true;
        // Some file systems have nothing to synchronise of a folder, and say so.
        if (fsync(folder_.number()) != 0 && errno != EINVAL) {
            failFile("cannot synchronise the folder of " + name);
        }
    }

  private:
    /* What a killed process left is removed, and what somebody else made meanwhile is not written
     * to: the folder may be open to everybody. */
    int makeFile() const {
        unlinkat(folder_.number(), name_.c_str(), 0);
        const int descriptor =
            openat(folder_.number(), name_.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0644);
        if (descriptor == -1) {
            failFile("cannot make " + name_);
        }
        return descriptor;
    }

    const LockedFolder &folder_;
    std::string name_;
    Descriptor descriptor_;
    bool isInPlace_ = false;
};

void setLine(const std::filesystem::path &path, std::string_view key, const std::string &line) {
    const std::string name = path.filename();
    require(!name.empty(), "the path names no file");
    const LockedFolder folder(path.has_parent_path() ? path.parent_path() : ".");
    const std::optional<Contents> old = contentsOf(folder, name);
    const std::string text = withLine(old ? old->text : "", key, line);
    if (old && text == old->text) {
        return;
    }
    Draft draft(folder, name);
    draft.write(text);
    if (old) {
        draft.keepRights(old->status);
    }
    draft.takePlaceOf(name);
}

/* Without its links, so that what a link names is replaced and not the link. */
std::filesystem::path resolved(const char *path) {
    std::error_code error;
    const std::filesystem::path target = std::filesystem::canonical(path, error);
    return error ? std::filesystem::path(path) : target;
}

}  // namespace

int KLIBCFileSetKeyValue(const char *path, const char *key, const char *value, const char *format) {
    try {
        require(path != nullptr && key != nullptr && value != nullptr && format != nullptr,
                "an argument is missing");
        setLine(resolved(path), key, lineOf(key, value, format));
        zano::clearError();
        return 0;
    } catch (const SettingError &error) {
        zano::setError(error.code(), error.what());
    } catch (const std::exception &) {
        zano::setError(KLIB_ERR_OUT_OF_MEMORY, "out of memory for a setting");
    }
    return -1;
}
