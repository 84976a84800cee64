#include "locations.h"

#include <algorithm>
#include <charconv>
#include <optional>

#include "text.h"

namespace zano::playlists {
namespace {

constexpr auto kNone = std::string_view::npos;

/* More readings than real entries have; each costs a look into the database. */
constexpr std::size_t kMaxReadings = 48;

constexpr bool isLetter(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z');
}

bool isSchemeCharacter(char c) {
    return isLetter(c) || (c >= '0' && c <= '9') || c == '+' || c == '-' || c == '.';
}

/* The scheme of scheme://, or "". One letter is a drive. */
std::string_view schemeOf(std::string_view location) {
    const std::size_t end = location.substr(0, 32).find("://");
    if (end == kNone || end < 2 || !isLetter(location.front()) ||
        !std::all_of(location.begin(), location.begin() + static_cast<std::ptrdiff_t>(end),
                     isSchemeCharacter)) {
        return {};
    }
    return location.substr(0, end);
}

bool isFileUri(std::string_view location) {
    return startsIgnoringCase(location, "file:/");
}

/* With %41 read as A; what is not a % and two hexadecimal digits stays. Null when nothing of it
 * is, or when it would put a NUL into a path. */
std::optional<std::string> percentDecoded(std::string_view text) {
    std::string decoded;
    bool isChanged = false;
    while (!text.empty()) {
        unsigned byte = 0;
        const bool isCode =
            text.size() >= 3 && text.front() == '%' &&
            std::from_chars(text.data() + 1, text.data() + 3, byte, 16).ptr == text.data() + 3;
        if (isCode && byte == 0) {
            return std::nullopt;
        }
        decoded.push_back(isCode ? static_cast<char>(byte) : text.front());
        text.remove_prefix(isCode ? 3 : 1);
        isChanged = isChanged || isCode;
    }
    return isChanged ? std::optional(std::move(decoded)) : std::nullopt;
}

/* file:///a, file:/a and file://localhost/a without all that is before /a; another machine's
 * file://host/a keeps //host/a. */
std::string_view withoutFileScheme(std::string_view uri) {
    uri.remove_prefix(std::string_view("file:").size());
    constexpr std::string_view kLocal = "//localhost/";
    if (startsIgnoringCase(uri, kLocal)) {
        return uri.substr(kLocal.size() - 1);
    }
    return uri.substr(0, 3) == "///" ? uri.substr(2) : uri;
}

/* Whether a path has steps "." or "..". */
bool hasSteps(std::string_view path) {
    for (std::size_t at = path.find("/."); at != kNone; at = path.find("/.", at + 1)) {
        const std::string_view rest = path.substr(at + 2);
        if (rest.empty() || rest.front() == '/' || rest == "." || rest.substr(0, 2) == "./") {
            return true;
        }
    }
    return false;
}

/* Without them, by the text alone: the links on the disk may lead elsewhere, but the library
 * writes its relative entries in this way. */
std::string collapsed(std::string_view path) {
    std::string result;
    while (!path.empty()) {
        const std::size_t end = std::min(path.find('/', 1), path.size());
        const std::string_view step = path.substr(0, end);
        if (step == "/..") {
            result.resize(std::min(result.rfind('/'), result.size()));
        } else if (step != "/.") {
            result.append(step);
        }
        path.remove_prefix(end);
    }
    return result.empty() ? "/" : result;
}

/* "C:\a", "C:/a", "\\server\a", "\a", and "/C:/a" and "//server/a" of file: URIs. */
bool isOfOtherSystem(std::string_view location) {
    if (location.substr(0, 1) == "\\" || location.substr(0, 2) == "//") {
        return true;
    }
    location.remove_prefix(location.substr(0, 1) == "/" ? 1 : 0);
    return location.size() > 2 && isLetter(location[0]) && location[1] == ':' &&
           (location[2] == '\\' || location[2] == '/');
}

/* Appends what is not there yet. */
void addNew(std::vector<std::string> &texts, std::string text) {
    if (!text.empty() && texts.size() < kMaxReadings &&
        std::find(texts.begin(), texts.end(), text) == texts.end()) {
        texts.push_back(std::move(text));
    }
}

/* Adds to the texts what `change` makes of each of them. */
template <typename Change>
void addChanged(std::vector<std::string> &texts, Change change) {
    const std::size_t count = texts.size();
    for (std::size_t i = 0; i < count; ++i) {
        if (std::optional<std::string> changed = change(texts[i])) {
            addNew(texts, std::move(*changed));
        }
    }
}

std::string slashed(std::string text) {
    std::replace(text.begin(), text.end(), '\\', '/');
    return text;
}

}  // namespace

bool isWebAddress(std::string_view location) {
    const std::string_view scheme = schemeOf(location);
    return !scheme.empty() && !equalsIgnoringCase(scheme, "file");
}

std::string_view Locations::path(std::string_view location) const {
    if (isFileUri(location)) {
        const std::string_view rest = withoutFileScheme(location);
        const auto decoded = percentDecoded(rest);
        return decoded ? texts_.keep({*decoded}) : rest;
    }
    if (location.front() == '/') {
        return location;
    }
    const std::string_view path = texts_.keep({folder_, "/", location});
    return hasSteps(path) ? texts_.keep({collapsed(path)}) : path;
}

/* Locations that the entry's bytes can be read as. Each line works on what those before it gave:
 * a list from another system has its encoding, its separators and its drives at once. */
std::vector<std::string> Locations::readings(const Entry &entry) const {
    std::vector<std::string> texts;
    addNew(texts, std::string(entry.location));
    addNew(texts, std::string(entry.otherReading));
    addChanged(texts, [](const std::string &text) { return std::string(trimmed(text)); });
    addChanged(texts, [](const std::string &text) {
        return isFileUri(text) ? std::optional(std::string(withoutFileScheme(text))) : std::nullopt;
    });
    addChanged(texts, [](const std::string &text) { return percentDecoded(text); });
    addChanged(texts, [](const std::string &text) {
        return isUtf8(text) ? std::nullopt : std::optional(fromWindows1252(text));
    });
    addChanged(texts, [](const std::string &text) { return std::optional(slashed(text)); });
    return texts;
}

std::vector<std::string> Locations::otherPaths(const Entry &entry) const {
    std::vector<std::string> paths;
    addNew(paths, std::string(path(entry.location)));
    const std::string parent(folder_.substr(0, std::min(folder_.rfind('/'), folder_.size())));
    for (const std::string &reading : readings(entry)) {
        addNew(paths, std::string(path(reading)));
        if (!isOfOtherSystem(reading)) {
            continue;
        }
        /* Drive, share and the folders above the music have other names here. */
        const std::string plain = slashed(reading);
        std::string_view rest = plain;
        for (std::size_t at = rest.find('/'); at != kNone; at = rest.find('/')) {
            rest.remove_prefix(at + 1);
            if (!rest.empty() && rest.front() != '/') {
                addNew(paths, std::string(path(rest)));
                addNew(paths, collapsed((parent + "/").append(rest)));
            }
        }
    }
    for (const Form form : {Form::Composed, Form::Decomposed}) {
        addChanged(paths, [form](const std::string &text) {
            return isAscii(text) ? std::nullopt : normalised(text, form);
        });
    }
    paths.erase(paths.begin());
    return paths;
}

}  // namespace zano::playlists
