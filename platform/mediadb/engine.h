/* The reading side of the media database: one engine answers what was parsed into a Query.
 *
 * A second engine is one more implementation of Engine and of Catalogue (catalogue.h), and a
 * row in the table of engines in media_database.cpp. Failures throw DatabaseError.
 */
#pragma once

#include <vorelix/records.h>
#include <cstdint>
#include <memory>
#include <string>

#include "catalogue.h"
#include "query/expression.h"

namespace zano::mediadb {

/* The rows of one query. Sees the database as it was when the query was opened. */
class Cursor {
  public:
    virtual ~Cursor() = default;
    Cursor(const Cursor &) = delete;
    Cursor &operator=(const Cursor &) = delete;

    /* Writes the next row whole, with 0 and "" in what was not selected; false: none is left. */
    virtual bool next(ZANO_MEDIA_INFO &row) = 0;

    /* The rows of a query without offset and limit; counts them without fetching them. */
    virtual std::int64_t countAll() = 0;

  protected:
    Cursor() = default;
};

/* Safe to use from several threads. */
class Engine {
  public:
    virtual ~Engine() = default;
    Engine(const Engine &) = delete;
    Engine &operator=(const Engine &) = delete;

    /* A cursor may be used by one thread at a time, and must end before the engine does. */
    virtual std::unique_ptr<Cursor> open(Query query) = 0;
    virtual std::int64_t count(const CountQuery &query) = 0;

    /* Playlist rows, as media_database.h says; false: there is no such row. */
    virtual void savePlaylist(const ZANO_MEDIA_INFO &row) = 0;
    virtual bool updatePlaylist(const ZANO_MEDIA_INFO &row) = 0;
    virtual bool deletePlaylist(const std::string &path) = 0;
    virtual void addNotice(const Notice &notice) = 0;

  protected:
    Engine() = default;
};

/* The engine of a location, as the setting mediadb names one. Throws DatabaseError when it names
 * none. */
std::unique_ptr<Engine> makeEngine(const std::string &location);

/* How long a query may take, in milliseconds. */
constexpr int kQueryLimitMs = 5000;

}  // namespace zano::mediadb
