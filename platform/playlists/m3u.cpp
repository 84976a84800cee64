/* m3u and m3u8: a location on each line, lines with # before it that tell of it. */
#include <algorithm>

#include "format.h"
#include "text.h"

namespace zano::playlists {
namespace {

/* "215,Title", and "-1 key="a, b",Title" of programs that put properties before the comma. */
void takeInfo(Tags &tags, std::string_view value) {
    tags.duration = leadingNumber(value);
    bool isQuoted = false;
    const auto *comma = std::find_if(value.begin(), value.end(), [&isQuoted](char c) {
        isQuoted = isQuoted != (c == '"');
        return c == ',' && !isQuoted;
    });
    const auto at = static_cast<std::size_t>(comma - value.begin());
    if (at < value.size()) {
        tags.title = value.substr(at + 1);
    }
}

struct Directive {
    std::string_view start;
    void (*take)(Tags &tags, std::string_view value);
};

/* The second names of artist, album and genre are those of m3u8 lists of other players. */
constexpr std::array kDirectives = {
    Directive{"#EXTINF:", takeInfo},
    Directive{"#EXTINFARTIST:", [](Tags &tags, std::string_view v) { tags.artist = v; }},
    Directive{"#EXTINFALBUM:", [](Tags &tags, std::string_view v) { tags.album = v; }},
    Directive{"#EXTINFGENRE:", [](Tags &tags, std::string_view v) { tags.genre = v; }},
    Directive{"#EXTINFYEAR:",
              [](Tags &tags, std::string_view v) { tags.year = leadingInteger(v); }},
    Directive{"#EXTINFDISC:",
              [](Tags &tags, std::string_view v) { tags.disc = leadingInteger(v); }},
    Directive{"#EXTINFTRACK:",
              [](Tags &tags, std::string_view v) { tags.track = leadingInteger(v); }},
    Directive{"#EXTART:", [](Tags &tags, std::string_view v) { tags.artist = v; }},
    Directive{"#EXTALB:", [](Tags &tags, std::string_view v) { tags.album = v; }},
    Directive{"#EXTGENRE:", [](Tags &tags, std::string_view v) { tags.genre = v; }},
};

bool hasControls(std::string_view line) {
    return std::any_of(line.begin(), line.end(),
                       [](char c) { return static_cast<unsigned char>(c) < ' ' && c != '\t'; });
}

class Reader {
  public:
    explicit Reader(Playlist &playlist) : playlist_(playlist) {}

    void take(std::string_view line) {
        if (trimmed(line).empty() || startsIgnoringCase(line, "#EXTM3U")) {
            return;
        }
        if (line.front() == '#' && takeDirective(line)) {
            return;
        }
        if (line.front() == '#' || hasControls(line)) {
            addOptional(line);
        } else {
            playlist_.add(line, pending_).tagsSharedWith = sharedWith_;
            pending_ = {};
            sharedWith_ = 0;
        }
    }

  private:
    bool takeDirective(std::string_view line) {
        for (const Directive &directive : kDirectives) {
            if (startsIgnoringCase(line, directive.start)) {
                directive.take(pending_, line.substr(directive.start.size()));
                sharedWith_ = 0;
                return true;
            }
        }
        return false;
    }

    /* A comment, or the line of a file whose name begins with #, which the library writes as it
     * is. The tags before it are its own then, and those of the next entry otherwise. */
    void addOptional(std::string_view line) {
        playlist_.add(line, pending_).isOptional = true;
        sharedWith_ = sharedWith_ != 0 ? sharedWith_ : playlist_.entries.size();
    }

    Playlist &playlist_;
    Tags pending_;
    std::size_t sharedWith_ = 0;
};

}  // namespace

bool isM3uBegunBy(std::string_view text) {
    return startsIgnoringCase(text, "#EXTM3U") || startsIgnoringCase(text, "#EXTINF:");
}

void readM3u(std::string_view text, Playlist &playlist) {
    if (startsIgnoringCase(trimmed(text), "<?xml")) {
        throw PlaylistError(KLIB_ERR_PLAYLIST_NOT_ONE, "XML and not an m3u playlist");
    }
    Reader reader(playlist);
    Lines lines(text);
    for (std::string_view line; lines.next(line);) {
        reader.take(line);
    }
}

}  // namespace zano::playlists
