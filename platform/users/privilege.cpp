#include <grp.h>
#include <zanoplatform/error.h>
#include <zanoplatform/privilege.h>

#include <cstring>
#include <exception>
#include <string_view>

#include "entry_file.h"
#include "strings/error_internal.h"
#include "system_paths_internal.h"

namespace {

int fail(int code, const char *text) {
    zano::setError(code, text);
    return -1;
}

bool hasMember(const group &entry, std::string_view user) {
    for (char *const *member = entry.gr_mem; *member != nullptr; ++member) {
        if (*member == user) {
            return true;
        }
    }
    return false;
}

}  // namespace

int KLIBUserPrivilegeHas(const char *user, const char *privilege) {
    try {
        zano::clearError();
        if (user == nullptr || privilege == nullptr) {
            return fail(KLIB_ERR_BAD_PARAMETER, "a privilege is asked for by user and name");
        }
        zano::users::EntryFile<group, fgetgrent_r> file(ZANO_PATH_GROUP);
        while (const group *const entry = file.next()) {
            if (std::strcmp(entry->gr_name, privilege) == 0 && hasMember(*entry, user)) {
                return 1;
            }
        }
        if (file.error() != 0 && file.error() != ENOENT) {
            return fail(KLIB_ERR_PRIVILEGES_UNREADABLE, std::strerror(file.error()));
        }
        return 0;
    } catch (const std::exception &) {
        return fail(KLIB_ERR_OUT_OF_MEMORY, "out of memory while looking for a privilege");
    }
}
