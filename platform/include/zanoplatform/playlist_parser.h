/* Reads playlist files: m3u and m3u8, pls, wpl. Any thread.
 *
 * What is read: UTF-8 with or without BOM, UTF-16 with BOM, else Windows-1252; lines that end in
 * LF, CRLF or CR; every extended line that the library writes. Relative entries are taken from the
 * playlist's folder and become absolute paths; file: URIs become paths; backslashes written by
 * other systems become slashes where no file of that name is there; web addresses stay as they
 * are. Ids and tags come from the media database, a few queries for each file and none for an
 * entry; an entry that is not in it keeps the tags of the playlist and id 0. No entry is dropped.
 */
#ifndef ZANOPLATFORM_PLAYLIST_PARSER_H
#define ZANOPLATFORM_PLAYLIST_PARSER_H

#include <vorelix/records.h>
#include <zanoplatform/export.h>

ZANOPLATFORM_C_API_BEGIN

/* The entries of a playlist in file order, as a track list for ZANOPlaylistRecFree.
 *   id      of the playlist in the media database, as decimal text
 *   path    of the playlist file, absolute
 *   total   receives the number of entries; may not be null
 *   fields  "*", or the columns wanted: "id, path, title, album"; the others are 0 and empty then
 * The unnamed arguments have no effect; callers pass 0, 0 and, as the last, 1.
 * Null, with *total 0, for an empty playlist (KLIBCErrGet() is KLIB_ERR_NONE then) and on failure,
 * where KLIBCErrGet() tells why: no such playlist, unreadable, not a playlist, beyond the limits
 * (64 MB a file, 1 000 000 entries), out of memory. */
ZANOPLATFORM_API ZANO_PLAYLIST_REC *ParsePlayListByField(const char *id, int *total, int, int,
                                                         const char *fields, int);
ZANOPLATFORM_API ZANO_PLAYLIST_REC *ParsePlayListByFieldGivenPath(const char *path, int *total, int,
                                                                  int, const char *fields, int);

ZANOPLATFORM_C_API_END

#endif
