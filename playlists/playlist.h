/* Lists of tracks and of playlists, songs looked up by their ids, the catalogue of the shared
 * playlists, which are the files that the media database has rows for, personal playlists, which
 * are found on disk, and the writing and editing of both.
 *
 * Texts are UTF-8 and end with NUL, paths any bytes but NUL. A size is that of the buffer in bytes,
 * the NUL included: what does not fit is cut, and nothing is written when it is below 1.
 *
 * A list is its head pointer; null is the empty list and every function takes it. Nodes are
 * blocks of their own from malloc or calloc. A list belongs to the caller: track lists are
 * released with ZANOPlaylistRecFree (zanoplatform/media_database.h), lists of playlists with
 * ZANOPlayListFree. Two threads may not use one list at once. C11 and C++.
 */
#ifndef VORELIX_PLAYLISTS_PLAYLIST_H
#define VORELIX_PLAYLISTS_PLAYLIST_H

#include <vorelix/export.h>
#include <vorelix/records.h>

VORELIX_C_API_BEGIN

/* Reverses the links in place and returns the new head; the old head is then the last node. */
VORELIX_API ZANO_PLAYLIST_REC *PlaylistRecReverse(ZANO_PLAYLIST_REC *list);
VORELIX_API ZANO_PLAYLIST *PlaylistReverse(ZANO_PLAYLIST *list);

/* The number of nodes; 0 for null. */
VORELIX_API unsigned ZANOPlaylistRecCount(const ZANO_PLAYLIST_REC *list);
VORELIX_API unsigned ZANOPlaylistCount(const ZANO_PLAYLIST *list);

/* Frees every node with free() and returns null, to be stored in the caller's head. */
VORELIX_API ZANO_PLAYLIST *ZANOPlayListFree(ZANO_PLAYLIST *list);

/* The songs of a list of ids, in the order of the ids.
 *   list   the caller's head; null on entry
 *   ids    decimal ids separated by commas, "7,3,7"; of any length
 * 0: the list holds the songs. An id listed twice gives one node, at its first place; an id that
 * names no song gives none. That no song was found is not a failure: the list is empty.
 * -1, with a line in the system log and *list null: a null list, null or empty ids, no database,
 * out of memory, or ids that the database does not take as "id in (ids)". They are put there as
 * they are, without escaping: a text that is not a number spoils the whole query, and nothing
 * else. Of ids that the database takes, one with anything behind its digits ("3 ,7") is left
 * out. When the string list cannot be made (zanoplatform/strings.h), the list is empty and the
 * result 0: intended and kept. */
VORELIX_API int ZANOMusicListGetByID(ZANO_PLAYLIST_REC **list, const char *ids);

/* The shared playlists of a list of ids, in the order of the database.
 *   list   the caller's head; null on entry
 *   ids    decimal ids separated by commas, "7,3,7"; put into the condition as they are, without
 *          escaping, so that what is no list of ids makes the database refuse it
 * 0: the list holds a node for each playlist found, of which only the path is filled. It is empty
 * when none was found, and also, without a line in the log, when the database cannot be opened or
 * refuses the ids. -1, logged, with *list null: a null list, null or empty ids, out of memory. */
VORELIX_API int ZANOPlayListListGetByID(ZANO_PLAYLIST **list, const char *ids);

/* The path of a shared playlist's file.
 *   id         above 0
 *   out, size  receive the path
 * 0, or -1: an id below 1 or a null out, which are logged; no such playlist or no database, which
 * are not. *out is untouched then. */
VORELIX_API int ZANOPlaylistPathGet(int id, char *out, int size);

/* The id of a shared playlist.
 *   path       of its file, exactly as the database has it
 *   out, size  receive the id as decimal text; 11 bytes always suffice
 * 0, or -1: a null or empty path, a null out or out of memory, which are logged; no such playlist
 * or no database, which are not. *out is untouched then. */
VORELIX_API int ZANOPlaylistIDGet(const char *path, char *out, int size);

/* The number of shared playlists, or the database's negative error. */
VORELIX_API int ZANOPlaylistTotalGet(void);

