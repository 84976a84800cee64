/* Small helpers of the library: texts trimmed in place, and programs run.
 *
 * Texts are bytes that end with NUL; what trims them never lets them grow, and is thread-safe
 * for different texts. C11 and C++.
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

/* Runs a program with its standard streams on the null device.
 *   program  its absolute path; the PATH of the environment is not searched
 *   argv     its arguments, a null pointer behind the last one, handed over as they are: its first
 *            element is what the program sees as its own name
 *   wait     0: do not wait for its end
 * Waited for: the program's exit status, 0 to 255, of which 255 is also that of a program that
 * could not be started; -1 when no process could be made or when a signal ended the program.
 * Not waited for: 0, or -1 when no process could be made. Nothing is logged.
 *
 * The program inherits the environment and the open descriptors that are not close-on-exec. What
 * the caller has buffered for its own output is not written twice. During the call the flag
 * SA_NOCLDWAIT of SIGCHLD is cleared for the whole process: one thread at a time. */
VORELIX_API int ZANOExec(const char *program, char *const argv[], int wait);

/* Whether a path stands on a USB volume: 1 when it does, -1 (never 0) when it does not, when its
 * volume cannot be found, and, logged, for null. A path that does not exist counts with its nearest
 * parent that does. Thread-safe. */
VORELIX_API int ZANOAudioIsUSBVolume(const char *path);

VORELIX_C_API_END

#endif
