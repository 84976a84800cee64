/* What the users of the device may do with the application. */
#include <fcntl.h>
#include <sys/file.h>
#include <vorelix/users/audiousers.h>
#include <zanoplatform/error.h>
#include <zanoplatform/user.h>
#include <algorithm>
#include <charconv>
#include <filesystem>
#include <memory>

#include "commands.h"
#include "descriptor_internal.h"
#include "failure.h"
#include "json.h"
#include "rights.h"
#include "system_paths_internal.h"
#include "table.h"
#include "text.h"

namespace vorelix {

namespace {

struct ReleaseUser {
    void operator()(SDK::User *user) const { SDK::User::Release(user); }
};

/* Null when there is no such user. Throws Failure when that cannot be told. */
template <typename NameOrNumber>
std::unique_ptr<SDK::User, ReleaseUser> load(const NameOrNumber &wanted) {
    std::unique_ptr<SDK::User, ReleaseUser> user(SDK::User::LoadUser(wanted));
    if (user == nullptr && KLIBCErrGet() != KLIB_ERR_USER_MISSING) {
        throw Failure(std::string("could not look for users: ") + printable(KLIBCErrTextGet()));
    }
    return user;
}

/* Others that change the file this way wait meanwhile. */
class Turn {
  public:
    Turn()
        : folder_(open(std::filesystem::path(ZANO_PATH_AUDIO_USERS).parent_path().c_str(),
                       O_RDONLY | O_DIRECTORY | O_CLOEXEC)) {
        if (folder_.number() == -1 || flock(folder_.number(), LOCK_EX) != 0) {
            throw Failure("could not open the folder of " ZANO_PATH_AUDIO_USERS);
        }
    }

