/* The one macro that makes a declaration part of libvorelix.so's interface.
 *
 * Everything in the library is built with hidden visibility; what carries VORELIX_API, and
 * nothing else, can be linked against. C linkage is added by VORELIX_C_API_BEGIN / _END.
 */
#ifndef VORELIX_EXPORT_H
#define VORELIX_EXPORT_H

#define VORELIX_API __attribute__((visibility("default")))

#ifdef __cplusplus
#define VORELIX_C_API_BEGIN extern "C" {
#define VORELIX_C_API_END }
#else
#define VORELIX_C_API_BEGIN
#define VORELIX_C_API_END
#endif

#endif
