/* The command line: its words as a Request. */
#pragma once

#include <variant>
#include <vector>

#include "request.h"

namespace vorelix {

enum ExitCode { kSuccess = 0, kFailed = 1, kUsage = 2 };

/* What the words ask for, or the exit code when there is nothing to run: help or the version was
 * printed, or the words are wrong and standard error says how. argv[0] is the program. */
std::variant<Request, ExitCode> parseCommandLine(int argc, const char *const *argv,
                                                 const std::vector<Command> &commands);

}  // namespace vorelix
