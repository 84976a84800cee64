#include <zanoplatform/media_database.h>

#include <sys/stat.h>
#include <zanoplatform/error.h>
#include <zanoplatform/settings.h>

#include <array>
#include <cstdlib>
#include <mutex>
#include <optional>
#include <tuple>
#include <utility>

#include "clock_tick.h"
#include "engine.h"
#include "guarded.h"
#include "postgresql/engine.h"
#include "query/parse.h"
#include "sqlite/engine.h"
#include "system_paths_internal.h"

namespace zano::mediadb {
namespace {

struct EngineKind {
    std::string_view scheme;
    std::unique_ptr<Engine> (*make)(const std::string &place);
    std::unique_ptr<Catalogue> (*openCatalogue)(const std::string &place);
    std::int64_t (*schemaVersion)(const std::string &place);
    std::unique_ptr<Snapshot> (*openSnapshot)(const std::string &place);
    std::unique_ptr<Replacement> (*openReplacement)(const std::string &place);
};

constexpr std::array kEngines = {
    EngineKind{"sqlite:", sqlite::makeEngine, sqlite::openCatalogue, sqlite::schemaVersion,
               sqlite::openSnapshot, sqlite::openReplacement},
    EngineKind{"postgresql:", postgresql::makeEngine, postgresql::openCatalogue,
               postgresql::schemaVersion, postgresql::openSnapshot, postgresql::openReplacement},
};

/* The engine that a location names, and the location without the engine's name. */
std::pair<const EngineKind *, std::string> engineOf(const std::string &location) {
    for (const EngineKind &kind : kEngines) {
        if (location.compare(0, kind.scheme.size() + 1, std::string(kind.scheme) + "/") == 0) {
            return {&kind, location.substr(kind.scheme.size())};
        }
    }
    throw DatabaseError(KLIB_ERR_BAD_CONFIGURATION,
                        "the media database (setting mediadb) is neither \"sqlite:\" and an "
                        "absolute path nor a \"postgresql://\" address: " +
                            withoutPassword(location, location));
}

/* The engine of the current settings. Their file is looked at again in every clock tick, so that a
 * long-running program follows a change. A cursor keeps the engine it was opened on. */
class CurrentEngine {
  public:
    std::shared_ptr<Engine> get() {
        const bool isDue = tick_.isAnother();
        const std::lock_guard lock(mutex_);
        if (!engine_ || isDue) {
            followSettings();
        }
        return engine_;
    }

  private:
    void followSettings() {
        struct stat file {};
        const bool isThere = stat(ZANO_PATH_CONF, &file) == 0;
        const Stamp stamp{isThere, file.st_ino, file.st_size, file.st_mtim.tv_sec,
                          file.st_mtim.tv_nsec};
        if (engine_ && stamp == stamp_) {
            return;
        }
        // Settings that name no engine leave none, so that every call fails and looks again.
        std::shared_ptr<Engine> former = std::exchange(engine_, nullptr);
        const std::string location = configuredLocation();
        if (!former || location != location_) {
            const auto [kind, place] = engineOf(location);
            former = kind->make(place);
            location_ = location;
        }
        engine_ = std::move(former);
        stamp_ = stamp;
    }

    using Stamp = std::tuple<bool, ino_t, off_t, time_t, long>;
    ClockTick tick_;
    std::mutex mutex_;
    std::shared_ptr<Engine> engine_;
    std::string location_;
    Stamp stamp_;
};

std::shared_ptr<Engine> currentEngine() {
    static CurrentEngine current;
    return current.get();
}

Table tableOf(int kind) {
    switch (kind) {
        case MEDIA_TABLE_SONGS:
        case MEDIA_TABLE_SONG_PATHS:
            return Table::Songs;
        case MEDIA_TABLE_PLAYLISTS:
            return Table::Playlists;
        default:
            throw QueryError("there is no table of kind " + std::to_string(kind));
    }
}

/* A program asks for the same few orders again and again. */
void readOrder(const char *text, Query &query) {
    struct Known {
        Table table = Table::Songs;
        std::string text;
        std::vector<OrderTerm> order;
        bool random = false;
    };
    thread_local Known known;
    const std::string_view view = text != nullptr ? text : "";
    if (known.text != view || known.table != query.table) {
        parseOrder(text, query);
        known = {query.table, std::string(view), query.order, query.random};
    }
    query.order = known.order;
    query.random = known.random;
}

struct Held {
    std::shared_ptr<Engine> engine;
    std::unique_ptr<Cursor> cursor;  // ends before its engine
};

int clampedToInt(std::int64_t count) {
    return static_cast<int>(std::min<std::int64_t>(count, INT32_MAX));
}

void requirePlaylists(int table, const void *argument) {
    if (table != MEDIA_TABLE_PLAYLISTS || argument == nullptr) {
        throw DatabaseError(KLIB_ERR_BAD_PARAMETER, "only rows of playlists can be written");
    }
}

/* What may be a password in an address that need not be a right one: what stands between the first
 * colon and the last @ before the path, and the parameter of that name. */
std::vector<std::string> passwordsIn(const std::string &location) {
    std::vector<std::string> found;
    const size_t scheme = location.find("://");
    const size_t host = scheme == std::string::npos ? std::string::npos : scheme + 3;
    const size_t at = location.rfind('@');
    const size_t colon = location.find(':', host);
    if (host != std::string::npos && at != std::string::npos && colon < at) {
        found.push_back(location.substr(colon + 1, at - colon - 1));
    }
    for (size_t begin = location.find_first_of("?&"); begin != std::string::npos;
         begin = location.find('&', begin + 1)) {
        constexpr std::string_view kNames[] = {"password=", "sslpassword="};
        for (const std::string_view name : kNames) {
            if (location.compare(begin + 1, name.size(), name) == 0) {
                const size_t value = begin + 1 + name.size();
                found.push_back(location.substr(value, location.find('&', value) - value));
            }
        }
    }
    return found;
}

}  // namespace

std::string withoutPassword(std::string text, const std::string &location) {
    for (const std::string &password : passwordsIn(location)) {
        for (size_t at = text.find(password); !password.empty() && at != std::string::npos;
             at = text.find(password, at + 3)) {
            text.replace(at, password.size(), "***");
        }
    }
    return text;
}

std::string configuredLocation() {
    return ZanoConf().Info("mediadb", "sqlite:" ZANO_PATH_MEDIA_DB);
}

std::unique_ptr<Engine> makeEngine(const std::string &location) {
    const auto [kind, place] = engineOf(location);
    return kind->make(place);
}

std::unique_ptr<Catalogue> openCatalogue() {
    return openCatalogue(configuredLocation());
}

std::unique_ptr<Catalogue> openCatalogue(const std::string &location) {
    const auto [kind, place] = engineOf(location);
    return kind->openCatalogue(place);
}

std::int64_t schemaVersion(const std::string &location) {
    const auto [kind, place] = engineOf(location);
    return kind->schemaVersion(place);
}

std::unique_ptr<Snapshot> openSnapshot(const std::string &location) {
    const auto [kind, place] = engineOf(location);
    return kind->openSnapshot(place);
}

std::unique_ptr<Replacement> openReplacement(const std::string &location) {
    const auto [kind, place] = engineOf(location);
    return kind->openReplacement(place);
}

}  // namespace zano::mediadb

