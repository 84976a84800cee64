/* Which applications of the device a user may use. */
#ifndef ZANOPLATFORM_PRIVILEGE_H
#define ZANOPLATFORM_PRIVILEGE_H

#include <zanoplatform/export.h>

ZANOPLATFORM_C_API_BEGIN

/* What KLIBCErrGet() gives, beside the codes of error.h: the privileges cannot be read. */
enum { KLIB_ERR_PRIVILEGES_UNREADABLE = 0x1400 };

/* Whether a user holds a privilege. Privileges are the groups of their name in
 * /usr/zano/etc/group, in the format of group(5); who is listed as a member holds them. The number
 * of a user's own group gives none, for numbers may mean something else in the system's files.
 * 1, or 0: not a member, no such group, no such file; -1: a null argument, a file that cannot be
 * read, or memory ran out (KLIBCErrGet() tells which). Any thread. */
ZANOPLATFORM_API int KLIBUserPrivilegeHas(const char *user, const char *privilege);

ZANOPLATFORM_C_API_END

#endif
