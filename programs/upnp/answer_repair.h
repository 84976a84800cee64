/* What servers get wrong in the answer to a Browse, put right in a copy. */
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace vorelix {

/* The text as XML that has a chance to be read: "&" and "<" that begin nothing are escaped, control
 * characters and references to them are left out, as are XML declarations and document types
 * inside of it and the brackets of CDATA, bytes that are not UTF-8 become U+FFFD, and markup that
 * is still escaped is not any more. */
std::string repaired(std::string_view text);

/* Every object of it by itself, from "<item" or "<container" to its end. */
std::vector<std::string> objectTexts(std::string_view text);

}  // namespace vorelix
