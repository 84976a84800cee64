#include "mapping.h"

#include <algorithm>
#include <array>
#include <string_view>
#include <utility>

namespace zano::mime {
namespace {

constexpr const char *kUnknownType = "application/octet-stream";

/* Of playlists and of containers, which are of audio here but not by their types. */
constexpr std::array<std::string_view, 9> kFurtherExtensions{"asf", "asx", "m3u", "m3u8", "m4p",
                                                             "mp4", "pls", "wpl", "xspf"};

/* One type with all its extensions: "aif" and "aiff" in entries of their own would each be found
 * in the other's first. */
struct Entry {
    std::vector<std::string> extensions;
    std::string line;
    bool isWanted = false;  // one of audio or playlists is among the extensions
};

bool isWanted(std::string_view text, const Extension &extension) {
    return extension.isAudio || std::find(kFurtherExtensions.begin(), kFurtherExtensions.end(),
                                          text) != kFurtherExtensions.end();
}

/* The third text is there for extensions that are not listed, but whose text is a part of a type:
 * what is behind the second quote from there is the type of unknown files then. */
std::string makeLine(const std::string &type, const std::vector<std::string> &extensions) {
    std::string line;
    for (const std::string &extension : extensions) {
        line += (line.empty() ? "\"" : " ") + extension;
    }
    return line + "\" \"" + type + "\" \"" + kUnknownType + "\"\n";
}

std::vector<Entry> makeEntries(const Extensions &extensions) {
    std::map<std::string, Entry> entriesOfTypes;
    for (const auto &[text, extension] : extensions) {
        Entry &entry = entriesOfTypes[extension.type.name];
        entry.extensions.push_back(text);
        entry.isWanted = entry.isWanted || isWanted(text, extension);
    }
    std::vector<Entry> entries;
    entries.reserve(entriesOfTypes.size());
    for (auto &[type, entry] : entriesOfTypes) {
        entry.line = makeLine(type, entry.extensions);
        entries.push_back(std::move(entry));
    }
    return entries;
}

/* An extension of another entry in the text of this one; null for none. */
const std::string *findStranger(const Entry &entry, const std::vector<Entry> &entries) {
    for (const Entry &other : entries) {
        for (const std::string &extension : other.extensions) {
            if (&other != &entry && entry.line.find(extension) != std::string::npos) {
                return &extension;
            }
        }
    }
    return nullptr;
}

/* Takes the first entry that has no extension of the others in it; when each has one, the first
 * one that there is. */
Entry takeNext(std::vector<Entry> &waiting, std::vector<std::string> &hidden) {
    auto next = std::find_if(waiting.begin(), waiting.end(), [&](const Entry &entry) {
        return findStranger(entry, waiting) == nullptr;
    });
    if (next == waiting.end()) {
        next = waiting.begin();
        hidden.push_back(*findStranger(*next, waiting));
    }
    Entry taken = std::move(*next);
    waiting.erase(next);
    return taken;
}

}  // namespace

Mapping makeMapping(const Extensions &extensions) {
    std::vector<Entry> entries = makeEntries(extensions);
    const auto others = std::stable_partition(entries.begin(), entries.end(),
                                              [](const Entry &entry) { return entry.isWanted; });
    std::vector<Entry> waiting(std::make_move_iterator(entries.begin()),
                               std::make_move_iterator(others));
    // In front, so that parts of the third text are found here.
    Mapping mapping{makeLine(kUnknownType, {kUnknownType}), {}};
    while (!waiting.empty()) {
        mapping.text += takeNext(waiting, mapping.hidden).line;
    }
    std::for_each(others, entries.end(), [&](const Entry &entry) { mapping.text += entry.line; });
    return mapping;
}

}  // namespace zano::mime
