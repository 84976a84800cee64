#include "file_actions.h"

#include <unistd.h>
#include <vorelix/misc/misc.h>
#include <algorithm>
#include <array>
#include <cctype>
#include <cerrno>
#include <cstdint>
#include <cstdio>
#include <ctime>
#include <filesystem>

#include "byte_range.h"
#include "music_folder.h"
#include "song_answers.h"
#include "songs.h"

namespace webapi {

namespace {

constexpr const char *kUnknownType = "application/octet-stream";
constexpr std::size_t kMostExtensionBytes = 16;

/* The mapping is searched for the text wherever it stands: only what can be an extension may be
 * looked for. */
bool isExtension(const std::string &text) {
    return !text.empty() && text.size() <= kMostExtensionBytes &&
           std::all_of(text.begin(), text.end(), [](unsigned char c) {
               return c < 0x80 && (std::isalnum(c) != 0 || c == '-' || c == '_' || c == '+');
           });
}

/* "audio/mpeg": as a line of a header can have it. */
bool isMimeType(const std::string &text) {
    return std::count(text.begin(), text.end(), '/') == 1 &&
           std::all_of(text.begin(), text.end(),
                       [](unsigned char c) { return c > ' ' && c < 0x7F && c != '"'; });
}

std::string mimeTypeOf(std::string extension) {
    std::transform(extension.begin(), extension.end(), extension.begin(),
                   [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
    std::array<char, 128> type{};
    if (ZANOAudioGetMimetype(extension.c_str(), type.data(), type.size()) != 0) {
        throw Refusal(kFailed, "mimetype");
    }
    return isMimeType(type.data()) ? type.data() : kUnknownType;
}

std::string mimeTypeOfFile(const std::string &path) {
    const std::string ending = std::filesystem::path(path).extension();
    const std::string extension = ending.empty() ? ending : ending.substr(1);
    return isExtension(extension) ? mimeTypeOf(extension) : kUnknownType;
}

ZANO_MEDIA_INFO songOf(const std::string &streamId) {
    const int id = songOfStreamId(streamId);
    if (id == -1) {
        throw Refusal(kBadRequest, "song");
    }
    const vorelix::SongList list = vorelix::songsById({id});
    if (list == nullptr) {
        throw Refusal(kNotFound, "song");
    }
    return list->info;
}

/* "Sat, 21 Nov 2026 12:00:00 GMT" */
std::string httpDate(std::time_t time) {
    std::array<char, 32> text{};
    struct tm parts {};
    gmtime_r(&time, &parts);
    std::strftime(text.data(), text.size(), "%a, %d %b %Y %H:%M:%S GMT", &parts);
    return text.data();
}

/* Another one whenever the file was written or replaced. */
std::string entityTag(const struct stat &file) {
    std::array<char, 96> text{};
    std::snprintf(text.data(), text.size(), "\"%llx-%llx-%llx.%lx\"",
                  static_cast<unsigned long long>(file.st_ino),
                  static_cast<unsigned long long>(file.st_size),
                  static_cast<unsigned long long>(file.st_mtim.tv_sec),
                  static_cast<unsigned long>(file.st_mtim.tv_nsec));
    return text.data();
}

/* Whether the part belongs to what the caller has already. A date tells so only of a file that was
 * not written in the last second, for it could have been written twice in that. */
bool fits(const std::string &ifRange, const struct stat &file) {
    if (ifRange.empty() || ifRange == entityTag(file)) {
        return true;
    }
    return ifRange == httpDate(file.st_mtime) && file.st_mtime + 1 < std::time(nullptr);
}

ByteRange wantedOf(const Request &request, const struct stat &file) {
    // Of a HEAD no range is defined.
    const bool isRange = request.method == "GET" && fits(request.ifRange, file);
    const ByteRange range = byteRangeOf(isRange ? request.range : "", file.st_size);
    if (range.wanted == Wanted::kWhole) {
        return {Wanted::kWhole, 0, file.st_size - 1};
    }
    if (range.wanted == Wanted::kNothing) {
        throw Refusal(kNoSuchRange, "range",
                      "Content-Range: bytes */" + std::to_string(file.st_size) + "\r\n");
    }
    return range;
}

void writeHeader(const ByteRange &range, const struct stat &file, const std::string &type) {
    std::string lines = "Content-Type: " + type + "\r\nAccept-Ranges: bytes\r\nContent-Length: " +
                        std::to_string(range.last - range.first + 1) +
                        "\r\nLast-Modified: " + httpDate(file.st_mtime) +
                        "\r\nETag: " + entityTag(file) + "\r\nCache-Control: no-store\r\n";
    if (range.wanted == Wanted::kPart) {
        lines += "Content-Range: bytes " + std::to_string(range.first) + "-" +
                 std::to_string(range.last) + "/" + std::to_string(file.st_size) + "\r\n";
    }
    // A file that calls itself a page runs no script with this site's rights.
    lines += "X-Content-Type-Options: nosniff\r\nContent-Security-Policy: sandbox\r\n\r\n";
    writeStatus(range.wanted == Wanted::kPart ? kPartialContent : 0, lines);
    std::fflush(stdout);
}

bool writeAll(const char *bytes, std::size_t count) {
    while (count > 0) {
        const ssize_t written = write(STDOUT_FILENO, bytes, count);
        if (written < 0 && errno != EINTR) {
            return false;
        }
        bytes += std::max<ssize_t>(written, 0);
        count -= static_cast<std::size_t>(std::max<ssize_t>(written, 0));
    }
    return true;
}

/* Stops where the file got shorter meanwhile and when nobody listens any more: the server sees that
 * bytes are missing. */
void writeBytes(int descriptor, const ByteRange &range) {
    std::array<char, 1U << 16> part;
    for (off_t at = range.first; at <= range.last;) {
        const auto wanted = std::min<std::int64_t>(part.size(), range.last + 1 - at);
        const ssize_t got = pread(descriptor, part.data(), static_cast<std::size_t>(wanted), at);
        if (got <= 0 || !writeAll(part.data(), static_cast<std::size_t>(got))) {
            return;
        }
        at += got;
    }
}

}  // namespace

Json::Value MimetypeAction::answer() {
    const std::string extension = parameters().text("extension");
    if (!isExtension(extension)) {
        throw Refusal(kBadRequest, "extension");
    }
    Json::Value answer;
    answer["mimetype"] = mimeTypeOf(extension);
    return answer;
}

void StreamAction::respond() {
    const ZANO_MEDIA_INFO song = songOf(parameters().text("song"));
    const MusicFile file(MusicFolder(), song.path);
    const ByteRange range = wantedOf(request(), file.status());
    writeHeader(range, file.status(), mimeTypeOfFile(song.path));
    if (request().method != "HEAD") {
        writeBytes(file.descriptor(), range);
    }
}

}  // namespace webapi
