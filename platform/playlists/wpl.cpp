/* wpl: XML whose media elements name the files. The library's own writer escapes nothing, so this
 * is a scanner for elements and not a parser of XML. */
#include <algorithm>
#include <charconv>
#include <optional>

#include "format.h"
#include "text.h"

namespace zano::playlists {
namespace {

constexpr auto kNone = std::string_view::npos;

/* What the library's writer begins with, and no other program does. */
constexpr std::string_view kOwnStart =
    "<?wpl version=\"1.0\"?>\r\n<smil>\r\n<head></head>\r\n<body>\r\n<seq>\r\n";
/* What no value goes across. */
constexpr std::string_view kLineEnds("\r\n\0", 3);
constexpr std::string_view kOwnEntryStart = "<media src=\"";
constexpr std::string_view kOwnEntryEnd = "\"/>";

struct Entity {
    std::string_view name;
    char character;
};
constexpr std::array kEntities = {Entity{"amp", '&'}, Entity{"lt", '<'}, Entity{"gt", '>'},
                                  Entity{"quot", '"'}, Entity{"apos", '\''}};

std::optional<std::string> numberedCharacter(std::string_view name) {
    if (name.empty() || name.front() != '#') {
        return std::nullopt;
    }
    name.remove_prefix(1);
    const bool isHex = !name.empty() && (name.front() == 'x' || name.front() == 'X');
    name.remove_prefix(isHex ? 1 : 0);
    unsigned code = 0;
    const auto result =
        std::from_chars(name.data(), name.data() + name.size(), code, isHex ? 16 : 10);
    if (result.ec != std::errc() || result.ptr != name.data() + name.size()) {
        return std::nullopt;
    }
    return characterText(code);
}

std::optional<std::string> entityText(std::string_view name) {
    for (const Entity &entity : kEntities) {
        if (entity.name == name) {
            return std::string(1, entity.character);
        }
    }
    return numberedCharacter(name);
}

/* With entities replaced; what is none stays. */
std::string_view unescaped(std::string_view text, TextStore &texts) {
    constexpr std::size_t kLongestEntity = 10;
    if (text.find('&') == kNone) {
        return text;
    }
    std::string plain;
    while (!text.empty()) {
        const std::size_t end = text.substr(0, kLongestEntity).find(';');
        const auto character = text.front() == '&' && end != kNone
                                   ? entityText(text.substr(1, end - 1))
                                   : std::nullopt;
        plain.append(character ? *character : std::string(1, text.front()));
        text.remove_prefix(character ? end + 1 : 1);
    }
    return texts.keep({plain});
}

struct Attribute {
    std::string_view name;
    void (*take)(Entry &entry, std::string_view value);
};

constexpr std::array kAttributes = {
    Attribute{"trackTitle", [](Entry &entry, std::string_view v) { entry.tags.title = v; }},
    Attribute{"trackArtist", [](Entry &entry, std::string_view v) { entry.tags.artist = v; }},
    Attribute{"albumTitle", [](Entry &entry, std::string_view v) { entry.tags.album = v; }},
    Attribute{
        "duration",  // milliseconds
        [](Entry &entry, std::string_view v) { entry.tags.duration = leadingNumber(v) / 1000; }},
};

class Scanner {
  public:
    explicit Scanner(Playlist &playlist) : playlist_(playlist) {}

    /* Takes the media elements of a piece of XML. */
    void scan(std::string_view text) {
        while ((rest_ = fromNextElement(text)).data() != nullptr) {
            takeElement();
            text = rest_;
        }
    }

    bool hasElements() const { return hasElements_; }

  private:
    static constexpr std::string_view kElement = "<media";

    /* Behind the name of the next media element outside of comments; a null view: none. */
    static std::string_view fromNextElement(std::string_view text) {
        for (std::size_t at = text.find('<'); at != kNone; at = text.find('<', at)) {
            const std::string_view here = text.substr(at);
            if (here.substr(0, 4) == "<!--") {
                const std::size_t end = here.find("-->");
                at += end == kNone ? 1 : end;
            } else if (startsIgnoringCase(here, kElement) && here.size() > kElement.size() &&
                       static_cast<unsigned char>(here[kElement.size()]) <= ' ') {
                return here.substr(kElement.size());
            } else {
                ++at;
            }
        }
        return {};
    }

