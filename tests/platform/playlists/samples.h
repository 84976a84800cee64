/* Playlists as the library and other programs write them, in tests/data/playlists; beside each
 * NAME stands NAME.dump, what is read from it. */
#pragma once

#include <algorithm>
#include <filesystem>
#include <string>
#include <vector>

namespace zano::playlists {

inline std::vector<std::filesystem::path> samples() {
    std::vector<std::filesystem::path> paths;
    for (const auto &file : std::filesystem::directory_iterator(VORELIX_SAMPLES)) {
        if (file.path().extension() != ".dump") {
            paths.push_back(file.path());
        }
    }
    std::sort(paths.begin(), paths.end());
    return paths;
}

}  // namespace zano::playlists
