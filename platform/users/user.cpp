#include <pwd.h>
#include <zanoplatform/error.h>
#include <zanoplatform/user.h>

#include <cstring>
#include <optional>
#include <stdexcept>
#include <string>

#include "entry_file.h"
#include "strings/error_internal.h"
#include "system_paths_internal.h"

namespace {

using zano::users::EntryFile;
using zano::users::withBuffer;

struct Unreadable : std::runtime_error {
    explicit Unreadable(int error)
        : std::runtime_error(std::string("the users cannot be read: ") + std::strerror(error)) {}
};

template <typename IsWanted>
std::optional<uid_t> findInFile(EntryFile<passwd, fgetpwent_r> &file, IsWanted isWanted) {
    while (const passwd *const entry = file.next()) {
        // An empty name is no user, nor is one with a sign, which asks for other sources of users.
        if (std::strchr("+-", entry->pw_name[0]) == nullptr && isWanted(*entry)) {
            return entry->pw_uid;
        }
    }
    if (file.error() != 0) {
        throw Unreadable(file.error());
    }
    return std::nullopt;
}

/* ask: getpwnam_r or getpwuid_r for one user. */
template <typename Ask>
std::optional<uid_t> findInSystem(Ask ask) {
    passwd entry{};
    passwd *found = nullptr;
    std::vector<char> buffer;
    const int error = withBuffer(
        buffer, [&](char *texts, std::size_t size) { return ask(&entry, texts, size, &found); });
    // What the C library says of a user that is in no source.
    const bool isMissing = error == 0 || error == ENOENT || error == ESRCH;
    if (found == nullptr && !isMissing) {
        throw Unreadable(error);
    }
    return found != nullptr ? std::optional(found->pw_uid) : std::nullopt;
}

template <typename IsWanted, typename Ask>
std::optional<uid_t> find(IsWanted isWanted, Ask ask) {
    EntryFile<passwd, fgetpwent_r> file(ZANO_PATH_PASSWD);
    return file.error() == ENOENT ? findInSystem(ask) : findInFile(file, isWanted);
}

/* make(number) of the user that findUid() finds, or null with the reason set. */
template <typename FindUid, typename Make>
SDK::User *load(FindUid findUid, Make make) {
    try {
        zano::clearError();
        if (const std::optional<uid_t> uid = findUid()) {
            return make(*uid);
        }
        zano::setError(KLIB_ERR_USER_MISSING, "there is no such user");
    } catch (const Unreadable &unreadable) {
        zano::setError(KLIB_ERR_USERS_UNREADABLE, unreadable.what());
    } catch (const std::exception &) {
        zano::setError(KLIB_ERR_OUT_OF_MEMORY, "out of memory while looking for a user");
    }
    return nullptr;
}

}  // namespace

namespace SDK {

User::User(unsigned int uid) : uid_(uid) {}

User *User::LoadUser(const std::string &name) {
    return load(
        [&name] {
            return find([&name](const passwd &entry) { return entry.pw_name == name; },
                        [&name](auto... buffers) { return getpwnam_r(name.c_str(), buffers...); });
        },
        [](uid_t uid) { return new User(uid); });
}

User *User::LoadUser(int uid) {
    const auto wanted = static_cast<uid_t>(uid);
    return load(
        [wanted] {
            return find([wanted](const passwd &entry) { return entry.pw_uid == wanted; },
                        [wanted](auto... buffers) { return getpwuid_r(wanted, buffers...); });
        },
        [](uid_t found) { return new User(found); });
}

void User::Release(User *user) {
    delete user;
}

unsigned int User::GetUID() const {
    return uid_;
}

}  // namespace SDK
