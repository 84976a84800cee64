/* The edits of a playlist's file, once for shared and for personal playlists: these differ in how
 * the file is found and in what they log. */
#pragma once

#include <vorelix/records.h>

#include "log_internal.h"
#include "media_rows_internal.h"

namespace vorelix::playlist {

/* What an edit works on. Both texts are the caller's. */
struct Playlist {
    const char *id;  // null: a personal playlist, which is read by its path
    const char *path;

    /* All entries in file order, and their number. Null, with 0, for an empty playlist and for one
     * that cannot be read. */
    RecordList read(const char *fields, int &total) const;
};

/* What the edits of one family log. */
struct EditMessages {
    struct Removal {
        LogMessage<> badParameter;
        LogMessage<> noList;
        LogMessage<> nothingSelected;
        LogMessage<> notParsed;
        LogMessage<const char *> notWritten;
    } removal;
    struct Update {
        LogMessage<> badParameter;
        LogMessage<> notParsed;
        LogMessage<> noArray;
        LogMessage<int, int> badStart;
        LogMessage<const char *> notWritten;
    } update;
    struct Append {
        LogMessage<> badParameter;
        LogMessage<const char *> notWritten;
    } append;
    struct Missing {
        LogMessage<> badParameter;
        void (*notParsed)(const Playlist &playlist);  // the families name different things
        LogMessage<const char *> notWritten;
    } missing;
};

/* As the exported functions of these names; arguments are not null. */
int removeSongs(const Playlist &playlist, const char *selection,
                const EditMessages::Removal &messages);
int updateSongs(const Playlist &playlist, ZANO_PLAYLIST_REC *records, int start, int count,
                const EditMessages::Update &messages);
int appendSongs(const Playlist &playlist, ZANO_PLAYLIST_REC *records, int recordCount,
                const EditMessages::Append &messages);
int removeMissing(const Playlist &playlist, const EditMessages::Missing &messages);

}  // namespace vorelix::playlist
