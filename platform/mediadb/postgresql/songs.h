/* Songs on their way to and from the server, many in one statement. */
#pragma once

#include <map>
#include <span>
#include <string>
#include <tuple>
#include <vector>

#include "schema.h"

namespace zano::mediadb::postgresql {

/* How many songs have come to a value of a facet, or gone from it. The order is that in which all
 * programs touch the rows, so that none waits for another in a circle. */
using FacetChanges = std::map<std::tuple<int, std::string, std::string>, std::int64_t>;

/* Changes of facets, column by column. */
class FacetArrays {
  public:
    void add(const FacetChanges::key_type &facet, std::int64_t change);
    bool isEmpty() const { return isEmpty_; }

    /* Gives facet, key, name and how many songs each has now. */
    Sql addition();
    Sql removal();

  private:
    Sql withArrays(std::string_view before, std::string_view after);

    bool isEmpty_ = true;
    ArrayText number_, key_, name_, change_;
};

/* Column by column what unnest() takes, for songs that are new or shown otherwise now. */
class SongArrays {
  public:
    /* id 0: the song is new. */
    void add(const Song &song, std::int64_t id);
    bool isEmpty() const { return isEmpty_; }

    Sql insertion();
    Sql replacement();

  private:
    Sql withArrays(std::string_view before, std::string_view after);

    bool isEmpty_ = true;
    ArrayText id_, path_, title_, album_, artist_, genre_, track_, disc_, year_, duration_,
        bitrate_, frequency_, albumArtist_, titleKey_, albumKey_, artistKey_, genreKey_, pathKey_,
        albumArtistKey_, bytes_, modified_, changed_;
};

/* A row as it is stored, as far as listings show it. */
struct StoredSong {
    std::int64_t id;
    std::string path, title, album, artist, genre;
    int track, disc, year;
    double duration;

    bool isShownAs(const Song &song) const {
        return std::tie(title, album, artist, genre, track, disc, year, duration) ==
               std::tie(song.title, song.album, song.artist, song.genre, song.track, song.disc,
                        song.year, song.duration);
    }
};

/* The stored rows of some paths. */
std::map<std::string, StoredSong> loadSongs(Connection &connection, std::span<const Song> songs);

void countFacets(FacetChanges &changes, const std::string &artist, const std::string &album,
                 const std::string &genre, int by);

}  // namespace zano::mediadb::postgresql
