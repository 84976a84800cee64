#include <vorelix/config/config.h>
#include <vorelix/ipod/ipod.h>
#include <vorelix/misc/misc.h>
#include <vorelix/playlists/playlist.h>
#include <zanoplatform/strings.h>

#include <climits>
#include <cstdlib>

#include "bounded_text_internal.h"
#include "ipod_internal.h"
#include "log_internal.h"
#include "media_rows_internal.h"
#include "system_paths_internal.h"

using vorelix::kNodeSize;
using vorelix::LogMessage;
using vorelix::RecordList;
using vorelix::writeText;
using namespace vorelix::ipod;

namespace {

constexpr const char *kNotSet = "%s (%d) Failed to set default IPod playlist.";
constexpr const char *kSecondTitle = "%s %d Bad Format. Found another #title.";
constexpr const char *kNoNode = "%s (%d) Failed to alloc %d";
constexpr LogMessage<> kGetBadParameters{kUnit, "%s (%d) Bad parameters.", 30};
constexpr LogMessage<> kGetNotSet{kUnit, kNotSet, 39};
constexpr LogMessage<> kGetSecondTitle{kUnit, kSecondTitle, 74};
constexpr LogMessage<> kGetAllBadParameters{kUnit, "%s (%d) Bad parameters.", 160};
constexpr LogMessage<> kGetAllNotSet{kUnit, kNotSet, 169};
constexpr LogMessage<const char *> kGetAllNotOpened{kUnit, "%s(%d): Failed to open %s.", 176};
constexpr LogMessage<> kListBadParameters{kUnit, "%s:%d Bad parameters.", 310};
constexpr LogMessage<const char *> kListNotOpened{kUnit, "%s:%d Failed to open %s.", 316};

/* How one of the two list readers goes about it. */
struct ListReader {
    LogMessage<> secondTitle;
    LogMessage<int> noNode;
    bool dropsLineEnds;
};
constexpr ListReader kGetAllReader{{kUnit, kSecondTitle, 195}, {kUnit, kNoNode, 248}, false};
constexpr ListReader kListReader{
    {kUnit, "%s:%d Bad Format. Found another #title.", 338}, {kUnit, kNoNode, 392}, true};

struct Page {
    int offset;
    int limit;
};

/* The track list that the configuration names, which becomes tracks.m3u when it names none. False,
 * and the failure logged, when that cannot be set. */
bool settleDefault(ZANO_AUDIO_CONF &conf, const LogMessage<> &notSet) {
    if (!vorelix::isEmpty(conf.szDefaultIPodPlaylist)) {
        return true;
    }
    writeText(conf.szDefaultIPodPlaylist, sizeof conf.szDefaultIPodPlaylist,
              ZANO_PATH_IPOD_FOLDER "tracks.m3u");
    if (ZANOAudioDefaultIPodPLSSet(conf.szDefaultIPodPlaylist) == 0) {
        notSet();
        return false;
    }
    return true;
}

/* Reads up to the title of a track, from 1, and takes it; false when there are fewer. */
bool findTrack(Lines &lines, int index, ZANO_MEDIA_INFO &info) {
    int count = 0;
    while (char *const line = lines.next()) {
        strstrip(line);
        if (keyOf(line) != Key::Title || ++count < index) {
            continue;
        }
        char *const title = valueOf(line);
        strstrip(title);
        if (*title != '\0') {
            writeText(info.title, kTextSize, title);
            return true;
        }
        // The next title takes the place of an empty one.
        --count;
    }
    return false;
}

void storeValue(Key key, const char *value, ZANO_MEDIA_INFO &info) {
    const bool isEmpty = *value == '\0';
    if (char *const text = textField(key, info)) {
        if (!isEmpty) {
            writeText(text, kTextSize, value);
        }
    } else if (key == Key::Duration) {
        info.duration = static_cast<float>(numberIn(value));
    } else if (key == Key::Bitrate) {
        info.bitrate = numberIn(value, 1000);
    } else if (key == Key::Frequency && !isEmpty) {
        info.frequency = numberIn(value);
    }
}

/* Intended and kept: the frequency ends a track, and not its path. */
void readTrack(Lines &lines, ZANO_MEDIA_INFO &info) {
    while (char *const line = lines.next()) {
        const Key key = keyOf(line);
        if (key == Key::Title) {
            kGetSecondTitle();
            continue;
        }
        char *const value = valueOf(line);
        strstrip(value);
        storeValue(key, value, info);
        if (key == Key::Frequency) {
            return;
        }
    }
}

void storeListValue(Key key, char *line, const ListReader &reader, ZANO_MEDIA_INFO &track) {
    char *const value = valueOf(line);
    if (char *const text = textField(key, track)) {
        if (reader.dropsLineEnds) {
            trimTrailingNewline(value);
        }
        writeText(text, kTextSize, value);
    } else if (key == Key::Duration) {
        // Intended and kept: bitrate and frequency stay 0.
        track.duration = static_cast<float>(numberIn(value));
    }
}

/* The track whose title line was read; without a path when the file ends first. */
void readListTrack(Lines &lines, char *titleLine, const ListReader &reader,
                   ZANO_MEDIA_INFO &track) {
    track = ZANO_MEDIA_INFO();
    storeListValue(Key::Title, titleLine, reader, track);
    while (char *const line = lines.next()) {
        const Key key = keyOf(line);
        if (key == Key::None) {
            writeText(track.path, sizeof track.path, line);
            KLIBCStrTrimSpace(track.path);
            return;
        }
        if (key == Key::Title) {
            reader.secondTitle();
        } else {
            storeListValue(key, line, reader, track);
        }
    }
}

/* Pushes a track at the head of a list. */
bool push(const ZANO_MEDIA_INFO &track, const ListReader &reader, RecordList &list) {
    auto *const node = static_cast<ZANO_PLAYLIST_REC *>(std::calloc(1, kNodeSize));
    if (node == nullptr) {
        reader.noNode(kNodeSize);
        return false;
    }
    node->info = track;
    node->next = list.release();
    list.reset(node);
    return true;
}

/* Makes the list of a page's tracks, the last one first. `total` receives the number of tracks in
 * the file when its end is reached, or where it cannot be read on. */
bool readTracks(Lines &lines, const Page &page, const ListReader &reader, RecordList &list,
                int &total) {
    ZANO_MEDIA_INFO track;
    int count = 0;
    int taken = 0;
    while (char *const line = lines.next()) {
        if (keyOf(line) != Key::Title) {
            continue;
        }
        readListTrack(lines, line, reader, track);
        if (count >= page.offset && taken < page.limit) {
            if (!push(track, reader, list)) {
                return false;
            }
            ++taken;
        }
        ++count;
    }
    total = count;
    return !lines.haveFailed();
}

bool readDefaultTracks(const Page &page, const ZANO_AUDIO_CONF &conf, RecordList &list,
                       int &total) {
    Lines lines(conf.szDefaultIPodPlaylist);
    if (!lines.areOpen()) {
        // Intended and kept: the folder, not the file.
        kGetAllNotOpened(ZANO_PATH_IPOD_FOLDER);
        return false;
    }
    return readTracks(lines, page, kGetAllReader, list, total);
}

}  // namespace

