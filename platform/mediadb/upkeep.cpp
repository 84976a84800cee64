#include <zanoplatform/media_database_upkeep.h>

#include <zanoplatform/error.h>

#include <cstdio>

#include "guarded.h"
#include "located.h"
#include "transfer.h"

namespace zano::mediadb {
namespace {

std::string locationOf(const char *location) {
    return location != nullptr ? location : configuredLocation();
}

/* Who is told, if anybody. */
struct Listener {
    MEDIA_DB_PROGRESS progress;
    void *context;

    void operator()(int phase, std::int64_t done, std::int64_t total) const {
        if (progress != nullptr) {
            progress(context, phase, done, total);
        }
    }
    Catalogue::Progress ofIndexes() const {
        return [*this](int done, int total) { (*this)(MEDIA_DB_INDEXING, done, total); };
    }
};

MEDIA_DB_CONTENTS recordOf(const Contents &contents) {
    return {contents.songs, contents.playlists, contents.notices};
}

MEDIA_DB_CHECKED check(const std::string &location) {
    const auto snapshot = openSnapshot(location);
    snapshot->check();
    return {recordOf(snapshot->contents()), snapshot->isIndexed() ? 1 : 0};
}

MEDIA_DB_MIGRATED migrate(const std::string &location, const Listener &listener) {
    const std::int64_t before = schemaVersion(location);
    const bool isChanged = openCatalogue(location)->finish(listener.ofIndexes());
    return {before, schemaVersion(location), isChanged ? 1 : 0};
}

template <typename Result>
int give(Result *out, const Result &result) {
    if (out != nullptr) {
        *out = result;
    }
    return 0;
}

}  // namespace
}  // namespace zano::mediadb

using namespace zano::mediadb;

int MediaInfoDBLocationGet(const char *location, char *out, int size) {
    return guarded([&] {
        if (out == nullptr || size <= 0) {
            throw DatabaseError(KLIB_ERR_BAD_PARAMETER, "no room for the location");
        }
        const std::string used = locationOf(location);
        std::snprintf(out, static_cast<size_t>(size), "%s", withoutPassword(used, used).c_str());
        return 0;
    });
}

int MediaInfoDBCheck(const char *location, MEDIA_DB_CHECKED *result) {
    return guarded([&] {
        const std::string used = locationOf(location);
        return give(result, at(used, [&] { return check(used); }));
    });
}

int MediaInfoDBMigrate(const char *location, MEDIA_DB_MIGRATED *result, MEDIA_DB_PROGRESS progress,
                       void *context) {
    return guarded([&] {
        const std::string used = locationOf(location);
        return give(result, at(used, [&] { return migrate(used, {progress, context}); }));
    });
}

int MediaInfoDBCopy(const char *from, const char *to, int replace, MEDIA_DB_CONTENTS *result,
                    MEDIA_DB_PROGRESS progress, void *context) {
    return guarded([&] {
        const Listener listener{progress, context};
        const auto onRow = [&](std::int64_t done, std::int64_t total) {
            listener(MEDIA_DB_COPYING, done, total);
        };
        return give(result, recordOf(copyDatabase(locationOf(from), locationOf(to), replace != 0,
                                                  {onRow, listener.ofIndexes()})));
    });
}
