#include "lists.h"

#include <algorithm>
#include <climits>
#include <string_view>

namespace zano::ipod {
namespace {

constexpr const char *kEnding = ".m3u";
constexpr std::size_t kMostTextBytes = 254;
constexpr std::size_t kMostPathBytes = 4094;  // and the line feed

bool isControl(char c) {
    constexpr unsigned char kFirstPrintable = 0x20;
    constexpr unsigned char kDelete = 0x7f;
    const auto byte = static_cast<unsigned char>(c);
    return byte < kFirstPrintable || byte == kDelete;
}

/* At most so many bytes, and no part of a character. */
std::string_view cut(std::string_view text, std::size_t most) {
    if (text.size() <= most) {
        return text;
    }
    const auto isContinuation = [](char c) {
        return (static_cast<unsigned char>(c) & 0xC0U) == 0x80;
    };
    while (most > 0 && isContinuation(text[most])) {
        --most;
    }
    return text.substr(0, most);
}

/* In one line, without blanks at its ends. */
std::string lineOf(std::string text) {
    std::replace_if(text.begin(), text.end(), isControl, ' ');
    const std::size_t first = std::min(text.find_first_not_of(' '), text.size());
    std::string line(cut(std::string_view(text).substr(first), kMostTextBytes));
    line.resize(line.find_last_not_of(' ') + 1);
    return line;
}

std::string titleOf(const Track &track) {
    const std::string title = lineOf(track.title);
    return !title.empty() ? title : lineOf(track.path.substr(track.path.rfind('/') + 1));
}

/* Every key, for the frequency ends a track for one of the readers. */
std::string entryOf(const Track &track) {
    std::string entry;
    const auto add = [&entry](const char *key, const std::string &value) {
        entry.append(key).append(": ").append(value).append("\n");
    };
    add("#title", titleOf(track));
    add("#artist", lineOf(track.artist));
    add("#album", lineOf(track.album));
    add("#genre", lineOf(track.genre));
    add("#duration", std::to_string(track.seconds));
    add("#bitrate", std::to_string(track.kilobits));
    add("#frequency", std::to_string(track.hertz));
    return entry + track.path + "\n";
}

bool canStand(const std::string &path) {
    return path.size() <= kMostPathBytes && path.find('\n') == std::string::npos;
}

/* A name that no other list has; the readers pass over hidden files. */
std::string freeNameOf(const std::string &playlist, const Files &files) {
    std::string name = lineOf(playlist);
    std::replace(name.begin(), name.end(), '/', '_');
    if (name.empty()) {
        name = "Playlist";
    }
    if (name.front() == '.') {
        name.front() = '_';
    }
    std::string suffix = kEnding;
    std::string free;
    for (int number = 2;; ++number) {
        free = std::string(cut(name, NAME_MAX - suffix.size())) + suffix;
        if (!files.contains(free)) {
            return free;
        }
        suffix = " " + std::to_string(number) + kEnding;
    }
}

}  // namespace

Files listsOf(const Contents &contents, std::vector<std::string> &refused) {
    std::vector<std::string> entries;
    std::string all;
    for (const Track &track : contents.tracks) {
        entries.push_back(canStand(track.path) ? entryOf(track) : "");
        if (entries.back().empty()) {
            refused.push_back(track.path);
        }
        all += entries.back();
    }
    Files files{{"tracks.m3u", all}};
    for (const Playlist &playlist : contents.playlists) {
        std::string list;
        for (const std::size_t index : playlist.tracks) {
            list += entries[index];
        }
        files[freeNameOf(playlist.name, files)] = list;
    }
    return files;
}

}  // namespace zano::ipod
