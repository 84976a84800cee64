/* What stands in a playlist file, before anything is looked up. */
#pragma once

#include <zanoplatform/playlist_parser.h>

#include <cstddef>
#include <initializer_list>
#include <memory_resource>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

namespace zano::playlists {

/* A file that cannot be read as a playlist; code() is a KLIB_ERR_* value. */
class PlaylistError : public std::runtime_error {
  public:
    PlaylistError(int code, const std::string &message)
        : std::runtime_error(message), code_(code) {}
    int code() const { return code_; }

  private:
    int code_;
};

constexpr std::size_t kMaxFileBytes = std::size_t{64} << 20;
constexpr std::size_t kMaxEntries = 1000000;

/* The path of a record without its NUL. */
constexpr std::size_t kMaxPathBytes = 4095;

/* Texts are bytes as the file has them; they may be Windows-1252 (text.h). */
struct Tags {
    std::string_view title;
    std::string_view artist;
    std::string_view album;
    std::string_view genre;
    int year = 0;
    int disc = 0;
    int track = 0;
    double duration = 0;  // seconds; -1 where a player wrote that it does not know
};

struct Entry {
    std::string_view location;
    std::string_view otherReading;  // a second way to read it; empty: there is none
    Tags tags;
    bool isOptional = false;  // perhaps a comment: an entry only if such a file is found
    /* 1 + the index of an optional entry that the tags belong to if it is one; 0: none. */
    std::size_t tagsSharedWith = 0;
};

/* Texts that are made while a file is read. They live as long as this. */
class TextStore {
  public:
    /* The pieces as one text. */
    std::string_view keep(std::initializer_list<std::string_view> pieces);

  private:
    std::pmr::monotonic_buffer_resource memory_{std::size_t{16} << 10};
};

struct Playlist {
    std::vector<Entry> entries;
    TextStore texts;

    /* Appends; throws beyond kMaxEntries. */
    Entry &add(std::string_view location, const Tags &tags = {});
};

}  // namespace zano::playlists
