/* Reads playlist files: m3u, m3u8 and pls, which have no standard, and wpl, XML after W3C's SMIL.
 * URIs are those of RFC 3986, file: URIs of RFC 8089. Any thread.
 *
 * What is read: UTF-8 with or without BOM, UTF-16, else Windows-1252; lines that end in LF, CRLF
 * or CR; every extended line that the library writes. Relative entries are taken from the
 * playlist's folder and become absolute paths; file: URIs become paths; web addresses stay as they
 * are. Where the media database and the disk know no file by an entry's own bytes, but by another
 * reading of them, that file is the entry: backslashes and drives of other systems, %20,
 * Windows-1252, composed or decomposed letters. An entry that is found nowhere keeps its own
 * bytes, so that reading and writing a playlist changes no line of it.
 *
 * Ids and tags come from the media database, a few queries for each file and none for an entry;
 * an entry that is not in it keeps the tags of the playlist and id 0. No entry is dropped but
 * what no record can hold: a path of more than 4095 bytes.
 */
#ifndef ZANOPLATFORM_PLAYLIST_PARSER_H
#define ZANOPLATFORM_PLAYLIST_PARSER_H

#include <vorelix/records.h>
#include <zanoplatform/export.h>

ZANOPLATFORM_C_API_BEGIN

/* What KLIBCErrGet() gives for a file, beside the codes of error.h. */
enum {
    KLIB_ERR_PLAYLIST_MISSING = 0x1100,    /* no such id, or no such file */
    KLIB_ERR_PLAYLIST_UNREADABLE = 0x1101, /* no permission, not a regular file, a failed read */
    KLIB_ERR_PLAYLIST_NOT_ONE = 0x1102,    /* an HTML page, a picture, any other text */
    KLIB_ERR_PLAYLIST_TOO_LARGE = 0x1103   /* more than 64 MiB or 1 000 000 entries */
};

/* The entries of a playlist in file order, as a track list for ZANOPlaylistRecFree.
 *   id      of the playlist in the media database, as decimal text
 *   path    of the playlist file, absolute
 *   total   receives the number of entries; may not be null
 *   fields  "*" or null, or the columns wanted: "id, path, title, album"; the others are 0 and
 *           empty then
 * The unnamed arguments have no effect; callers pass 0, 0 and, as the last, 1.
 * Null, with *total 0, for an empty playlist (KLIBCErrGet() is KLIB_ERR_NONE then) and on failure,
 * where KLIBCErrGet() tells why. A media database that cannot be asked is a failure too: entries
 * that all had id 0 would look like songs that are gone. */
ZANOPLATFORM_API ZANO_PLAYLIST_REC *ParsePlayListByField(const char *id, int *total, int, int,
                                                         const char *fields, int);
ZANOPLATFORM_API ZANO_PLAYLIST_REC *ParsePlayListByFieldGivenPath(const char *path, int *total, int,
                                                                  int, const char *fields, int);

ZANOPLATFORM_C_API_END

#endif
