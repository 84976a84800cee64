/* The configuration of the audio application: the player's source and modes and the default
 * playlists, in one file for the whole device, "/usr/zano/etc/audio/audio.conf":
 *
 *     AS_Player_Source="Music"
 *     AS_Player_Repeat="All"
 *     AS_Player_Shuffle="Off"
 *     AS_Default_Music_PLS=""
 *     AS_Default_IPod_PLS=""
 *
 * Every function returns 1 for success and 0 for failure, and opens and closes the file by itself;
 * nothing is kept in memory. C11 and C++.
 */
#ifndef VORELIX_CONFIG_CONFIG_H
#define VORELIX_CONFIG_CONFIG_H

#include <vorelix/export.h>

VORELIX_C_API_BEGIN

/* What a reader fills. The caller clears it first. */
typedef struct ZANO_AUDIO_CONF {
    int currentSource;
    int playMode;
    char szDefaultMusicPlaylist[4096];
    char szDefaultIPodPlaylist[4096];
} ZANO_AUDIO_CONF;

/* Sets the line of a key, key="value", through KLIBCFileSetKeyValue
 * (zanoplatform/key_value_file.h, which says what is refused). Other lines stay as they are; a
 * file that is missing is made, its folder is not. 0, logged: a null argument; the platform could
 * not, whose reason KLIBCErrTextGet() tells: the log speaks of an empty value then, whatever it
 * was. */
VORELIX_API int ZANOAudioConfSet(const char *key, const char *value);

/* Set AS_Default_Music_PLS and AS_Default_IPod_PLS to the path of a playlist, "" for none. When it
 * cannot be set there are two lines in the log, of which the second names the configuration file
 * and not the playlist. */
VORELIX_API int ZANOAudioDefaultMusicPLSSet(const char *path);
VORELIX_API int ZANOAudioDefaultIPodPLSSet(const char *path);

/* Does nothing and returns 1: the play mode is not written by this library. */
VORELIX_API int ZANOAudioCurrentPlayModeSet(void);

/* Reads the file to its end, and offers each key with its value to ZANOAudioConfMatchKeyValue.
 * Intended and kept: that stores nothing, so the record stays as the caller cleared it.
 *
 * Lines are taken in pieces of at most 1023 bytes, each of them a line of its own. Blank lines and
 * those that begin with # are skipped. The key ends before the first '='; spaces and tabs around it
 * and the value, and one pair of double quotes around the value, do not count. A line without '='
 * is a key with an empty value, one that begins with '=' has an empty key.
 *
 * 1, or 0: a null record; a file that cannot be opened or read, which is printed to standard
 * output, without a line feed, and not logged. */
VORELIX_API int ZANOAudioConfGetALL(ZANO_AUDIO_CONF *conf);

/* The step of the reader for each line: looks whether all three are there, and stores nothing. 1;
 * 0, logged, when one is null. */
VORELIX_API int ZANOAudioConfMatchKeyValue(const char *key, const char *value,
                                           ZANO_AUDIO_CONF *conf);

/* Reads the file and prints three lines of what was read to standard output, the source under the
 * label "CurentSource": intended and kept. 0 when it cannot be read, as above. */
VORELIX_API int ZANOAudioConfPrintALL(void);

/* Makes the file with the five lines above where there is none, and the folder
 * "/usr/zano/etc/audio", with mode 0777 less the process's umask. A file that is there, empty or
 * broken too, is left as it is, with 1. The lines are written to audio.tmp in that folder and
 * renamed; whether all of that reached the disk is not looked at. 0, logged: the folder or the
 * temporary file cannot be made. */
VORELIX_API int ZANOSonmiraRestoreConf(void);

VORELIX_C_API_END

#endif
