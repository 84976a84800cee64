/* Files of settings, one key="value" a line. Thread-safe. */
#ifndef ZANOPLATFORM_KEY_VALUE_FILE_H
#define ZANOPLATFORM_KEY_VALUE_FILE_H

#include <zanoplatform/export.h>

ZANOPLATFORM_C_API_BEGIN

/* Sets the line of a key, and makes the file, with mode 0644, where it is missing.
 *   path           of the file, in a folder that exists and may be written; a link is followed
 *   key            neither empty nor with a blank at an end
 *   format         of the line: "%s=\"%s\"\n", or another with one %s for the key and then one for
 *                  the value
 * Every line of the key becomes the new one; of a key that is not there yet it comes last. All
 * other lines, comments and their order stay byte for byte; a last line without a line feed gets
 * one when a line follows. A file whose line is as wanted is left alone.
 *
 * The new contents are written to path + ".new", synchronised and renamed, so that readers, and a
 * machine that loses its power, see the old file or the new one; the mode stays, and the owner
 * where the caller may give it. Meanwhile the folder is locked (flock): of callers at once, in
 * whatever process, each waits for the one before it, and no change is lost.
 *
 * 0; or -1 with the file as it was, but that it may be the new one when its folder cannot be
 * synchronised. KLIBCErrGet() and KLIBCErrTextGet() (zanoplatform/error.h) then tell why:
 *   KLIB_ERR_BAD_PARAMETER  a null argument, another format, or a line that does not give key and
 *                           value again when it is read: with a line feed in one of them, a key
 *                           that begins with # or holds =, or more than 1023 bytes, the most that
 *                           readers take as one line
 *   KLIB_ERR_FILE_FAILED    the file cannot be read or written, is larger than 1 MiB, or is not
 *                           a file
 *   KLIB_ERR_OUT_OF_MEMORY */
ZANOPLATFORM_API int KLIBCFileSetKeyValue(const char *path, const char *key, const char *value,
                                          const char *format);

ZANOPLATFORM_C_API_END

#endif
