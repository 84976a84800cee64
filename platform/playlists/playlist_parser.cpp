#include <zanoplatform/playlist_parser.h>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>
#include <zanoplatform/error.h>
#include <zanoplatform/media_database.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdio>
#include <span>
#include <system_error>

#include "format.h"
#include "resolver.h"
#include "strings/error_internal.h"
#include "text.h"

namespace zano::playlists {
namespace {

class Descriptor {
  public:
    /* Not blocking: a pipe of that name would be waited for. */
    explicit Descriptor(const char *path) : number_(open(path, O_RDONLY | O_CLOEXEC | O_NONBLOCK)) {
        if (number_ == -1) {
            const bool isMissing = errno == ENOENT || errno == ENOTDIR;
            throwLastError(isMissing ? KLIB_ERR_PLAYLIST_MISSING : KLIB_ERR_PLAYLIST_UNREADABLE);
        }
    }
    ~Descriptor() { close(number_); }
    Descriptor(const Descriptor &) = delete;
    Descriptor &operator=(const Descriptor &) = delete;

    std::size_t size() const {
        struct stat file {};
        if (fstat(number_, &file) == -1) {
            throwLastError(KLIB_ERR_PLAYLIST_UNREADABLE);
        }
        if (!S_ISREG(file.st_mode)) {
            throw PlaylistError(KLIB_ERR_PLAYLIST_UNREADABLE, "not a regular file");
        }
        return static_cast<std::size_t>(file.st_size);
    }

    /* The number of bytes taken; 0: the end. */
    std::size_t read(std::span<char> part) const {
        ssize_t taken = -1;
        do {
            taken = ::read(number_, part.data(), part.size());
        } while (taken == -1 && errno == EINTR);
        if (taken == -1) {
            throwLastError(KLIB_ERR_PLAYLIST_UNREADABLE);
        }
        return static_cast<std::size_t>(taken);
    }

  private:
    [[noreturn]] static void throwLastError(int code) {
        throw PlaylistError(code, std::generic_category().message(errno));
    }

    int number_;
};

/* All of a file; of one that grows meanwhile, up to the limit. */
std::string contentsOf(const char *path) {
    const Descriptor file(path);
    std::string bytes(std::min(file.size(), kMaxFileBytes) + 1, '\0');
    std::size_t length = 0;
    for (;;) {
        const std::size_t taken = file.read(std::span(bytes).subspan(length));
        length += taken;
        if (length > kMaxFileBytes) {
            throw PlaylistError(KLIB_ERR_PLAYLIST_TOO_LARGE, "more than 64 MiB");
        }
        if (taken == 0) {
            bytes.resize(length);
            return bytes;
        }
        if (length == bytes.size()) {
            bytes.resize(length * 2);
        }
    }
}

RecordList readFile(const char *path, const char *fields, int &total) {
    const std::string bytes = contentsOf(path);
    std::string converted;
    Playlist playlist;
    readPlaylist(fileText(bytes, converted), path, playlist);
    const std::string_view file = path;
    const std::string_view folder = file.substr(0, file.rfind('/'));
    const Fields wanted(fields != nullptr ? fields : "");
    return Resolver(folder, playlist, wanted).records(total);
}

/* The path of the playlist with that id. */
std::string pathOf(std::string_view id) {
    if (id.empty() || id.size() > 10 ||
        id.find_first_not_of("0123456789") != std::string_view::npos) {
        throw PlaylistError(KLIB_ERR_BAD_PARAMETER, "the id of a playlist is a number");
    }
    MEDIA_DB_RESULT *result =
        MediaInfoDBOpen(MEDIA_TABLE_PLAYLISTS, "path", std::string("id = ").append(id).c_str(),
                        nullptr, nullptr, 0, 1, 0);
    ZANO_MEDIA_INFO row;
    const bool isThere = result != nullptr && MediaInfoDBGet(result, &row) == 0;
    const int code = KLIBCErrGet();
    const std::string text = KLIBCErrTextGet();
    MediaInfoDBClose(result);
    if (code != KLIB_ERR_NONE) {
        throw PlaylistError(code, text);
    }
    if (!isThere) {
        throw PlaylistError(KLIB_ERR_PLAYLIST_MISSING, "no playlist has this id");
    }
    return row.path;
}

/* The border: a list, or null and the error of this thread, which names `what`. */
template <typename Action>
ZANO_PLAYLIST_REC *guarded(const char *what, int *total, Action action) noexcept {
    try {
        if (total != nullptr) {
            *total = 0;
        }
        if (what == nullptr || total == nullptr) {
            throw PlaylistError(KLIB_ERR_BAD_PARAMETER, "no playlist or no place for the total");
        }
        ZANO_PLAYLIST_REC *list = action().release();
        clearError();
        return list;
    } catch (const PlaylistError &error) {
        std::array<char, 512> text{};
        std::snprintf(text.data(), text.size(), "%s: %s", what != nullptr ? what : "playlist",
                      error.what());
        setError(error.code(), text.data());
    } catch (const std::exception &) {
        setError(KLIB_ERR_OUT_OF_MEMORY, "out of memory while reading a playlist");
    }
    if (total != nullptr) {
        *total = 0;
    }
    return nullptr;
}

}  // namespace
}  // namespace zano::playlists

using namespace zano::playlists;

ZANO_PLAYLIST_REC *ParsePlayListByField(const char *id, int *total, int, int, const char *fields,
                                        int) {
    return guarded(id, total, [&] { return readFile(pathOf(id).c_str(), fields, *total); });
}

ZANO_PLAYLIST_REC *ParsePlayListByFieldGivenPath(const char *path, int *total, int, int,
                                                 const char *fields, int) {
    return guarded(path, total, [&] {
        if (path[0] != '/') {
            throw PlaylistError(KLIB_ERR_BAD_PARAMETER, "the path of a playlist is absolute");
        }
        return readFile(path, fields, *total);
    });
}
