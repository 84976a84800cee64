#include "format.h"

#include <algorithm>

#include "text.h"

namespace zano::playlists {
namespace {

constexpr std::array kFormats = {
    Format{"m3u", {"m3u", "m3u8"}, isM3uBegunBy, readM3u},
    Format{"pls", {"pls", ""}, isPlsBegunBy, readPls},
    Format{"wpl", {"wpl", ""}, isWplBegunBy, readWpl},
};

/* How far a look at the kind of a file goes. */
constexpr std::size_t kLookBytes = 1024;

/* What servers answer in the place of a playlist, and players save under its name. wpl has a head
 * and a body too, but begins with neither. */
bool isHtml(std::string_view start) {
    const auto has = [start](std::string_view sign) {
        return findIgnoringCase(start, sign) != std::string_view::npos;
    };
    return !start.empty() && start.front() == '<' &&
           (has("<!doctype html") || has("<html") || startsIgnoringCase(start, "<head") ||
            startsIgnoringCase(start, "<body"));
}

/* Music, pictures, archives: control characters at the very front, or a NUL in the first line
 * with more behind it. NULs behind the text are left by systems that crashed. */
bool isBinary(std::string_view text) {
    constexpr std::size_t kFrontBytes = 8;
    const auto isControl = [](char c) {
        return static_cast<unsigned char>(c) < ' ' && c != '\t' && c != '\n' && c != '\r' &&
               c != '\0';
    };
    const std::string_view front = text.substr(0, kFrontBytes);
    const std::string_view line = text.substr(0, text.find_first_of("\r\n"));
    const std::size_t nul = line.find('\0');
    return std::any_of(front.begin(), front.end(), isControl) ||
           text.find_first_not_of('\0', nul) < line.size();
}

std::string_view suffixOf(std::string_view path) {
    const std::size_t slash = path.rfind('/');
    const std::string_view name = slash == std::string_view::npos ? path : path.substr(slash + 1);
    const std::size_t dot = name.rfind('.');
    return dot == std::string_view::npos ? std::string_view() : name.substr(dot + 1);
}

const Format *formatOf(std::string_view start, std::string_view path) {
    for (const Format &format : kFormats) {
        if (format.isBegunBy(start)) {
            return &format;
        }
    }
    const std::string_view suffix = suffixOf(path);
    for (const Format &format : kFormats) {
        for (const std::string_view known : format.suffixes) {
            if (!suffix.empty() && equalsIgnoringCase(suffix, known)) {
                return &format;
            }
        }
    }
    return nullptr;
}

}  // namespace

void readPlaylist(std::string_view text, std::string_view path, Playlist &playlist) {
    const std::string_view start = trimmed(text.substr(0, kLookBytes));
    if (start.empty() && trimmed(text).empty()) {
        return;
    }
    const Format *format = formatOf(start, path);
    if (isHtml(start) && !isWplBegunBy(start)) {
        throw PlaylistError(KLIB_ERR_PLAYLIST_NOT_ONE, "an HTML page and not a playlist");
    }
    if (format == nullptr || isBinary(text.substr(0, kLookBytes))) {
        throw PlaylistError(KLIB_ERR_PLAYLIST_NOT_ONE, "not a playlist: neither m3u, pls nor wpl");
    }
    format->read(text, playlist);
}

}  // namespace zano::playlists
