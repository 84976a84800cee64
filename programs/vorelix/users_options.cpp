#include "users_options.h"

#include "rights.h"

namespace vorelix {

namespace {

std::vector<std::string> rightNames() {
    std::vector<std::string> names;
    for (const Right &right : kRights) {
        names.emplace_back(right.name);
    }
    names.insert(names.end(), {"all", "none"});
    return names;
}

}  // namespace

void addUsersArguments(CLI::App &app, unsigned arguments, UsersRequest &request) {
    const auto add = [&app](const char *name, auto &value, const std::string &description) {
        return app.add_option(name, value, description)->required()->type_name("");
    };
    if ((arguments & kUser) != 0) {
        add("USER", request.user, "A name or a number");
    }
    if ((arguments & kUserNames) != 0) {
        add("NAME", request.names, "Names of users");
    }
    if ((arguments & kUserRights) != 0) {
        add("RIGHT", request.rights,
            "All that the user may do: " + CLI::detail::join(rightNames(), ", "))
            ->check(CLI::IsMember(rightNames()).description(""));
    }
}

}  // namespace vorelix
