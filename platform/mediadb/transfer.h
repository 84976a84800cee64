/* A media database as a whole: read at one moment, checked, and copied into another one.
 *
 * Failures throw DatabaseError. Not for use from two threads at once.
 */
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>

#include "catalogue.h"

namespace zano::mediadb {

/* Rows with their ids. What is not here (keys, orders, search index) is made from it. */
struct SongRow : Song {
    std::int64_t id = 0;
};
struct PlaylistRow : PlaylistFile {
    std::int64_t id = 0;
};

/* Rows of each table; or the highest id that each has ever given, 0 for none. */
struct Contents {
    std::int64_t songs = 0;
    std::int64_t playlists = 0;
    std::int64_t notices = 0;
};

/* A media database as it was when it was opened, whoever writes meanwhile. It is only read, by a
 * role that may do no more. */
class Snapshot {
  public:
    virtual ~Snapshot() = default;
    Snapshot(const Snapshot &) = delete;
    Snapshot &operator=(const Snapshot &) = delete;

    virtual Contents contents() = 0;
    virtual Contents lastIds() = 0;
    /* false: a first scan has yet to make its orders and its search index. */
    virtual bool isIndexed() = 0;

    /* All rows by their ids, in one pass and a bounded memory. The callback must not use the
     * snapshot. */
    virtual void forEachSong(const std::function<void(const SongRow &)> &callback) = 0;
    virtual void forEachPlaylist(const std::function<void(const PlaylistRow &)> &callback) = 0;
    virtual void forEachNotice(const std::function<void(const Notice &)> &callback) = 0;

    /* As Catalogue::check(). */
    virtual void check() = 0;

    /* Tells two databases apart whatever their addresses are. */
    virtual std::string identity() = 0;

  protected:
    Snapshot() = default;
};

/* Another content for a database, in one transaction: readers see the former one until commit(),
 * and it stays when there is none. Other writers wait meanwhile. */
class Replacement {
  public:
    virtual ~Replacement() = default;
    Replacement(const Replacement &) = delete;
    Replacement &operator=(const Replacement &) = delete;

    virtual std::string identity() = 0;
    /* What is there so far. */
    virtual Contents contents() = 0;
    /* First of all, takes that away. */
    virtual void clear() = 0;
    /* First all songs, then all playlists, then all notices. */
    virtual void add(const SongRow &song) = 0;
    virtual void add(const PlaylistRow &playlist) = 0;
    virtual void add(const Notice &notice) = 0;
    /* The ids up to lastIds, and those that this database has given itself, are not given again.
     * Then Catalogue::finish() is due. */
    virtual void commit(const Contents &lastIds) = 0;

  protected:
    Replacement() = default;
};

/* The version of an existing database's schema, which is only read; throws when there is none, or
 * it is from a newer version of this program. */
std::int64_t schemaVersion(const std::string &location);

/* Throws as schemaVersion(), and when the schema is older. */
std::unique_ptr<Snapshot> openSnapshot(const std::string &location);

/* Makes a missing database, and brings an older schema up to date, as openCatalogue(). */
std::unique_ptr<Replacement> openReplacement(const std::string &location);

/* Called with the rows done so far and in all; and then, for the orders and the search index of the
 * copy, with parts. */
struct CopyProgress {
    std::function<void(std::int64_t done, std::int64_t total)> rows;
    Catalogue::Progress indexes;
};

/* Copies everything from one location to another and gives how much that was. A target that has
 * songs or playlists is replaced only when `replace` is set. A failure names its location and
 * leaves the target with what it had; but one while indexes are made, which leaves the whole copy,
 * to be finished by Catalogue::finish(). */
Contents copyDatabase(const std::string &from, const std::string &to, bool replace,
                      const CopyProgress &progress);

}  // namespace zano::mediadb
