/* The line below a listing: where it stands in the whole, and how to go on. */
#pragma once

#include <string>

#include "request.h"

namespace vorelix {

/* For `shown` rows from request.span.offset out of `total`, which are called `noun` ("songs"):
 * "songs 1-50 of 1234 (page 1 of 25; next: vorelix list --page 2)". The next command is the
 * typed one with another page or offset, quoted for a shell. No line end. */
std::string pageLine(const std::string &noun, const Request &request, int shown, int total);

}  // namespace vorelix
