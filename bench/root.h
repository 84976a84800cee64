/* Where the library under measurement finds its settings. */
#pragma once

#include <string>

namespace zano::bench {

/* Writes the settings that name this catalogue, and the music link, below the build's own root;
 * returns the root. */
std::string prepareRoot(const std::string &catalogue);

}  // namespace zano::bench
