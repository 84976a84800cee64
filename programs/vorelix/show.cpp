#include <algorithm>
#include <set>

#include "commands.h"
#include "json.h"
#include "numbers.h"
#include "text.h"

namespace vorelix {

namespace {

/* Each once, in the order they were asked for. */
std::vector<int> unknownIds(const std::vector<int> &ids, const ZANO_PLAYLIST_REC *list) {
    std::set<int> seen;
    for (; list != nullptr; list = list->next) {
        seen.insert(list->info.id);
    }
    std::vector<int> unknown;
    std::copy_if(ids.begin(), ids.end(), std::back_inserter(unknown),
                 [&](int id) { return seen.insert(id).second; });
    return unknown;
}

std::string complaintAbout(const std::vector<int> &unknown) {
    std::string text;
    for (const int id : unknown) {
        text.append(text.empty() ? "no song has the id " : ", ").append(std::to_string(id));
    }
    return text.empty() ? text : text + "; the listings show the ids that exist";
}

std::string detailsOf(const ZANO_MEDIA_INFO &song) {
    const struct {
        const char *label;
        std::string text;
    } lines[] = {
        {"ID        ", std::to_string(song.id)},
        {"Title     ", song.title},
        {"Artist    ", song.artist},
        {"Album     ", song.album},
        {"Genre     ", song.genre},
        {"Year      ", numberText(song.year)},
        {"Track     ", numberText(song.track)},
        {"Disc      ", numberText(song.disc)},
        {"Time      ", durationText(song.duration)},
        {"Bit rate  ", bitrateText(song.bitrate)},
        {"Frequency ", frequencyText(song.frequency)},
        {"Path      ", song.path},
    };
    std::string details;
    for (const auto &line : lines) {
        details += line.label + (line.text.empty() ? "-" : printable(line.text)) + "\n";
    }
    return details;
}

std::string documentOfSongs(const ZANO_PLAYLIST_REC *list, const std::vector<int> &unknown) {
    Json::Value answer(Json::objectValue);
    answer["songs"] = songArray(list);
    Json::Value &missing = answer["unknown"] = Json::Value(Json::arrayValue);
    for (const int id : unknown) {
        missing.append(id);
    }
    return documentOf(answer);
}

}  // namespace

Outcome showCommand(const Request &request, const Terminal &) {
    const SongList songs = songsById(request.ids);
    const std::vector<int> unknown = unknownIds(request.ids, songs.get());
    Outcome outcome{"", complaintAbout(unknown)};
    if (request.json) {
        outcome.text = documentOfSongs(songs.get(), unknown);
        return outcome;
    }
    for (const auto *song = songs.get(); song != nullptr; song = song->next) {
        outcome.text.append(outcome.text.empty() ? "" : "\n").append(detailsOf(song->info));
    }
    return outcome;
}

}  // namespace vorelix
