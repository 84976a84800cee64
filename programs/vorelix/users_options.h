/* The arguments of the users commands. */
#pragma once

#include <CLI/CLI.hpp>

#include "request.h"

namespace vorelix {

void addUsersArguments(CLI::App &app, unsigned arguments, UsersRequest &request);

}  // namespace vorelix
