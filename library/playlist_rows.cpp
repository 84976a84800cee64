#include <vorelix/library/musiclib.h>
#include <vorelix/misc/misc.h>
#include <zanoplatform/media_database.h>

#include <array>

#include "messages_internal.h"
#include "system_paths_internal.h"

using namespace vorelix::musiclib;

namespace {

/* What happened to a file, as the indexer counts it. */
enum Operation { kInserted = 1, kDeleted = 2, kMoved = 4, kUpdated = 5 };

void removeByIndexer(const char *path) {
    // Intended and kept: no program name in front. The indexer knows that vector.
    const std::array<char *, 3> arguments{const_cast<char *>("-d"), const_cast<char *>(path),
                                          nullptr};
    ZANOExec(ZANO_PATH_INDEXER, arguments.data(), 1);
}

}  // namespace

int ZANOPlaylistDBSave(const ZANO_MEDIA_INFO *row) {
    if (MediaInfoDBSave(MEDIA_TABLE_PLAYLISTS, row) == -1) {
        kPlaylistNotInserted();
        return -1;
    }
    KLIBZanoFileIndexAdd(row->path, nullptr, kInserted);
    return 0;
}

int ZANOPlaylistDBUpdate(const ZANO_MEDIA_INFO *row, const char *formerPath) {
    if (MediaInfoDBUpdate(MEDIA_TABLE_PLAYLISTS, row) == -1) {
        kPlaylistNotUpdated();
        return -1;
    }
    KLIBZanoFileIndexAdd(row->path, formerPath, formerPath != nullptr ? kMoved : kUpdated);
    return 0;
}

int ZANOPlaylistDBDelete(const char *path) {
    if (MediaInfoDBDelete(MEDIA_TABLE_PLAYLISTS, path) == -1) {
        removeByIndexer(path);
    }
    return KLIBZanoFileIndexAdd(path, nullptr, kDeleted);
}
