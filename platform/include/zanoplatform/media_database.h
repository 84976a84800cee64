/* The media database: songs and playlists as rows, asked with texts.
 *
 * Which database is used stands in the setting `mediadb` (settings.h). Every function may be
 * called from any thread; a result handle belongs to the thread that opened it. Paths are
 * absolute and any bytes but NUL; all other texts are UTF-8.
 *
 * Conditions, select lists and orders come from outside and are not trusted: what is not a
 * plain condition over the columns below makes the open fail and nothing else happens. Queries
 * run on a read-only connection, as one statement, for at most five seconds.
 *
 *   columns     id path title album artist genre track disc year duration bitrate frequency,
 *               and album_artist, of songs; id path title album of playlists
 *   select      "*", or columns with "as": " artist as title "
 *   condition   = <> != < <= > >= , [not] like, [not] ilike, [not] in (..), [not] between,
 *               is [not] null, and, or, not, ( ), numbers, 'texts' with '' for a quote,
 *               lower(), length()
 *   order       columns or lower(column), asc or desc, separated by commas; or RANDOM()
 *
 * `like` is exact; `ilike` ignores case and accents in every script. In both, % stands for any
 * text, _ for one character and \ takes the meaning from the next character. Orders compare
 * texts without regard to case and accents too, so `title` and `lower(title)` sort alike and
 * É stands by E; `=` compares the exact bytes.
 *
 * After a failure, KLIBCErrGet() (error.h) tells why.
 */
#ifndef ZANOPLATFORM_MEDIA_DATABASE_H
#define ZANOPLATFORM_MEDIA_DATABASE_H

#include <vorelix/records.h>
#include <zanoplatform/export.h>

ZANOPLATFORM_C_API_BEGIN

/* Table kinds. */
enum {
    MEDIA_TABLE_SONGS = 0,
    MEDIA_TABLE_PLAYLISTS = 3,
    MEDIA_TABLE_SONG_PATHS = 4 /* the songs again, asked by id for their path */
};

/* An open result. Only the fourth field is for callers; the first three are what it was opened
 * with. */
typedef struct MEDIA_DB_RESULT {
    int tableKind;
    int offset;
    int limit;
    int rowCount; /* rows of the whole query when offset and limit are 0, else 0 */
    void *cursor; /* the platform's own */
} MEDIA_DB_RESULT;

VORELIX_STATIC_ASSERT(offsetof(MEDIA_DB_RESULT, rowCount) == 12, "the fourth field of 32 bits");

/* Opens a query.
 *   table      a table kind
 *   select     the columns wanted; null or "*" for all
 *   condition  null for none
 *   distinct   a column: one row for each distinct value of it; null or "" for none
 *   orderBy    null for the order of the ids
 *   offset, limit  the page; limit 0 with offset 0: all rows; limit 0 with an offset: all
 *              rows from there; negative values count as 0
 *   flag       no effect; kept for callers that pass one
 * Returns a handle for MediaInfoDBClose, or null: bad text, no database, or out of time. */
ZANOPLATFORM_API MEDIA_DB_RESULT *MediaInfoDBOpen(int table, const char *select,
                                                  const char *condition, const char *distinct,
                                                  const char *orderBy, int offset, int limit,
                                                  int flag);

/* Writes the next row into *row, whole: fields that were not selected are 0 and empty, texts
 * are cut to their fields between characters. 0, or -1 when no row is left (*row is then
 * untouched; after a failure too, and KLIBCErrGet() is not 0 then). */
ZANOPLATFORM_API int MediaInfoDBGet(MEDIA_DB_RESULT *result, ZANO_MEDIA_INFO *row);

/* Releases a handle; null is allowed. */
ZANOPLATFORM_API void MediaInfoDBClose(MEDIA_DB_RESULT *result);

/* COUNT(countExpression) under the condition: "*", a column, or "DISTINCT column"; a null condition
 * counts all rows. The last two arguments are 0. The count, or -1: bad text, no database, or out of
 * time. */
ZANOPLATFORM_API int MediaInfoDBGetCount(int table, const char *countExpression,
                                         const char *condition, int, int);

/* Playlist rows (table 3; every other table is refused with -1).
 * Save inserts row->path, title and album under a new id, or, when the path is there already,
 * writes title and album over it and keeps the id. Update changes path, title and album of the
 * row with row->id; -1 when there is none. Delete removes the row of the path; that there was
 * none is not a failure. 0, or -1 with the database as it was. */
ZANOPLATFORM_API int MediaInfoDBSave(int table, const ZANO_MEDIA_INFO *row);
ZANOPLATFORM_API int MediaInfoDBUpdate(int table, const ZANO_MEDIA_INFO *row);
ZANOPLATFORM_API int MediaInfoDBDelete(int table, const char *path);

/* Frees a whole track list with free(), following next; null is allowed. */
ZANOPLATFORM_API void ZANOPlaylistRecFree(ZANO_PLAYLIST_REC *list);

/* Tells the indexer of a changed playlist file by a durable row that zanoindex consumes.
 * operation: 1 inserted, 2 deleted, 4 updated and moved from formerPath, 5 updated in place;
 * formerPath may be null. 0, or -1 when the notice could not be kept. */
ZANOPLATFORM_API int KLIBZanoFileIndexAdd(const char *path, const char *formerPath, int operation);

ZANOPLATFORM_C_API_END

#endif
