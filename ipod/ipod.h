/* What a program found on an attached iPod and wrote into the folder "/usr/zano/etc/audio/ipod/":
 * the track list "tracks.m3u", and a file of the same form for each playlist.
 *
 *     #title: Song
 *     #artist: Someone
 *     #album: Some Album
 *     #genre: Rock
 *     #duration: 215          seconds
 *     #bitrate: 192           kilobits per second
 *     #frequency: 44100       hertz
 *     /mnt/ipod/Music/F00/ABCD.mp3
 *
 * Keys are compared without regard to case and by their own letters only: "#Titles" is a title too.
 * A value is what follows the first ": " of its line; a line without one has an empty value. A
 * track begins with its title; the first line that is no key is its path and ends it. Lines that
 * begin with a carriage return or a line feed are skipped, as is all before the first title. A
 * second title before the path is logged and skipped. Lines are taken in pieces of at most 4095
 * bytes.
 *
 * The default track list is the playlist that the audio configuration names
 * (vorelix/config/config.h), or, while none is set, tracks.m3u, which is then set there: a caller
 * that may not write the configuration cannot read the list. Without a configuration file, which
 * ZANOSonmiraRestoreConf makes, it cannot be found; the reader of that file then prints to standard
 * output.
 *
 * What fails with -1 frees the list that it made and sets *list to null. C11 and C++. */
#ifndef VORELIX_IPOD_IPOD_H
#define VORELIX_IPOD_IPOD_H

#include <vorelix/export.h>
#include <vorelix/records.h>

VORELIX_C_API_BEGIN

/* One track of the default track list.
 *   info   receives title, artist, album and genre, without blanks at their ends, and, as they
 *          come, the duration and the bitrate in bits per second; the rest is left as it is
 *   index  of the track, from 1; titles that are empty are counted before it, and passed over at it
 * 0, also when there are fewer tracks: info is left as it is then. Reading ends with the frequency
 * and not with the path: a track without one takes over what the next ones have.
 * -1: no configuration or no list (not logged); a null info, an index below 1, or a default that
 * cannot be set, which are logged; a list that cannot be read on, with a part of info filled. */
VORELIX_API int ZANOIPodInfoGet(ZANO_MEDIA_INFO *info, int index);

/* A page of the default track list, in its order. Of a track title, artist, album, genre, duration
 * and path are filled; the texts but for the path end with the line end of their line, as far as
 * they fit: intended and kept. list           the caller's head; null on entry offset, limit  the
 * page; a limit of 0 or less: no track total          receives the number of tracks in the list;
 * null: it is not wanted 0, or -1: no configuration (not logged); a null list, a default that
 * cannot be set, a list that cannot be opened, for which the log names the folder, or no memory,
 * which are logged; a list that cannot be read on. */
VORELIX_API int ZANOIPodInfoGetAll(ZANO_PLAYLIST_REC **list, int offset, int limit, int *total);

/* A page of the tracks of a file, as above but with texts without their line ends.
 *   path           of the file
 *   list           the caller's head; null on entry
 *   offset, limit  the page; a limit of 0 or less: all from the offset on
 * The number of tracks in the file. It is 0, with no list, also when an argument is null, the file
 * cannot be opened, or nothing could be taken before it failed, and then logged but for a file that
 * cannot be read on. -1 for a failure after the first track was taken. */
VORELIX_API int ZANOIPodListSongsAll(const char *path, ZANO_PLAYLIST_REC **list, int offset,
                                     int limit);

/* The playlists of the iPod: every file in the folder whose name has a dot in it and does not begin
 * with one, but for tracks.m3u; sorted by name as the locale sorts. A node has the path, and the
 * name without its last extension as title; its id is 0. Changes the working directory while it
 * runs: no other thread may rely on it. 0, also when there is none. -1: a null list, or a working
 * directory whose name cannot be read, which are logged; no such folder, or one that may not be
 * entered, which are not; memory ran out, logged, and the working directory stays the folder. */
VORELIX_API int ZANOIPodPlaylistGetAll(ZANO_PLAYLIST **list);

VORELIX_C_API_END

#endif
