/* The arguments of the playlist commands. */
#pragma once

#include <CLI/CLI.hpp>

#include "request.h"

namespace vorelix {

void addPlaylistArguments(CLI::App &app, unsigned arguments, PlaylistRequest &request);

/* What only the whole line tells, once it was parsed. Throws CLI::ParseError. */
void finishPlaylistArguments(unsigned arguments, PlaylistRequest &request);

}  // namespace vorelix
