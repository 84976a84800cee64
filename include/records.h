/* The records that the media database, the library and its callers share.
 *
 * ZANO_MEDIA_INFO is filled by the platform and freed by the platform, so its layout is an
 * interface: 32-bit integers in the byte order of the machine, texts in UTF-8, terminated by
 * NUL and cut to the width of their field. The fields named reserved* belong to the platform
 * and are never read or written by the library. C11 and C++.
 */
#ifndef VORELIX_RECORDS_H
#define VORELIX_RECORDS_H

#include <stddef.h>  // NOLINT(modernize-deprecated-headers): the header is C too
#include <stdint.h>  // NOLINT(modernize-deprecated-headers)

#ifdef __cplusplus
#define VORELIX_STATIC_ASSERT static_assert
#else
#define VORELIX_STATIC_ASSERT _Static_assert
#endif

/* One row of the media database: a song, or a playlist (id, path, title and album only). */
typedef struct __tag_ZANO_MEDIA_INFO {
    int id;          /* row id in the table it came from; 0: not in the database */
    char path[4096]; /* absolute path of the file; any bytes but NUL */
    int track;       /* 0: unknown */
    int disc;        /* 0: unknown */
    int year;        /* 0: unknown */
    char title[255]; /* also receives a column selected "as title" */
    char album[255]; /* of a playlist: the folder word */
    char artist[255];
    char reservedText[255];
    char genre[255];
    char reservedColumns[849];
    float duration; /* seconds */
    int bitrate;    /* bits per second */
    int reservedWord;
    int frequency; /* hertz */
    char reservedTail[1084];
} ZANO_MEDIA_INFO;

/* A node of a track list. One malloc'd block each; a whole list is released with
 * ZANOPlaylistRecFree (platform). The union keeps the node at 7344 bytes, and `next` at 7336,
 * with pointers of 32 and of 64 bits. */
typedef struct ZANO_PLAYLIST_REC {
    ZANO_MEDIA_INFO info;
    union {
        struct ZANO_PLAYLIST_REC *next; /* null at the end */
        uint64_t reservedNext;
    };
} ZANO_PLAYLIST_REC;

/* A node of a list of playlists. One calloc'd block each; a whole list is released with
 * ZANOPlayListFree. */
typedef struct ZANO_PLAYLIST {
    int id; /* row id (shared), or position from 1 (personal) */
    char title[255];
    char path[4096];            /* absolute path of the playlist file */
    char album[255];            /* the table's album column (shared), or the base name */
    struct ZANO_PLAYLIST *next; /* null at the end */
} ZANO_PLAYLIST;

VORELIX_STATIC_ASSERT(offsetof(ZANO_MEDIA_INFO, path) == 4, "layout is an interface");
VORELIX_STATIC_ASSERT(offsetof(ZANO_MEDIA_INFO, track) == 4100, "layout is an interface");
VORELIX_STATIC_ASSERT(offsetof(ZANO_MEDIA_INFO, disc) == 4104, "layout is an interface");
VORELIX_STATIC_ASSERT(offsetof(ZANO_MEDIA_INFO, year) == 4108, "layout is an interface");
VORELIX_STATIC_ASSERT(offsetof(ZANO_MEDIA_INFO, title) == 4112, "layout is an interface");
VORELIX_STATIC_ASSERT(offsetof(ZANO_MEDIA_INFO, album) == 4367, "layout is an interface");
VORELIX_STATIC_ASSERT(offsetof(ZANO_MEDIA_INFO, artist) == 4622, "layout is an interface");
VORELIX_STATIC_ASSERT(offsetof(ZANO_MEDIA_INFO, reservedText) == 4877, "layout is an interface");
VORELIX_STATIC_ASSERT(offsetof(ZANO_MEDIA_INFO, genre) == 5132, "layout is an interface");
VORELIX_STATIC_ASSERT(offsetof(ZANO_MEDIA_INFO, reservedColumns) == 5387, "layout is an interface");
VORELIX_STATIC_ASSERT(offsetof(ZANO_MEDIA_INFO, duration) == 6236, "layout is an interface");
VORELIX_STATIC_ASSERT(offsetof(ZANO_MEDIA_INFO, bitrate) == 6240, "layout is an interface");
VORELIX_STATIC_ASSERT(offsetof(ZANO_MEDIA_INFO, frequency) == 6248, "layout is an interface");
VORELIX_STATIC_ASSERT(sizeof(ZANO_MEDIA_INFO) == 7336, "layout is an interface");
VORELIX_STATIC_ASSERT(offsetof(ZANO_PLAYLIST_REC, next) == 7336, "layout is an interface");
VORELIX_STATIC_ASSERT(sizeof(ZANO_PLAYLIST_REC) == 7344, "layout is an interface");
VORELIX_STATIC_ASSERT(offsetof(ZANO_PLAYLIST, title) == 4, "layout is an interface");
VORELIX_STATIC_ASSERT(offsetof(ZANO_PLAYLIST, path) == 259, "layout is an interface");
VORELIX_STATIC_ASSERT(offsetof(ZANO_PLAYLIST, album) == 4355, "layout is an interface");

#endif
