#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>
#include <vorelix/users/audiousers.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <optional>
#include <utility>

#include "descriptor_internal.h"
#include "guarded_internal.h"
#include "log_internal.h"

using vorelix::Descriptor;
using vorelix::LogMessage;
using vorelix::users::guarded;

namespace {

constexpr const char *kUnit = "audiousers";
constexpr LogMessage<const char *, const char *> kNotWritten{
    kUnit, "%s (%d) Failed to write %s. (%s)", 146};
constexpr LogMessage<const char *, const char *> kTemporaryNotOpened{
    kUnit, "%s (%d) Failed to open %s. (%s)", 153};
constexpr LogMessage<const char *, const char *> kNotOpened{kUnit,
                                                            "%s (%d) Failed to open %s. (%s)", 174};
constexpr LogMessage<const char *> kNoStatus{kUnit, "%s (%d) Failed to stat file. (%s)", 179};
constexpr LogMessage<> kTooLarge{kUnit, "%s (%d) Can't read file > 1MB.", 184};
constexpr LogMessage<long long> kNoBuffer{kUnit, "%s (%d) Failed to malloc(%lld).", 190};
constexpr LogMessage<int, long long, const char *> kNotRead{
    kUnit, "%s (%d) read file failed. (%d) != (%lld), errno=%s", 196};
constexpr LogMessage<const char *> kNotParsed{"Error: parsing error, reason = %s\n"};

constexpr off_t kLargestFile = 1048576;

struct FreeText {
    void operator()(char *text) const { std::free(text); }
};

bool writeWhole(int descriptor, const std::string &text) {
    if (write(descriptor, text.data(), text.size()) != static_cast<ssize_t>(text.size())) {
        return false;
    }
    // Or the power may go behind the rename and leave an empty file. What cannot be synchronised,
    // as a pipe, has said EINVAL.
    return fsync(descriptor) == 0 || errno == EINVAL;
}

bool writeTemporary(const char *path, const std::string &text) {
    const Descriptor file(open(path, O_WRONLY | O_CREAT | O_TRUNC, 0644));
    // Intended and kept: descriptor 0 is a failure too.
    if (file.number() <= 0) {
        kTemporaryNotOpened(path, std::strerror(errno));
        return false;
    }
    if (!writeWhole(file.number(), text)) {
        kNotWritten(path, std::strerror(errno));
        return false;
    }
    return true;
}

/* The text of an open file up to its first NUL. */
std::optional<std::string> readText(int descriptor) {
    struct stat status {};
    if (fstat(descriptor, &status) != 0) {
        kNoStatus(std::strerror(errno));
        return std::nullopt;
    }
    if (status.st_size > kLargestFile) {
        kTooLarge();
        return std::nullopt;
    }
    const auto size = static_cast<std::size_t>(status.st_size);
    const std::unique_ptr<char, FreeText> buffer(static_cast<char *>(std::calloc(size + 1, 1)));
    if (buffer == nullptr) {
        kNoBuffer(status.st_size);
        return std::nullopt;
    }
    const ssize_t count = read(descriptor, buffer.get(), size);
    if (count != status.st_size) {
        kNotRead(static_cast<int>(count), status.st_size, std::strerror(errno));
        return std::nullopt;
    }
    return std::string(buffer.get());
}

/* The reader throws for what is nested too deeply. */
std::optional<Json::Value> parse(const std::string &text) {
    Json::Value root;
    std::string reason;
    try {
        Json::Reader reader;
        if (!reader.parse(text, root, true)) {
            reason = reader.getFormattedErrorMessages();
        } else if (root.isObject() || root.isNull()) {
            return root;
        } else {
            reason = "The root is not an object.";
        }
    } catch (const Json::Exception &exception) {
        reason = exception.what();
    }
    kNotParsed(reason.c_str());
    return std::nullopt;
}

}  // namespace

bool AudioUsers::Save(const std::string &path) {
    return guarded(false, [&] {
        const std::string temporary = path + ".tmp";
        if (!writeTemporary(temporary.c_str(), Json::StyledWriter().write(users_))) {
            return false;
        }
        // Intended and kept: whether that succeeds is not asked.
        [[maybe_unused]] const int renamed = std::rename(temporary.c_str(), path.c_str());
        return true;
    });
}

bool AudioUsers::Read(const std::string &path) {
    return guarded(false, [&] {
        const Descriptor file(open(path.c_str(), O_RDONLY));
        if (file.number() == -1) {
            if (errno != ENOENT) {
                kNotOpened(path.c_str(), std::strerror(errno));
            }
            return false;
        }
        const std::optional<std::string> text = readText(file.number());
        std::optional<Json::Value> root = text ? parse(*text) : std::nullopt;
        if (!root) {
            return false;
        }
        users_ = std::move(*root);
        return true;
    });
}
