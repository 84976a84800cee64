/* The mapping as the library reads it: it looks for the first place that has an extension's text,
 * wherever that is, and takes the text behind the second double quote from there. */
#pragma once

#include <string>
#include <vector>

#include "mime_data.h"

namespace zano::mime {

struct Mapping {
    std::string text;
    /* Extensions of audio files and playlists that are found in the entry of another type first,
     * because each of the two entries has an extension of the other in it. */
    std::vector<std::string> hidden;
};

/* An entry, a line, for each type, in such an order that the extensions of audio files and
 * playlists are found in their own entries first. */
Mapping makeMapping(const Extensions &extensions);

}  // namespace zano::mime
