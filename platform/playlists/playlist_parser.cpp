#include <zanoplatform/playlist_parser.h>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>
#include <zanoplatform/error.h>
#include <zanoplatform/media_database.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <system_error>

#include "format.h"
#include "resolver.h"
#include "strings/error_internal.h"
#include "text.h"

namespace zano::playlists {
namespace {

class File {
  public:
    /* Not blocking: a pipe of that name would be waited for. */
    explicit File(const char *path) : descriptor_(open(path, O_RDONLY | O_CLOEXEC | O_NONBLOCK)) {
        struct stat file {};
        if (descriptor_ == -1 || fstat(descriptor_, &file) == -1) {
            fail(errno);
        }
        if (!S_ISREG(file.st_mode)) {
            close(descriptor_);
            throw PlaylistError(KLIB_ERR_PLAYLIST_UNREADABLE, "not a regular file");
        }
        size_ = static_cast<std::size_t>(file.st_size);
    }
    ~File() { close(descriptor_); }
    File(const File &) = delete;
    File &operator=(const File &) = delete;

    /* All of it; a file that grows meanwhile, up to the limit. */
    std::string contents() const {
        std::string bytes(std::min(size_, kMaxFileBytes) + 1, '\0');
        std::size_t length = 0;
        for (;;) {
            const ssize_t taken = read(descriptor_, bytes.data() + length, bytes.size() - length);
            if (taken == -1 && errno == EINTR) {
                continue;
            }
            if (taken == -1) {
                throw PlaylistError(KLIB_ERR_PLAYLIST_UNREADABLE, describe(errno));
            }
            length += static_cast<std::size_t>(taken);
            if (length > kMaxFileBytes) {
                throw PlaylistError(KLIB_ERR_PLAYLIST_TOO_LARGE, "more than 64 MiB");
            }
            if (taken == 0) {
                bytes.resize(length);
                return bytes;
            }
            bytes.resize(std::max(bytes.size(), length + 1));
        }
    }

  private:
    static std::string describe(int error) { return std::generic_category().message(error); }

    [[noreturn]] void fail(int error) const {
        if (descriptor_ != -1) {
            close(descriptor_);
        }
        throw PlaylistError(error == ENOENT || error == ENOTDIR ? KLIB_ERR_PLAYLIST_MISSING
                                                                : KLIB_ERR_PLAYLIST_UNREADABLE,
                            describe(error));
    }

    int descriptor_;
    std::size_t size_ = 0;
};

RecordList readFile(const char *path, const char *fields, int &total) {
    const std::string bytes = File(path).contents();
    std::string converted;
    Playlist playlist;
    readPlaylist(fileText(bytes, converted), path, playlist);
    const std::string_view folder = std::string_view(path, strrchr(path, '/') - path);
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
