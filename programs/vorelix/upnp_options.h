/* The arguments of the commands that ask media servers. */
#pragma once

#include "request.h"

namespace vorelix {

void addNetwork(CLI::App &app, Request &request);
void addMediaServer(CLI::App &app, Request &request);
void addMediaContainer(CLI::App &app, Request &request);
void addMediaTree(CLI::App &app, Request &request);

}  // namespace vorelix