using namespace zano::mediadb;

MEDIA_DB_RESULT *MediaInfoDBOpen(int table, const char *select, const char *condition,
                                 const char *distinct, const char *orderBy, int offset, int limit,
                                 int) {
    std::unique_ptr<MEDIA_DB_RESULT> result;
    const int status = guarded([&] {
        Query query;
        query.table = tableOf(table);
        query.select = parseSelect(query.table, select);
        query.condition = parseCondition(query.table, condition);
        query.distinct = parseDistinct(query.table, distinct);
        readOrder(orderBy, query);
        query.offset = std::max(offset, 0);
        query.limit = std::max(limit, 0);
        auto held = std::make_unique<Held>();
        held->engine = currentEngine();
        held->cursor = held->engine->open(std::move(query));
        const bool isWhole = offset <= 0 && limit <= 0;
        const int rows = isWhole ? clampedToInt(held->cursor->countAll()) : 0;
        result = std::make_unique<MEDIA_DB_RESULT>();
        *result = {table, offset, limit, rows, nullptr};
        result->cursor = held.release();
        return 0;
    });
    return status == 0 ? result.release() : nullptr;
}

int MediaInfoDBGet(MEDIA_DB_RESULT *result, ZANO_MEDIA_INFO *row) {
    return guarded([&] {
        if (result == nullptr || row == nullptr) {
            throw DatabaseError(KLIB_ERR_BAD_PARAMETER, "no result or no record given");
        }
        return static_cast<Held *>(result->cursor)->cursor->next(*row) ? 0 : -1;
    });
}

void MediaInfoDBClose(MEDIA_DB_RESULT *result) {
    if (result != nullptr) {
        delete static_cast<Held *>(result->cursor);
        delete result;
    }
}

int MediaInfoDBGetCount(int table, const char *countExpression, const char *condition, int, int) {
    return guarded([&] {
        CountQuery query;
        query.table = tableOf(table);
        query.distinct = parseCountExpression(query.table, countExpression);
        query.condition = parseCondition(query.table, condition);
        return clampedToInt(currentEngine()->count(query));
    });
}

int MediaInfoDBSave(int table, const ZANO_MEDIA_INFO *row) {
    return guarded([&] {
        requirePlaylists(table, row);
        currentEngine()->savePlaylist(*row);
        return 0;
    });
}

int MediaInfoDBUpdate(int table, const ZANO_MEDIA_INFO *row) {
    return guarded([&] {
        requirePlaylists(table, row);
        if (!currentEngine()->updatePlaylist(*row)) {
            throw DatabaseError(KLIB_ERR_BAD_PARAMETER, "no playlist has this id");
        }
        return 0;
    });
}

int MediaInfoDBDelete(int table, const char *path) {
    return guarded([&] {
        requirePlaylists(table, path);
        currentEngine()->deletePlaylist(path);
        return 0;
    });
}

void ZANOPlaylistRecFree(ZANO_PLAYLIST_REC *list) {
    while (list != nullptr) {
        ZANO_PLAYLIST_REC *next = list->next;
        std::free(list);
        list = next;
    }
}

int KLIBZanoFileIndexAdd(const char *path, const char *formerPath, int operation) {
    return guarded([&] {
        if (path == nullptr) {
            throw DatabaseError(KLIB_ERR_BAD_PARAMETER, "no path given");
        }
        currentEngine()->addNotice({0, path, formerPath != nullptr ? formerPath : "", operation});
        return 0;
    });
}
