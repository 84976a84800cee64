/* From what stands in a playlist to paths. Looks at texts only. */
#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "playlist.h"

namespace zano::playlists {

/* An address such as http://radio/1; file: URIs are none. */
bool isWebAddress(std::string_view location);

class Locations {
  public:
    /* The folder of the playlist, absolute, without a / at its end; "" is the root. */
    Locations(std::string_view folder, TextStore &texts) : folder_(folder), texts_(texts) {}

    /* The absolute path that a location names as it stands: a view of it or of texts. */
    std::string_view path(std::string_view location) const;

    /* Every other path that an entry may mean, the likeliest first; without path(location). */
    std::vector<std::string> otherPaths(const Entry &entry) const;

  private:
    std::vector<std::string> readings(const Entry &entry) const;

    std::string_view folder_;
    TextStore &texts_;
};

}  // namespace zano::playlists
