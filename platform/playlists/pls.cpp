/* pls: numbered keys, File1=..., Title1=..., Length1=... */
#include <algorithm>
#include <charconv>
#include <cstdint>
#include <unordered_map>

#include "format.h"
#include "text.h"

namespace zano::playlists {
namespace {

struct Key {
    std::string_view name;
    void (*take)(Entry &entry, std::string_view value);
};

constexpr std::array kKeys = {
    Key{"file", [](Entry &entry, std::string_view value) { entry.location = value; }},
    Key{"title", [](Entry &entry, std::string_view value) { entry.tags.title = value; }},
    Key{"length",
        [](Entry &entry, std::string_view value) { entry.tags.duration = leadingNumber(value); }},
};

struct Numbered {
    std::uint64_t number;
    Entry entry;
};

class Reader {
  public:
    void take(std::string_view line) {
        const std::size_t equals = line.find('=');
        if (equals == std::string_view::npos) {
            return;
        }
        const std::string_view key = trimmed(line.substr(0, equals));
        for (const Key &known : kKeys) {
            std::uint64_t number = 0;
            if (startsIgnoringCase(key, known.name) &&
                takeNumber(key.substr(known.name.size()), number)) {
                const std::string_view value = line.substr(equals + 1);
                known.take(entryOf(number, known.name == "file"), value);
                return;
            }
        }
    }

    void finish(Playlist &playlist) {
        std::stable_sort(entries_.begin(), entries_.end(),
                         [](const auto &a, const auto &b) { return a.number < b.number; });
        for (const Numbered &numbered : entries_) {
            if (!trimmed(numbered.entry.location).empty()) {
                playlist.add(numbered.entry.location, numbered.entry.tags);
            }
        }
    }

  private:
    static bool takeNumber(std::string_view text, std::uint64_t &number) {
        const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
        return error == std::errc() && end == text.data() + text.size();
    }

    /* A second file of the same number is an entry of its own. */
    Entry &entryOf(std::uint64_t number, bool isFile) {
        const auto [place, isNew] = places_.try_emplace(number, entries_.size());
        if (!isNew && isFile && !entries_[place->second].entry.location.empty()) {
            place->second = entries_.size();
        }
        if (place->second == entries_.size()) {
            entries_.push_back({number, {}});
        }
        return entries_[place->second].entry;
    }

    std::vector<Numbered> entries_;
    std::unordered_map<std::uint64_t, std::size_t> places_;
};

constexpr std::string_view kSection = "[playlist]";

}  // namespace

bool isPlsBegunBy(std::string_view text) {
    return startsIgnoringCase(text, kSection);
}

void readPls(std::string_view text, Playlist &playlist) {
    Reader reader;
    bool isPls = false;
    Lines lines(text);
    for (std::string_view line; lines.next(line);) {
        isPls = isPls || startsIgnoringCase(trimmed(line), kSection) ||
                startsIgnoringCase(trimmed(line), "file");
        reader.take(line);
    }
    if (!isPls) {
        throw PlaylistError(KLIB_ERR_PLAYLIST_NOT_ONE, "without [playlist], so not a pls playlist");
    }
    reader.finish(playlist);
}

}  // namespace zano::playlists
