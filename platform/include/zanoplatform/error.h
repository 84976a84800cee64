/* Why the last platform call failed. One value per thread. */
#ifndef ZANOPLATFORM_ERROR_H
#define ZANOPLATFORM_ERROR_H

#include <zanoplatform/export.h>

ZANOPLATFORM_C_API_BEGIN

/* Values that callers may have written to logs; they do not change. */
enum {
    KLIB_ERR_NONE = 0x0000,
    KLIB_ERR_OUT_OF_MEMORY = 0x0200,
    KLIB_ERR_BAD_PARAMETER = 0x0D00,
    KLIB_ERR_BAD_CONFIGURATION = 0x0E00,
    KLIB_ERR_FILE_FAILED = 0x0F00,      /* a file cannot be read or written */
    KLIB_ERR_DATABASE_OPEN = 0x1000,    /* missing, unreadable, or not a media database */
    KLIB_ERR_DATABASE_VERSION = 0x1001, /* from a newer version of this program */
    KLIB_ERR_DATABASE_QUERY = 0x1002,   /* text that is not a valid query */
    KLIB_ERR_DATABASE_TIMEOUT = 0x1003, /* the time limit of a query ran out */
    KLIB_ERR_DATABASE_BUSY = 0x1004,    /* another program is writing */
    KLIB_ERR_DATABASE_FAILED = 0x1005,  /* any other failure of the engine */
    KLIB_ERR_DATABASE_FILLED = 0x1006   /* it holds rows that were not to be replaced */
};

/* The code of the last failure in this thread. Calls of the media database, the playlist parser,
 * the volumes, KLIBCFileSetKeyValue and KLIBCStrGet set it, to KLIB_ERR_NONE when they succeed; the
 * lists and the escaping functions leave it alone. */
ZANOPLATFORM_API int KLIBCErrGet(void);

/* Its text in English, with the database's own words where it gave any; "" after a success.
 * The view is valid until the next platform call of this thread. */
ZANOPLATFORM_API const char *KLIBCErrTextGet(void);

ZANOPLATFORM_C_API_END

#endif