/* A page of the shared playlists under the music root, the folder that the link
 * /var/services/music points to; ordered by title and album, without regard to case.
 *   list           the caller's head; null on entry
 *   offset, limit  the page; both 0: all of them
 *   folderFilter   0: all; else only those whose album, the folder word, is "playlists" in any
 *                  case
 * 0: the list holds the playlists with id, path, title and album. It is empty when there is none,
 * and also, without a line in the log, when the database cannot be opened; a root of more than 469
 * bytes (497 without the filter) spoils the condition, which is cut to 511. -1, with *list null: a
 * null list (not logged), the music link cannot be read, out of memory. */
VORELIX_API int ZANOPlaylistListAll(ZANO_PLAYLIST **list, int offset, int limit, int folderFilter);

/* The title of a shared playlist.
 *   id         as decimal text, of which what follows the digits is not read
 *   out, size  receive the title
 * 0, also when there is no such playlist or no database: *out is untouched then. -1, logged, for a
 * null argument. */
VORELIX_API int ZANOPlaylistTitleGet(const char *id, char *out, int size);

/* The title of the shared playlist with this path. 0, or -1, logged, with *out untouched: a null or
 * empty path, a null out, out of memory, no database, or no such playlist. */
VORELIX_API int ZANOPlaylistTitleGetByPath(const char *path, char *out, int size);

/* Removes the file of each node's path and, whether that worked or not, its row in the database
 * (ZANOPlaylistDBDelete, vorelix/library/musiclib.h). The list itself is not freed. 0, whatever
 * the removals gave; -1, logged, for a null list. */
VORELIX_API int ZANOPlayListUnlink(const ZANO_PLAYLIST *list);

/* Write a whole playlist file in place of what it held.
 *   list     the entries; null for none
 *   records  the same as an array that a null pointer ends; may not be null itself
 *   path     absolute; what follows its last '.', in any case, is the form: wpl, m3u or pls. A file
 *            with another ending is emptied, which is a success; without a '.' nothing is done,
 *            and -1 returned without a line in the log.
 * The entries are only read. Their paths are written from the folder of the playlist ("../a/b.mp3")
 * but for web addresses (http://, in any case), files on USB volumes, what is no absolute path and
 * what would have more than 4095 bytes, which are written as they are; each of the last two is
 * logged. Intended and kept: an entry loses a folder when the playlist's path has, in its place, a
 * longer name that begins with the folder's. In /music/rock.m3u, /music/rock/a.mp3 is written as
 * "a.mp3"; give such an entry the relative path "rock/a.mp3" instead.
 * m3u also has the tags of those entries whose id is 0: title with whole seconds (none without a
 * title), artist, album, genre, year, disc and track, as far as they are there. Lines are cut to
 * 4127 bytes, their ends included; wpl is not escaped.
 *
 * 0, or -1: a null array, a null or empty path, a file that cannot be opened, locked or unlocked;
 * all logged. A writer that finds the file locked (flock) by another does not wait, and has emptied
 * the file by then. Whether the bytes reached the disk is not looked at. Every call, a failed one
 * included, ends with the mode of the path set to 0777; one that fails before it opens the file,
 * for its arguments or the missing '.', closes descriptor 0 of the process. */
VORELIX_API int ZANOWriteMusicPlaylist(const ZANO_PLAYLIST_REC *list, const char *path);
VORELIX_API int ZANOWriteMusicPlaylistWithMediaList(ZANO_MEDIA_INFO **records, const char *path);

/* Edits of a playlist file: all of it is read (zanoplatform/playlist_parser.h), changed in memory
 * and written as the writers above do it.
 *
 *   id         of a shared playlist, as decimal text
 *   path       of a personal playlist's file, absolute
 *   records    a track list; only read, and still the caller's afterwards
 *   positions  those of the entries in the file, from 0
 *
 * 0, or -1 with the file as it was: a null argument, an id that names no playlist, a file that
 * cannot be read, out of memory. -1 also when the file cannot be written, which may have emptied it
 * by then. Failures are logged but for a missing array when appending or removing what is missing.
 *
 * Reading and writing are two steps, and no lock is held from one to the other: of two edits at
 * once one may be lost, and an edit fails when it comes to write while another writes. */

