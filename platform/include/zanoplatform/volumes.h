/* Which volume holds a path, and of what kind it is. */
#ifndef ZANOPLATFORM_VOLUMES_H
#define ZANOPLATFORM_VOLUMES_H

#include <zanoplatform/export.h>

ZANOPLATFORM_C_API_BEGIN

enum { VOLUME_TYPE_INTERNAL = 1, VOLUME_TYPE_NETWORK = 2, VOLUME_TYPE_USB = 4 };

/* What KLIBCErrGet() gives, beside the codes of error.h: the mounts cannot be read. */
enum { KLIB_ERR_VOLUMES_UNREADABLE = 0x1200 };

typedef struct VOLUME_INFO {
    int size;              /* of this record in bytes, set by VolumePathParse */
    int type;              /* VOLUME_TYPE_* */
    char mountPoint[4096]; /* absolute path of the mount */
} VOLUME_INFO;

/* Fills *volume for the mount with the longest mount point that holds the path. Links are
 * followed, and a path that does not exist counts with its nearest existing parent. A USB volume
 * is one whose block device, or one that this stands on, hangs on a USB bus; a network volume is
 * told by its file system; every other is internal. 0, or -1 for a null argument, a path that is
 * not absolute, or when the mounts cannot be read; *volume is then untouched. Looks at each
 * mount's device once in a process and again when the mounts change; what is mounted, and where
 * links lead, is remembered for a tenth of a second. Any thread. */
ZANOPLATFORM_API int VolumePathParse(const char *path, VOLUME_INFO *volume);

ZANOPLATFORM_C_API_END

#endif
