/* The arguments of the commands of whole media databases. */
#pragma once

#include "request.h"

namespace vorelix {

void addDatabase(CLI::App &app, Request &request);
void addDatabases(CLI::App &app, Request &request);

}  // namespace vorelix
