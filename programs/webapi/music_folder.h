/* The folder that the music link points to, and what may be reached in it. */
#pragma once

#include <sys/stat.h>
#include <string>

namespace webapi {

class MusicFolder {
  public:
    /* Throws Refusal when the link cannot be read. */
    MusicFolder();

    /* As the link has it, which is how the library's listings take it. */
    const std::string &path() const { return path_; }

    /* Whether a path begins with the folder's: the listings go by that. */
    bool lists(const std::string &path) const;

    /* The path of what a path leads to when all links are followed. Throws Refusal, kNotFound with
     * the key "file", when there is nothing or it is not below the folder. */
    std::string resolved(const std::string &path) const;

  private:
    std::string path_;
};

/* A regular file below the music folder, open for reading. */
class MusicFile {
  public:
    /* Throws Refusal as resolved() does, for everything that is no regular file too, and kFailed
     * with the key "file" for one that cannot be opened. */
    MusicFile(const MusicFolder &folder, const std::string &path);
    ~MusicFile();
    MusicFile(const MusicFile &) = delete;
    MusicFile &operator=(const MusicFile &) = delete;

    int descriptor() const { return descriptor_; }
    const struct stat &status() const { return status_; }

  private:
    int descriptor_;
    struct stat status_ {};
};

}  // namespace webapi
