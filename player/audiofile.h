/* The player's queue in its file.
 *
 *     offset            size  content
 *     0                   16  the PlayerInfo
 *     16 + 7336 * i     7336  song i, from 0: a ZANO_MEDIA_INFO
 *
 * Numbers are in the byte order of the machine. There is no count: the songs are those that fit
 * into the file's size, and bytes behind the last whole one are ignored. While the file is read or
 * written it is locked (flock); nobody waits for a lock. For one thread. Nothing throws. C++ only.
 */
#ifndef VORELIX_PLAYER_AUDIOFILE_H
#define VORELIX_PLAYER_AUDIOFILE_H

#ifndef __cplusplus
#error "C++ only"
#endif

#include <vorelix/export.h>
#include <vorelix/records.h>

#include <vector>

/* The state of the player, 16 bytes. */
typedef struct __tag_PlayerInfo__ {
    int state[3]; /* the player program's own, carried unchanged; {0, 1, 0} in a new queue */
    int total;    /* number of songs in the file that was loaded; 0 in a new queue */
} PlayerInfo;

/* A queue in memory. Owns what its members point to; null pointers are released as well. */
class VORELIX_API PlaylistInfo {
  public:
    /* A queue without songs; playerInfo is null when memory ran out. */
    PlaylistInfo();
    virtual ~PlaylistInfo();
    PlaylistInfo(const PlaylistInfo &) = delete;
    PlaylistInfo &operator=(const PlaylistInfo &) = delete;

    /* Copies a record into this queue's own. The caller keeps its record. */
    void setPlayerInfo(PlayerInfo *info);

    PlayerInfo *playerInfo;               /* from malloc, released with free() */
    std::vector<ZANO_MEDIA_INFO *> songs; /* in queue order; each from malloc, as above */
};

class VORELIX_API AudioFile {
  public:
    /* Reads songs of a queue.
     *   start  the first song, from 0; a negative one, and one so large that start * 7336 does not
     *          fit into 32 bits, lead to some other place of the file or behind its end: intended
     *          and kept
     *   count  the most songs that are read; 0: all up to the end; below 0: none
     * The caller deletes the result. Its total is the number of songs in the file, whatever the
     * file says, also when fewer were read. A file that is missing, or that cannot be opened
     * (logged), is empty, or is shorter than the PlayerInfo, gives a queue without songs and a
     * total of 0. Null: the file is locked by another or cannot be unlocked, which is logged;
     * memory ran out. */
    static PlaylistInfo *PlaylistFileLoad(char const *path, int start, int count);

    /* Writes a queue in place of what the file held, and makes the file, with mode 0644 less the
     * process's umask, where it is missing.
     * 0; or -1, logged, and the file deleted, whatever it held before: it cannot be opened, locked,
     * written whole or unlocked. A null list is -1, not logged, with the file as it was. */
    static int PlaylistFileSave(char const *path, PlaylistInfo *list);

    /* Writes a queue of songs that the media database chooses at random, in place of the file.
     *   count  the number of songs, handed to the database as it is: 0 means all
     * 1, also when the library is empty or cannot be read: the queue has no songs then. 0, logged:
     * a null path; a queue that cannot be made or saved, and the file is gone. */
    static int PlaylistRandomCreate(char const *path, int count);
};

#endif
