/* Finds files whose names on the disk differ from a path in Unicode normalisation only. */
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>

namespace zano::playlists {

bool isOnDisk(const std::string &path);

/* Looks at files one after the other. Neighbours in one folder cost a look at their names only: the
 * way to the folder is the longer part. */
class FileLookup {
  public:
    FileLookup() = default;
    ~FileLookup();
    FileLookup(const FileLookup &) = delete;
    FileLookup &operator=(const FileLookup &) = delete;

    /* path: absolute. What a link leads to counts, as for isOnDisk(). */
    bool isThere(const std::string &path);

  private:
    void enter(std::string_view folder);

    std::string folder_;
    int descriptor_ = -1;  // of folder_; -1: not open
    bool isGone_ = false;  // folder_ is not there, and so are its files
};

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
