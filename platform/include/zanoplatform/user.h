/* The users of the device, by name and by number. */
#ifndef ZANOPLATFORM_USER_H
#define ZANOPLATFORM_USER_H

#ifndef __cplusplus
#error "C++ only"
#endif

#include <zanoplatform/export.h>

#include <string>

/* What KLIBCErrGet() gives when a user cannot be loaded, beside the codes of error.h. */
enum {
    KLIB_ERR_USER_MISSING = 0x1300,    /* there is no such user */
    KLIB_ERR_USERS_UNREADABLE = 0x1301 /* the users cannot be asked for */
};

namespace SDK {

/* One user. Users stand in /usr/zano/etc/passwd, in the format of passwd(5): where that file is
 * missing, and only there, in the system's user database. The file is read anew for every load.
 * Any thread. */
class ZANOPLATFORM_API User {
  public:
    /* The first user of exactly this name, or with this number (above 2147483647 as a negative
     * int). Null when there is none, and when the users cannot be read or memory ran out, which
     * KLIBCErrGet() tells apart. The user is the caller's, for Release. */
    static User *LoadUser(const std::string &name);
    static User *LoadUser(int uid);

    /* Frees a user; null is allowed. */
    static void Release(User *user);

    unsigned int GetUID() const;

    User(const User &) = delete;
    User &operator=(const User &) = delete;

  private:
    explicit User(unsigned int uid);
    ~User() = default;

    unsigned int uid_;
};

}  // namespace SDK

#endif
