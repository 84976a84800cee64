/* Upkeep of media databases as a whole: check, bring up to date, copy.
 *
 * A location is written as in the setting `mediadb` (settings.h), "sqlite:/path/to/file" or
 * "postgresql://...", and null stands for the one that is set. Any thread may call. After a
 * failure, KLIBCErrGet() (error.h) tells why, and the text names the location, with stars for a
 * password. A library of another maker need not have these functions: programs that use them are
 * for the bundled one.
 */
#ifndef ZANOPLATFORM_MEDIA_DATABASE_UPKEEP_H
#define ZANOPLATFORM_MEDIA_DATABASE_UPKEEP_H

#include <zanoplatform/export.h>

ZANOPLATFORM_C_API_BEGIN

/* Numbers of rows. A notice is a change that KLIBZanoFileIndexAdd() has noted. */
typedef struct MEDIA_DB_CONTENTS {
    long long songs;
    long long playlists;
    long long notices;
} MEDIA_DB_CONTENTS;

typedef struct MEDIA_DB_CHECKED {
    MEDIA_DB_CONTENTS contents;
    int isIndexed; /* 0: a first scan has yet to make the orders and the search index */
} MEDIA_DB_CHECKED;

typedef struct MEDIA_DB_MIGRATED {
    long long before; /* versions of the schema */
    long long after;
    int isIndexed; /* 1: orders and search index were behind the songs, and no longer are */
} MEDIA_DB_MIGRATED;

/* What is under way, and its unit. */
enum {
    MEDIA_DB_COPYING = 0, /* rows */
    MEDIA_DB_INDEXING = 1 /* parts of the work on orders and search index */
};

/* Called now and then with how much of a phase is done, from 0 to total. Must not fail. */
typedef void (*MEDIA_DB_PROGRESS)(void *context, int phase, long long done, long long total);

/* The location as it may be shown to anybody, cut to size bytes with its end. 0, or -1. */
ZANOPLATFORM_API int MediaInfoDBLocationGet(const char *location, char *out, int size);

/* Looks whether a database is sound: the engine's own check, and whether keys, orders, search
 * index, counted values and places agree with the rows. Needs the right to read and no more, writes
 * nothing and makes nothing; others may write meanwhile. A minute or so for a million songs. 0 with
 * *result (unless null), or -1: there is none, it cannot be read, its schema is older or newer than
 * this library's, or it is damaged. */
ZANOPLATFORM_API int MediaInfoDBCheck(const char *location, MEDIA_DB_CHECKED *result);

/* Brings an older schema up to date, and makes what a first scan that was cut off has left undone.
 * 0 with *result (unless null), or -1: there is no database (none is made), what is there is no
 * media database or is from a newer version (it stays as it is), or it cannot be written. progress
 * may be null. */
ZANOPLATFORM_API int MediaInfoDBMigrate(const char *location, MEDIA_DB_MIGRATED *result,
                                        MEDIA_DB_PROGRESS progress, void *context);

/* Copies songs, playlists and notices with their ids, of one moment, from one location to another,
 * whatever their engines are; ids that one of the two has given are not given again. A missing
 * database is made, but not the PostgreSQL database that it stands in. `to` must not hold songs,
 * playlists or notices (KLIB_ERR_DATABASE_FILLED), unless replace is set. All of it becomes visible
 * at once: until then `to` is as it was, and stays so after a failure or the end of the process
 * (one that was missing is there then, and empty); other writers wait. Then the orders and the
 * search index are made; should that fail, the copy is whole and MediaInfoDBMigrate() does the
 * rest. 0 with *result (unless null), or -1. progress may be null. */
ZANOPLATFORM_API int MediaInfoDBCopy(const char *from, const char *to, int replace,
                                     MEDIA_DB_CONTENTS *result, MEDIA_DB_PROGRESS progress,
                                     void *context);

ZANOPLATFORM_C_API_END

#endif
