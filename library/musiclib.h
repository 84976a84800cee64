/* Songs listed, searched, browsed and counted in the media database, and its table of playlists
 * kept in step with the playlist files.
 *
 * Texts are UTF-8 and end with NUL; sizes are bytes, the NUL included, and a text that does not
 * fit its buffer is cut. A list comes as the address of the caller's head, which is null on
 * entry; it belongs to the caller, who releases it with ZANOPlaylistRecFree
 * (zanoplatform/media_database.h). After a failure the head is null, never half a list.
 *
 * Failures are written to the system log, except where a function says that it does not. The
 * songs that "stand under the music root" are those below the folder that the link
 * /var/services/music points to; its text is put into conditions as it is. What comes from the
 * caller as condition, columns or order reaches the database as it is too: there it is refused
 * when it is anything but what media_database.h describes, and the open fails. Rows are read
 * until the database gives no more: a query that it stops in the middle, at its time limit,
 * makes a shorter list and no failure.
 *
 * The functions keep no state; two threads may call them for different lists. C11 and C++.
 */
#ifndef VORELIX_LIBRARY_MUSICLIB_H
#define VORELIX_LIBRARY_MUSICLIB_H

#include <vorelix/export.h>
#include <vorelix/records.h>

VORELIX_C_API_BEGIN

/* Writes the text that orders a listing: a space, the primary term, the columns album, disc,
 * track, title, artist, genre, year, path and duration, each behind ", ", and a space.
 *   primary    the first term, a direction included: "artist desc"; null or "" for none
 *   out, size  receive the text, cut to the size; null or a size below 1: nothing is written
 * A column is left out when the primary term begins with its very letters: "year desc" leaves
 * out year, but "lower(title) desc" keeps title. The columns carry no direction and so always
 * ascend. Terms and columns are cut to 1023 bytes in all.
 * Returns the length of the whole text, which is `size` or more when it was cut. No failure. */
VORELIX_API int GenerateOrderString(const char *primary, char *out, int size);

/* A page of songs.
 *   category       where the keyword is looked for: 1 title, 2 artist, 3 album, 4 genre, 5 any
 *                  of them; 0 ignores the keyword (which must still be one that can be
 *                  escaped); every other code finds nothing
 *   keyword        any part of the column's text, taken literally but for % and _, the
 *                  database's wildcards; null or "": no search
 *   sortColumn     a column or an expression of one; exactly "random" for a random order; null
 *                  or "": lower(title). With the direction behind it, it is cut to 31 bytes.
 *                  The order goes on as GenerateOrderString describes.
 *   ascending      0: the sort column descends
 *   offset, limit  the page; both 0: all songs
 * 0: the list holds the songs in their order. It is empty when no song matches, and also, without
 * a line in the log, when the database cannot be opened or refuses the query; KLIBCErrGet()
 * (zanoplatform/error.h) tells which of these it was, or that the query was stopped. -1: list is
 * null, the music link cannot be read (also when there is no keyword), the keyword cannot be
 * escaped, or memory ran out.
 *
 * A search covers the songs under the music root; without one, and in category 0, the listing
 * covers the whole table. */
VORELIX_API int ZANOMusicListAll(ZANO_PLAYLIST_REC **list, int category, const char *keyword,
                                 const char *sortColumn, int ascending, int offset, int limit);

/* The path of a song.
 *   out, size  receive it with every ' doubled, to stand between quotes in a condition; a size
 *              below 1: nothing is written
 *   id         decimal; put into the condition as it is, without escaping
 * 0, also when no song has the id: the path is then empty. -1: out or id is null (not logged), no
 * database, an id that makes no condition, or the path cannot be escaped. out is untouched then.
 * After a failed escape the result stays open for the life of the process. */
VORELIX_API int ZANOMusicGetPathById(char *out, int size, const char *id);

/* The artist, album or genre of one song.
 *   category   2 artist, 3 album, 4 genre
 *   out, size  receive the value with every ' doubled; at most 508 bytes and the NUL. A size
 *              below 1: nothing is written
 *   condition  which song; of several the first by id; null for the first of all
 * 0, also when no song matches: the value is then empty. -1: out is null or the category another
 * (neither is logged), no database, a condition that it refuses, or the value cannot be escaped.
 * out is untouched then. After a failed escape the result stays open for the life of the
 * process. */
VORELIX_API int ZANOMusicGetKeyword(int category, char *out, int size, const char *condition);

/* A page of any query, with the number of its rows.
 *   table          a table kind of zanoplatform/media_database.h
 *   select         columns; null for "*". "artist as title" puts a value into the title
 *   condition      null for none
 *   distinct       a column: one row for each of its values; null or "" for none
 *   orderBy        null for the order of the ids
 *   offset, limit  the page; both 0: all rows
 * Returns the number of rows of the whole query, 0 or more, and the list holds the page. With a
 * distinct column they are counted by "DISTINCT column", cut to 1023 bytes.
 * -1: list is null, no database, a text that it refuses, or memory ran out. When only the count
 * fails, its negative result is returned, nothing is logged, and the list is null. */
VORELIX_API int ZANOMusicBrowse(int table, ZANO_PLAYLIST_REC **list, const char *select,
                                const char *condition, const char *distinct, const char *orderBy,
                                int offset, int limit);

/* The number of rows that pages are made of.
 *   songs              0: the playlists under the music root, whatever category and keyword;
 *                      else the songs
 *   category, keyword  as for ZANOMusicListAll
 *   count              receives the number
 * 0, also when the database cannot be opened or refuses the query: *count is untouched then and
 * nothing is logged. -1: count is null (not logged), the music link cannot be read, the keyword
 * cannot be escaped, or memory ran out; *count is untouched.
 *
 * This is not always the number of songs that ZANOMusicListAll lists, and is meant so: without a
 * keyword only the songs under the music root are counted, while category 0 with a keyword counts
 * every song; and backslashes of the keyword keep their meaning as the database's escape
 * character. */
VORELIX_API int ZANOPageTotalRowCount(int songs, int category, const char *keyword, int *count);

/* The row of a playlist file, of which the path, title and album count, is inserted and the
 * indexer told of the file. 0, whatever came of telling the indexer; -1 when the database does not
 * take the row, which is logged. */
VORELIX_API int ZANOPlaylistDBSave(const ZANO_MEDIA_INFO *row);

/* Changes path, title and album of the playlist with the id of the row, and tells the indexer.
 *   formerPath  where the file was before; null when it did not move
 * 0, whatever came of telling the indexer; -1 when the database does not change the row, which is
 * logged. */
VORELIX_API int ZANOPlaylistDBUpdate(const ZANO_MEDIA_INFO *row, const char *formerPath);

/* Removes the row of a playlist file, which itself is left alone, and tells the indexer. When the
 * database fails to remove the row, the program /usr/zano/bin/zanoindex is asked to, and waited
 * for: see ZANOExec (vorelix/misc/misc.h) for what that means to other threads. The path may not be
 * null. Returns what KLIBZanoFileIndexAdd (zanoplatform/media_database.h) returns: 0, or -1 when
 * the indexer could not be told. A row that could not be removed is no failure, and nothing is
 * logged. */
VORELIX_API int ZANOPlaylistDBDelete(const char *path);

VORELIX_C_API_END

#endif
