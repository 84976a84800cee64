/* The arguments of the commands of queue, configuration, custom keys and iPod. */
#pragma once

#include "request.h"

namespace vorelix {

void addQueueFile(CLI::App &app, Request &request);
void addOptionalSetting(CLI::App &app, Request &request);
void addSetting(CLI::App &app, Request &request);
void addOptionalKey(CLI::App &app, Request &request);
void addKey(CLI::App &app, Request &request);
void addTrackNumber(CLI::App &app, Request &request);
void addIPodPlaylist(CLI::App &app, Request &request);

}  // namespace vorelix