  private:
    Descriptor folder_;
};

/* What the file has; nothing when there is none. */
AudioUsers readUsers() {
    AudioUsers users;
    if (!users.Read(ZANO_PATH_AUDIO_USERS) && std::filesystem::exists(ZANO_PATH_AUDIO_USERS)) {
        throw Failure("could not read " ZANO_PATH_AUDIO_USERS
                      "; the library's log tells why: --verbose");
    }
    return users;
}

/* Save says nothing of its last step, so the file is read again. */
void save(AudioUsers &users, unsigned uid) {
    AudioUsers written;
    if (!users.Save(ZANO_PATH_AUDIO_USERS) || !written.Read(ZANO_PATH_AUDIO_USERS) ||
        written.enumUsers() != users.enumUsers() || written.GetUser(uid) != users.GetUser(uid)) {
        throw Failure("could not write " ZANO_PATH_AUDIO_USERS
                      "; the library's log tells why: --verbose");
    }
}

std::string rightsText(unsigned mask) {
    if ((mask & AudioUsers::kEveryPermission) == AudioUsers::kEveryPermission) {
        return "all";
    }
    std::string text;
    for (const Right &right : kRights) {
        if ((mask & right.bit) != 0) {
            text.append(text.empty() ? "" : ", ").append(right.name);
        }
    }
    return text.empty() ? "none" : text;
}

Json::Value userObject(unsigned uid, unsigned mask) {
    Json::Value object(Json::objectValue);
    object["uid"] = uid;
    Json::Value &rights = object["rights"] = Json::Value(Json::arrayValue);
    for (const Right &right : kRights) {
        if ((mask & right.bit) != 0) {
            rights.append(right.name);
        }
    }
    return object;
}

unsigned maskOf(const std::vector<std::string> &rights) {
    unsigned mask = 0;
    for (const std::string &name : rights) {
        mask |= name == "all" ? AudioUsers::kEveryPermission : 0U;
        for (const Right &right : kRights) {
            mask |= name == right.name ? right.bit : 0U;
        }
    }
    return mask;
}

/* The number that a text is; 0 for any other. */
int numberOf(const std::string &text) {
    int number = 0;
    const char *const end = text.data() + text.size();
    const auto [rest, error] = std::from_chars(text.data(), end, number);
    return error == std::errc() && rest == end && number > 0 ? number : 0;
}

/* By name, or by number also one that is gone. */
unsigned uidOf(const std::string &user, const AudioUsers &users) {
    if (const auto found = load(user)) {
        return found->GetUID();
    }
    const int number = numberOf(user);
    const std::vector<unsigned> uids = AudioUsers(users).enumUsers();
    if (number != 0 &&
        (std::find(uids.begin(), uids.end(), number) != uids.end() || load(number) != nullptr)) {
        return static_cast<unsigned>(number);
    }
    throw Failure("there is no user '" + printable(user) + "'");
}

std::string shownUser(const std::string &name, unsigned uid) {
    const std::string number = "user " + std::to_string(uid);
    return numberOf(name) != 0 ? number : printable(name) + " (" + number + ")";
}

/* Why a user's name does not have what its entry says. */
std::string effectText(const std::string &name, unsigned mask) {
    const unsigned effective = AudioUsers::GetUserPermission(name);
    if (numberOf(name) != 0 || effective == mask) {
        return "";
    }
    const char *const reason =
        effective == AudioUsers::kEveryPermission
            ? "; the administrator may do everything"
            : "; who is not in the group ZANO.VXT.Vorelix.Application may do nothing";
    return "in effect: " + rightsText(effective) + reason + "\n";
}

Outcome answerOfRemoved(const Request &request, const std::vector<unsigned> &removed) {
    if (request.json) {
        Json::Value answer(Json::objectValue);
        Json::Value &uids = answer["removed"] = Json::Value(Json::arrayValue);
        for (const unsigned uid : removed) {
            uids.append(uid);
        }
        return {documentOf(answer), ""};
    }
    std::string text;
    for (const unsigned uid : removed) {
        text += "removed the entry of user " + std::to_string(uid) + "\n";
    }
    return {text.empty() ? "nothing to remove\n" : text, ""};
}

}  // namespace

Outcome usersListCommand(const Request &request, const Terminal &terminal) {
    AudioUsers users = readUsers();
    Table table({{.header = "UID", .right = true}, {.header = "Rights"}, {.header = "User"}});
    Json::Value answer(Json::objectValue);
    Json::Value &rows = answer["users"] = Json::Value(Json::arrayValue);
    std::vector<unsigned> uids = users.enumUsers();
    std::sort(uids.begin(), uids.end());
    for (const unsigned uid : uids) {
        const unsigned mask = users.GetUser(uid);
        const bool isThere = load(static_cast<int>(uid)) != nullptr;
        table.addRow({std::to_string(uid), rightsText(mask), isThere ? "" : "gone"});
        Json::Value object = userObject(uid, mask);
        object["exists"] = isThere;
        rows.append(object);
    }
    if (request.json) {
        return {documentOf(answer), ""};
    }
    return {
        uids.empty() ? "no entries yet; users without one may stream\n" : table.render(terminal),
        ""};
}

Outcome usersShowCommand(const Request &request, const Terminal &terminal) {
    Table table({{.header = "Name"}, {.header = "UID", .right = true}, {.header = "Rights"}});
    Json::Value answer(Json::objectValue);
    Json::Value &rows = answer["users"] = Json::Value(Json::arrayValue);
    static_cast<void>(readUsers());
    for (const std::string &name : request.users.names) {
        const auto user = load(name);
        if (user == nullptr) {
            throw Failure("there is no user '" + printable(name) + "'");
        }
        const unsigned mask = AudioUsers::GetUserPermission(name);
        table.addRow({name, std::to_string(user->GetUID()), rightsText(mask)});
        Json::Value object = userObject(user->GetUID(), mask);
        object["name"] = validUtf8(name);
        rows.append(object);
    }
    return {request.json ? documentOf(answer) : table.render(terminal), ""};
}

Outcome usersSetCommand(const Request &request, const Terminal &) {
    const std::string &name = request.users.user;
    const unsigned mask = maskOf(request.users.rights);
    const Turn turn;
    AudioUsers::InitUserPermission();
    AudioUsers users = readUsers();
    const unsigned uid = uidOf(name, users);
    users.SetUser(uid, mask);
    save(users, uid);
    if (request.json) {
        Json::Value answer(Json::objectValue);
        answer["user"] = userObject(uid, mask);
        return {documentOf(answer), ""};
    }
    return {shownUser(name, uid) + ": " + rightsText(mask) + "\n" + effectText(name, mask), ""};
}

Outcome usersRemoveCommand(const Request &request, const Terminal &) {
    const Turn turn;
    AudioUsers users = readUsers();
    const std::vector<unsigned> before = users.enumUsers();
    const unsigned uid = uidOf(request.users.user, users);
    if (std::find(before.begin(), before.end(), uid) == before.end()) {
        throw Failure(shownUser(request.users.user, uid) + " has no entry");
    }
    users.Remove(uid);
    save(users, uid);
    return answerOfRemoved(request, {uid});
}

Outcome usersSyncCommand(const Request &request, const Terminal &) {
    const Turn turn;
    std::vector<unsigned> gone;
    for (const unsigned uid : readUsers().enumUsers()) {
        if (load(static_cast<int>(uid)) == nullptr) {  // or throws: then nobody counts as gone
            gone.push_back(uid);
        }
    }
    if (!gone.empty()) {
        AudioUsers::SyncUsers();
    }
    AudioUsers left = readUsers();
    const std::vector<unsigned> uids = left.enumUsers();
    if (std::find_first_of(uids.begin(), uids.end(), gone.begin(), gone.end()) != uids.end()) {
        throw Failure("could not write " ZANO_PATH_AUDIO_USERS
                      "; the library's log tells why: --verbose");
    }
    return answerOfRemoved(request, gone);
}

}  // namespace vorelix