/* Removes the entries at the positions of a selection, "0,4,7"; all of them are positions in the
 * file as it is before the call. What is not the plain decimal number of an entry has no effect. An
 * empty selection is a success that leaves the file as it is; it is logged.
 * Only id, path, title and album are read: an m3u file loses the other tags of the entries that are
 * not in the media database. */
VORELIX_API int ZANOPlaylistRemoveSongs(const char *id, const char *selection);
VORELIX_API int ZANOPersonalPlaylistRemoveSongs(const char *path, const char *selection);

/* Replaces `count` entries from position `start` on by records; with count 0 they are inserted in
 * front of it. Entries are moved by writing a run of them in another order, or by a removal and an
 * insertion.
 *
 * With n records, the new playlist has at most so many entries; what does not fit is left out at
 * its end: intended and kept.
 *   n, when that is more than the playlist has entries;
 *   else entries + n - count, when n is more than count;
 *   else as many as before.
 * Nothing is left out when n is no more than the entries and the run lies within them. -1 also,
 * logged, for a null list of records, for an empty playlist (append to it), and for a start that is
 * not below that number. A negative start means the first entry, but counts as it is in start +
 * count; when that is negative, all old entries follow the records. */
VORELIX_API int ZANOPlaylistUpdateSongs(const char *id, ZANO_PLAYLIST_REC *records, int start,
                                        int count);
VORELIX_API int ZANOPersonalPlaylistUpdateSongs(const char *path, ZANO_PLAYLIST_REC *records,
                                                int start, int count);

/* Writes the first `recordCount` records behind the entries: all of them when it is more than there
 * are, none when it is negative.
 * A playlist that cannot be read counts as empty: intended and kept. Its file then holds the
 * records alone. A caller that must not lose it reads it first. */
VORELIX_API int ZANOPlaylistAppendSongs(const char *id, ZANO_PLAYLIST_REC *records,
                                        int recordCount);
VORELIX_API int ZANOPersonalPlaylistAppendSongs(const char *path, ZANO_PLAYLIST_REC *records,
                                                int recordCount);

/* Removes every entry that is neither in the media database, nor a web address (http://, in any
 * case), nor on a USB volume. Whether a file exists is not looked at. An empty playlist is a
 * failure, as one that cannot be read is. */
VORELIX_API int ZANOPlaylistRemoveMissing(const char *id);
VORELIX_API int ZANOPersonalPlaylistRemoveMissing(const char *path);

/* A page of the personal playlists of a directory: the files "*.m3u" in its folder "playlists",
 * sorted by name as the locale sorts. Names that begin with a dot do not match, nor does "M3U". In
 * the directory's own path * ? [ and \ are part of the pattern, and all of it is cut to 4095 bytes.
 *   list    the caller's head; null on entry
 *   offset  of the first playlist; below 0 counts as 0
 *   limit   the most that are listed; 0 or less: all
 * The number of nodes, also 0. A node has its number in the page from 1 as id, the path, and the
 * file's name without its last extension as title and as album. -1: a null argument (not logged), a
 * file whose status cannot be read, such as a link to nowhere (not logged either), out of memory.
 * The nodes made before a failure stay in the list, the last one first: the caller frees the list
 * in any case. */
VORELIX_API int ZANOPersonalPlaylistListAll(const char *directory, ZANO_PLAYLIST **list, int offset,
                                            int limit);

/* The number of personal playlists of a directory, matched as above. -1, not logged: null, out of
 * memory, or a file whose status cannot be read. */
VORELIX_API int ZANOPersonalPlaylistTotalGet(const char *directory);

/* Takes the first "/.." out of a path, with the component before it: "/a/b/../c" gives "/a/c". Only
 * the first, and by its letters: "/a/b/..c" gives "/ac". A path without one is copied.
 *   path       the first 4095 bytes are looked at
 *   out, size  receive the result, and may not overlap the path
 * 0; -1, logged, for a null argument or a size below 1. */
VORELIX_API int ZANOPathRelativeToABS(const char *path, char *out, int size);

VORELIX_C_API_END

#endif
