/* The lists that the iPod readers of libvorelix read (vorelix/ipod/ipod.h). */
#pragma once

#include <map>
#include <string>
#include <vector>

#include "ipod.h"

namespace zano::ipod {

/* Contents of files by their names. */
using Files = std::map<std::string, std::string>;

/* "tracks.m3u" with all tracks, and a file for each playlist, named after it: what a file name
 * cannot have is replaced, and of equal names the second one becomes "Name 2.m3u". A track without
 * a title gets the name of its file. Texts are cut where the readers' fields end, between
 * characters. A path that cannot stand in a list, for a line feed or 4095 bytes, is put into
 * `refused`, and the track is in no list. */
Files listsOf(const Contents &contents, std::vector<std::string> &refused);

}  // namespace zano::ipod
