/* Small helpers of the library: texts trimmed in place, programs run, and what the web pages need:
 * pieces of HTML, scrambled ids, mime types.
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
 * could not be started; -1 when no process could be made, when a signal ended the program, or when
 * the caller ignores SIGCHLD (SIG_IGN), so that no status is kept.
 * Not waited for: 0, or -1 when no process could be made; the caller collects the ended child.
 * Nothing is logged.
 *
 * The program inherits the environment and the open descriptors that are not close-on-exec. What
 * the caller has buffered for its own output is not written twice. During the call the flag
 * SA_NOCLDWAIT of SIGCHLD is cleared for the whole process: one thread at a time. */
VORELIX_API int ZANOExec(const char *program, char *const argv[], int wait);

/* Whether a path stands on a USB volume: 1 when it does, -1 (never 0) when it does not, when its
 * volume cannot be found, and, logged, for null. A path that does not exist counts with its nearest
 * parent that does. Thread-safe. */
VORELIX_API int ZANOAudioIsUSBVolume(const char *path);

/* Prints the bar that leads to other pages, through stdio's stdout.
 *   page, pages  the page that is shown, from 1, and the number of pages
 *   pageLabel    stands before the field with the page's number, ofLabel before the number of pages
 *   alt5         alternative texts of the images: of the previous page,
 *   alt6         the first page,
 *   alt7         the next page,
 *   alt8         and the last page
 * The links call the page's own script, ChangePageNo(event, page). Texts are printed as they are:
 * pass HTML. What the last print call returned: the number of bytes of the bar's last piece, or a
 * negative number. */
VORELIX_API int ZANOAudioPrintPageNav(int page, int pages, const char *pageLabel,
                                      const char *ofLabel, const char *alt5, const char *alt6,
                                      const char *alt7, const char *alt8);

/* Prints the foot of a page: a line "Hosted by", with a link to a1 that reads a3, then a2 and a4;
 * and a line with a notice. Texts and result as above. */
VORELIX_API int ZANOAudioPrintPageFooter(const char *a1, const char *a2, const char *a3,
                                         const char *a4);

/* Writes a text with & " < > as &amp; &quot; &lt; &gt; and a NUL into out. The single quote stays:
 * put the result between double quotes. Nothing at all is written, not even the NUL, when a
 * pointer is null, the text is empty, or `size` is less than six bytes for each byte of the text.
 * Of a text of nothing but double quotes and of just that size, the last loses its semicolon. */
VORELIX_API void ZANOHtmlSpecialChar(const char *source, char *out, int size);

/* A media id as a text for web addresses, at most 22 characters: the same for the same id, and no
 * protection, for everyone can turn it back. To be released with free(); null when memory ran
 * out. Starts the process's rand() anew. */
VORELIX_API char *MediaIDEncryption(unsigned id);

/* The id of such a text. -1 for null, for less than six characters, and for what MediaIDEncryption
 * does not make: other characters than hexadecimal digits, or digits that do not fit together. A
 * last character too many is not looked at. The id of 32 ones cannot be told from a failure. */
VORELIX_API int MediaIDDecryption(const char *text);

/* The mime type of a file name's extension: "mp3", without the dot and in small letters.
 *   out, size  receive it, cut to `size` bytes with its NUL
 * 0, with "application/octet-stream" for an extension that is not known; -1 for a null argument,
 * and, logged, when the mapping of extensions to types cannot be made or read.
 * The mapping is the file /tmp/mimetype.tmp, which all processes share. Where it is missing, the
 * program /usr/zano/bin/confmimetype is run to make it; nothing makes it anew. What is looked for
 * is the first place in it with the extension's text: of an extension that it does not list, but
 * whose text is a part of another entry, the result is not to be relied on, nor is that of "". */
VORELIX_API int ZANOAudioGetMimetype(const char *extension, char *out, int size);

VORELIX_C_API_END

#endif