    void takeElement() {
        hasElements_ = true;
        Entry entry;
        for (;;) {
            rest_.remove_prefix(std::min(rest_.find_first_not_of(" \t\r\n/"), rest_.size()));
            if (rest_.empty() || rest_.front() == '>' || rest_.front() == '<') {
                break;
            }
            const std::string_view name = takeUpTo("= \t\r\n/><");
            const auto value = takeValue();
            if (value && equalsIgnoringCase(name, "src")) {
                entry.location = unescaped(*value, playlist_.texts);
                entry.otherReading = *value;
            } else if (value) {
                takeAttribute(entry, name, *value);
            } else if (name.empty()) {
                break;
            }
        }
        if (!trimmed(entry.location).empty()) {
            playlist_.add(entry.location, entry.tags).otherReading = entry.otherReading;
        }
    }

    void takeAttribute(Entry &entry, std::string_view name, std::string_view value) {
        for (const Attribute &attribute : kAttributes) {
            if (equalsIgnoringCase(name, attribute.name)) {
                attribute.take(entry, unescaped(value, playlist_.texts));
            }
        }
    }

    std::string_view takeUpTo(std::string_view ends) {
        return takeTo(std::min(rest_.find_first_of(ends), rest_.size()));
    }

    /* What stands behind = ; null: nothing does, or the text ends within the quotes. */
    std::optional<std::string_view> takeValue() {
        const std::size_t equals = rest_.find_first_not_of(" \t\r\n");
        if (equals == kNone || rest_[equals] != '=') {
            return std::nullopt;
        }
        const std::size_t start = rest_.find_first_not_of(" \t\r\n", equals + 1);
        rest_.remove_prefix(std::min(start, rest_.size()));
        if (rest_.empty() || (rest_.front() != '"' && rest_.front() != '\'')) {
            return rest_.empty() ? std::nullopt : std::optional(takeUpTo({" \t><\r\n\0", 7}));
        }
        const char quote = rest_.front();
        rest_.remove_prefix(1);
        const std::size_t end = rest_.find(quote);
        /* A quote that is missing must not cost the entries behind it. */
        const std::size_t limit = std::min(rest_.find_first_of(kLineEnds), rest_.find(kElement));
        if (end > limit) {
            return withoutEnd(takeTo(limit));
        }
        if (end == kNone) {
            return std::nullopt;
        }
        const std::string_view value = takeTo(end);
        rest_.remove_prefix(1);
        return value;
    }

    static std::string_view withoutEnd(std::string_view value) {
        while (!value.empty() && std::string_view(" \t/>").find(value.back()) != kNone) {
            value.remove_suffix(1);
        }
        return value;
    }

    std::string_view takeTo(std::size_t size) {
        const std::string_view taken = rest_.substr(0, size);
        rest_.remove_prefix(size);
        return taken;
    }

    Playlist &playlist_;
    std::string_view rest_;
    bool hasElements_ = false;
};

/* A line of the library's own writer: everything between the outermost quotes is the path. */
std::optional<std::string_view> ownEntry(std::string_view line) {
    if (line.size() <= kOwnEntryStart.size() + kOwnEntryEnd.size() ||
        line.substr(0, kOwnEntryStart.size()) != kOwnEntryStart ||
        line.substr(line.size() - kOwnEntryEnd.size()) != kOwnEntryEnd) {
        return std::nullopt;
    }
    line.remove_prefix(kOwnEntryStart.size());
    line.remove_suffix(kOwnEntryEnd.size());
    return line;
}

/* Lines that somebody put between our own are scanned as XML. */
void readOwn(std::string_view text, Playlist &playlist) {
    const char *block = text.data();
    const auto scanTo = [&block, &playlist](const char *end) {
        Scanner(playlist).scan({block, static_cast<std::size_t>(end - block)});
        block = end;
    };
    Lines lines(text);
    for (std::string_view line; lines.next(line);) {
        if (const auto path = ownEntry(line)) {
            scanTo(line.data());
            playlist.add(*path).otherReading = unescaped(*path, playlist.texts);
            block = line.data() + line.size();
        }
    }
    scanTo(text.data() + text.size());
}

}  // namespace

bool isWplBegunBy(std::string_view text) {
    return startsIgnoringCase(text, "<?wpl") || startsIgnoringCase(text, "<smil");
}

void readWpl(std::string_view text, Playlist &playlist) {
    if (text.substr(0, kOwnStart.size()) == kOwnStart) {
        readOwn(text.substr(kOwnStart.size()), playlist);
        return;
    }
    Scanner scanner(playlist);
    scanner.scan(text);
    if (!scanner.hasElements() && findIgnoringCase(text, "<smil") == kNone &&
        !isWplBegunBy(trimmed(text))) {
        throw PlaylistError(KLIB_ERR_PLAYLIST_NOT_ONE, "without <smil>, so not a wpl playlist");
    }
}

}  // namespace zano::playlists
