/* Where the library under measurement finds its settings. */
#pragma once

#include <string>

namespace zano::bench {

/* Writes the settings that name the catalogue at this location, and the music link, below the
 * build's own root; returns the root. */
std::string prepareRoot(const std::string &location);

}  // namespace zano::bench
