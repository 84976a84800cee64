/* Small helpers of the library.
 *
 * Texts are bytes that end with NUL; they are changed in place and never grow. Thread-safe for
 * different texts. C11 and C++.
 */
#ifndef VORELIX_MISC_MISC_H
#define VORELIX_MISC_MISC_H

#include <vorelix/export.h>

VORELIX_C_API_BEGIN

/* Removes every line feed and carriage return at the end, in any mix, by writing NUL over it.
 * Null and the empty text are left alone. */
VORELIX_API void trimTrailingNewline(char *s);

/* Removes spaces, tabs, line feeds and carriage returns at both ends: the rest moves to the
 * start of the buffer. A text of nothing else becomes empty. Null is left alone. */
VORELIX_API void strstrip(char *s);

VORELIX_C_API_END

#endif
