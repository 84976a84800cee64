/* The commands. Each answers with a text for standard output, a table or with request.json a
 * document, and throws Failure when it has none. */
#pragma once

#include <vector>

#include "request.h"

namespace vorelix {

const std::vector<Command> &allCommands();

/* list, search, random: {"songs": [...], "offset", "limit", "total"} */
Outcome listCommand(const Request &request, const Terminal &terminal);
Outcome randomCommand(const Request &request, const Terminal &terminal);

/* {"column": "artist", "values": [...], "offset", "limit", "total"} */
Outcome browseCommand(const Request &request, const Terminal &terminal);

/* {"songs": [...], "unknown": [ids that name no song]}, which are a complaint too */
Outcome showCommand(const Request &request, const Terminal &terminal);

/* {"total": number} */
Outcome countCommand(const Request &request, const Terminal &terminal);

}  // namespace vorelix
