#include "resolver.h"

#include <zanoplatform/error.h>
#include <zanoplatform/sql_escape.h>

#include <algorithm>
#include <array>
#include <climits>
#include <cstring>
#include <new>

#include "text.h"
#include "text/fold.h"

namespace zano::playlists {
namespace {

/* Paths in one query, and their bytes: nearly every playlist is one batch. */
constexpr std::size_t kBatchPaths = 40000;
constexpr std::size_t kBatchBytes = 3U << 20;
/* Entries whose other readings are in memory at once. */
constexpr std::size_t kChunkEntries = 10000;

constexpr std::array<std::string_view, 13> kColumns = {
    "id",   "path",     "title",   "album",     "artist", "album_artist", "genre",
    "year", "duration", "bitrate", "frequency", "track",  "disc"};

struct CloseResult {
    void operator()(MEDIA_DB_RESULT *result) const { MediaInfoDBClose(result); }
};
using QueryResult = std::unique_ptr<MEDIA_DB_RESULT, CloseResult>;

[[noreturn]] void throwPlatformError() {
    const std::string text = KLIBCErrTextGet();
    throw PlaylistError(KLIBCErrGet(), text);
}

/* A node without contents. */
RecordList newRecord() {
    RecordList record(static_cast<ZANO_PLAYLIST_REC *>(std::malloc(sizeof(ZANO_PLAYLIST_REC))));
    if (!record) {
        throw std::bad_alloc();
    }
    record->next = nullptr;
    return record;
}

void appendQuoted(std::string &condition, std::string_view text) {
    condition.push_back('\'');
    const std::size_t start = condition.size();
    condition.resize(start + 2 * text.size() + 1);
    const int written =
        ZANODBEscapeString(condition.data() + start, text.data(), static_cast<int>(text.size()));
    condition.resize(start + static_cast<std::size_t>(written));
    condition.push_back('\'');
}

template <std::size_t Size>
void putText(char (&field)[Size], std::string_view text) {
    const std::string_view cut = cutAtCharacter(text, Size - 1);
    std::copy(cut.begin(), cut.end(), field);
    field[cut.size()] = '\0';
}

/* A tag: Windows-1252 when it is not UTF-8. Each text is judged by itself, since the library's
 * own writer puts paths of any bytes beside tags in UTF-8. */
template <std::size_t Size>
void putTag(char (&field)[Size], std::string_view text) {
    if (isUtf8(text)) {
        putText(field, text);
    } else {
        putText(field, fromWindows1252(text));
    }
}

}  // namespace

Fields::Fields(std::string_view list) : areAll_(trimmed(list).empty() || trimmed(list) == "*") {
    select_ = areAll_ ? "*" : "path";
    while (!areAll_ && !list.empty()) {
        const std::size_t end = std::min(list.find(','), list.size());
        const std::string_view name = trimmed(list.substr(0, end));
        const auto *column = std::find_if(
            kColumns.begin(), kColumns.end(),
            [name](std::string_view known) { return equalsIgnoringCase(known, name); });
        if (column == kColumns.end()) {
            throw PlaylistError(KLIB_ERR_BAD_PARAMETER,
                                "there is no field \"" + std::string(name) + "\"");
        }
        if (!has(*column)) {
            columns_.push_back(*column);
            select_.append(*column == "path" ? "" : ", ").append(*column == "path" ? "" : *column);
        }
        list.remove_prefix(std::min(end + 1, list.size()));
    }
}

bool Fields::has(std::string_view column) const {
    return areAll_ || std::find(columns_.begin(), columns_.end(), column) != columns_.end();
}

Resolver::Resolver(std::string_view folder, Playlist &playlist, const Fields &fields)
    : folder_(folder), playlist_(playlist), fields_(fields), places_(playlist.entries.size()) {}

RecordList Resolver::records(int &total) {
    lookUpAsTheyStand();
    lookUpOtherReadings();
    RecordList head;
    ZANO_PLAYLIST_REC *last = nullptr;
    total = 0;
    for (std::size_t entry = 0; entry < places_.size(); ++entry) {
        if (!isKept(entry)) {
            continue;
        }
        ZANO_PLAYLIST_REC *record = recordOf(entry).release();
        if (last == nullptr) {
            head.reset(record);
        } else {
            last->next = record;
        }
        last = record;
        ++total;
    }
    return head;
}

void Resolver::lookUpAsTheyStand() {
    const Locations locations(folder_, playlist_.texts);
    std::vector<Wanted> wanted;
    wanted.reserve(places_.size());
    for (std::uint32_t entry = 0; entry < places_.size(); ++entry) {
        Place &place = places_[entry];
        const std::string_view location = playlist_.entries[entry].location;
        place.isWeb = isWebAddress(location) && !playlist_.entries[entry].isOptional;
        place.path = place.isWeb ? location : locations.path(location);
        if (!place.isWeb && place.path.size() <= kMaxPathBytes) {
            wanted.push_back({place.path, entry, 0});
        }
    }
    lookUp(wanted);
}

/* What the database does not know as it stands may be on the disk, and then it is meant. */
std::vector<std::uint32_t> Resolver::entriesToSearch() {
    std::vector<std::uint32_t> entries;
    FileLookup files;
    for (std::uint32_t entry = 0; entry < places_.size(); ++entry) {
        Place &place = places_[entry];
        if (place.isWeb || place.isFound || place.path.size() > kMaxPathBytes) {
            continue;
        }
        place.isFound = files.isThere(std::string(place.path));
        if (!place.isFound && !playlist_.entries[entry].isOptional) {
            entries.push_back(entry);
        }
    }
    return entries;
}

void Resolver::lookUpOtherReadings() {
    const std::vector<std::uint32_t> entries = entriesToSearch();
    for (std::size_t at = 0; at < entries.size(); at += kChunkEntries) {
        const std::size_t count = std::min(kChunkEntries, entries.size() - at);
        lookUpOtherReadings(std::span(entries).subspan(at, count));
    }
}

void Resolver::lookUpOtherReadings(std::span<const std::uint32_t> entries) {
    TextStore texts;
    const Locations locations(folder_, texts);
    std::vector<Wanted> readings;
    for (const std::uint32_t entry : entries) {
        std::uint32_t reading = 0;
        readings.push_back({places_[entry].path, entry, reading});
        for (const std::string &path : locations.otherPaths(playlist_.entries[entry])) {
            if (path.size() <= kMaxPathBytes) {
                readings.push_back({texts.keep({path}), entry, ++reading});
            }
        }
    }
    std::vector<Wanted> unknown;
    std::copy_if(readings.begin(), readings.end(), std::back_inserter(unknown),
                 [](const Wanted &each) { return each.reading > 0; });
    lookUp(unknown);
    std::vector<Wanted> renamed;
    findOnDisk(readings, renamed);
    lookUp(renamed);
}

/* Settles entries without a row on the first reading that is a file. One that differs from the
 * disk's name in normalisation gets that name, which is to be looked up once more. */
void Resolver::findOnDisk(std::span<const Wanted> readings, std::vector<Wanted> &renamed) {
    const auto settle = [this](const Wanted &reading, const std::string &path) {
        places_[reading.entry].path = playlist_.texts.keep({path});
        places_[reading.entry].isFound = true;
    };
    FileLookup files;
    for (const Wanted &reading : readings) {
        // The first reading, the location as it stands, has been looked at.
        if (reading.reading > 0 && !places_[reading.entry].isFound &&
            files.isThere(std::string(reading.path))) {
            settle(reading, std::string(reading.path));
        }
    }
    for (const Wanted &reading : readings) {
        if (places_[reading.entry].isFound || isAscii(reading.path)) {
            continue;
        }
        if (const auto path = folderNames_.find(reading.path)) {
            settle(reading, *path);
            renamed.push_back({places_[reading.entry].path, reading.entry, 0});
        }
    }
}

void Resolver::lookUp(std::span<const Wanted> wanted) {
    std::vector<const Wanted *> batch;
    for (std::size_t at = 0; at < wanted.size();) {
        batch.clear();
        for (std::size_t bytes = 0;
             at < wanted.size() && batch.size() < kBatchPaths && bytes < kBatchBytes; ++at) {
            batch.push_back(&wanted[at]);
            bytes += wanted[at].path.size();
        }
        std::sort(batch.begin(), batch.end(), [](const Wanted *a, const Wanted *b) {
            return std::tie(a->path, a->entry) < std::tie(b->path, b->entry);
        });
        lookUpBatch(batch);
    }
}

std::string Resolver::conditionOf(std::span<const Wanted *const> batch) {
    std::string condition = "path in (";
    for (std::size_t i = 0; i < batch.size(); ++i) {
        if (i == 0 || batch[i]->path != batch[i - 1]->path) {
            condition.append(i == 0 ? "" : ",");
            appendQuoted(condition, batch[i]->path);
        }
    }
    condition.push_back(')');
    return condition;
}

/* The rows come into the nodes that become the list: a copy of 7 KB each would cost as much as
 * reading them. */
void Resolver::lookUpBatch(std::span<const Wanted *const> batch) {
    const std::string condition = conditionOf(batch);
    /* A limit, though it is never reached: without one the rows would be counted first. */
    const QueryResult result(MediaInfoDBOpen(MEDIA_TABLE_SONGS, fields_.select().c_str(),
                                             condition.c_str(), nullptr, "path", 0,
                                             static_cast<int>(kBatchPaths), 0));
    if (!result) {
        throwPlatformError();
    }
    for (RecordList row = newRecord(); MediaInfoDBGet(result.get(), &row->info) == 0;
         row = newRecord()) {
        const std::string_view path = row->info.path;
        auto at = std::lower_bound(
            batch.begin(), batch.end(), path,
            [](const Wanted *each, std::string_view sought) { return each->path < sought; });
        const Wanted *first = at != batch.end() && (*at)->path == path ? *at : nullptr;
        for (++at; first != nullptr && at != batch.end() && (*at)->path == first->path; ++at) {
            RecordList copy = newRecord();
            std::memcpy(copy.get(), row.get(), sizeof(ZANO_PLAYLIST_REC));
            assign(**at, std::move(copy));
        }
        if (first != nullptr) {
            assign(*first, std::move(row));
        }
    }
    if (KLIBCErrGet() != KLIB_ERR_NONE) {
        throwPlatformError();
    }
}

void Resolver::assign(const Wanted &wanted, RecordList row) {
    Place &place = places_[wanted.entry];
    if (!place.row || wanted.reading < place.reading) {
        place.row = std::move(row);
        place.reading = wanted.reading;
        place.isFound = true;
    }
}

bool Resolver::isKept(std::size_t entry) const {
    return places_[entry].path.size() <= kMaxPathBytes &&
           (places_[entry].isFound || !playlist_.entries[entry].isOptional);
}

RecordList Resolver::recordOf(std::size_t entry) {
    RecordList record = places_[entry].row ? std::move(places_[entry].row) : recordFromTags(entry);
    if (!fields_.has("path")) {
        std::memset(record->info.path, 0, sizeof record->info.path);
    }
    return record;
}

/* calloc: it does not clear again what comes cleared from the system. */
RecordList Resolver::recordFromTags(std::size_t entry) const {
    RecordList record(static_cast<ZANO_PLAYLIST_REC *>(std::calloc(1, sizeof(ZANO_PLAYLIST_REC))));
    if (!record) {
        throw std::bad_alloc();
    }
    ZANO_MEDIA_INFO &info = record->info;
    putText(info.path, places_[entry].path);
    const std::size_t shared = playlist_.entries[entry].tagsSharedWith;
    if (shared != 0 && isKept(shared - 1)) {
        return record;
    }
    const Tags &tags = playlist_.entries[entry].tags;
    if (fields_.has("title")) {
        putTag(info.title, tags.title);
    }
    if (fields_.has("artist")) {
        putTag(info.artist, tags.artist);
    }
    if (fields_.has("album")) {
        putTag(info.album, tags.album);
    }
    if (fields_.has("genre")) {
        putTag(info.genre, tags.genre);
    }
    info.year = fields_.has("year") ? tags.year : 0;
    info.disc = fields_.has("disc") ? tags.disc : 0;
    info.track = fields_.has("track") ? tags.track : 0;
    info.duration = fields_.has("duration") ? static_cast<float>(tags.duration) : 0;
    return record;
}

}  // namespace zano::playlists