int ZANOIPodInfoGet(ZANO_MEDIA_INFO *info, int index) {
    ZANO_AUDIO_CONF conf{};
    // Intended and kept: before the arguments are looked at.
    if (ZANOAudioConfGetALL(&conf) == 0) {
        return -1;
    }
    if (info == nullptr || index < 1) {
        kGetBadParameters();
        return -1;
    }
    if (!settleDefault(conf, kGetNotSet)) {
        return -1;
    }
    Lines lines(conf.szDefaultIPodPlaylist);
    if (!lines.areOpen()) {
        return -1;
    }
    if (findTrack(lines, index, *info)) {
        readTrack(lines, *info);
    }
    return lines.haveFailed() ? -1 : 0;
}

int ZANOIPodInfoGetAll(ZANO_PLAYLIST_REC **list, int offset, int limit, int *total) {
    ZANO_AUDIO_CONF conf{};
    if (list != nullptr) {
        *list = nullptr;
    }
    if (ZANOAudioConfGetALL(&conf) == 0) {
        return -1;
    }
    if (list == nullptr) {
        kGetAllBadParameters();
        return -1;
    }
    RecordList tracks;
    int unwanted = 0;
    if (!settleDefault(conf, kGetAllNotSet) ||
        !readDefaultTracks({offset, limit}, conf, tracks, total != nullptr ? *total : unwanted)) {
        return -1;
    }
    *list = PlaylistRecReverse(tracks.release());
    return 0;
}

int ZANOIPodListSongsAll(const char *path, ZANO_PLAYLIST_REC **list, int offset, int limit) {
    if (path == nullptr || list == nullptr) {
        kListBadParameters();
        return 0;
    }
    Lines lines(path);
    if (!lines.areOpen()) {
        kListNotOpened(path);
        return 0;
    }
    RecordList tracks;
    int total = 0;
    if (!readTracks(lines, {offset, limit > 0 ? limit : INT_MAX}, kListReader, tracks, total)) {
        *list = nullptr;
        // Intended and kept: a failure without any track looks like an empty file.
        return tracks != nullptr ? -1 : 0;
    }
    *list = PlaylistRecReverse(tracks.release());
    return total;
}
