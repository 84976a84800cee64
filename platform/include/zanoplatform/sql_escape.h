/* Escaping of texts that are put into conditions (media_database.h). Thread-safe. */
#ifndef ZANOPLATFORM_SQL_ESCAPE_H
#define ZANOPLATFORM_SQL_ESCAPE_H

#include <zanoplatform/export.h>

ZANOPLATFORM_C_API_BEGIN

/* Writes `length` bytes of text with every ' doubled, and a NUL. out: 2 * length + 1 bytes.
 * The number of bytes written without the NUL, or -1 for a null pointer or a negative length
 * (out is then untouched). */
ZANOPLATFORM_API int ZANODBEscapeString(char *out, const char *text, int length);

/* Writes text with every \ doubled, so that a pattern takes it literally. The number of bytes
 * written without the NUL, or -1 when an argument is null or `size` bytes are not enough for
 * text and NUL (out then holds an empty text where it has room for one). */
ZANOPLATFORM_API int ZANODBEscapeBackslash(char *out, int size, const char *text);

/* Fills a template: each marker "@ZANO:NEVAR" becomes the next text argument (const char *, one
 * for each marker, inserted as it is), each "%%" becomes "%". The first argument is always 1.
 * A text for the caller to free(), or null: null pattern, null argument, or out of memory. */
ZANOPLATFORM_API char *ZANODBEscapeStringEX3(int one, const char *pattern, ...);

ZANOPLATFORM_C_API_END

#endif
