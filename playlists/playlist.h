/* Lists of tracks and of playlists, and songs looked up by their ids.
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

VORELIX_C_API_END

#endif
