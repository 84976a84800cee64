/* Finds files whose names on the disk differ from a path in Unicode normalisation only. */
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>

namespace zano::playlists {

bool isOnDisk(const std::string &path);

class FolderNames {
  public:
    /* The path as the disk has it; null: no such file, or the path is not UTF-8. Each folder is
     * listed once at most. */
    std::optional<std::string> find(std::string_view path);

  private:
    using Names = std::unordered_map<std::string, std::string>;  // composed form to the disk's

    const Names &namesIn(const std::string &folder);

    std::unordered_map<std::string, Names> folders_;
};

}  // namespace zano::playlists
