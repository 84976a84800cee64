/* How both engines read whole rows. A row of an engine has integer(), real() and text() of a
 * column. */
#pragma once

#include <functional>
#include <string>

#include "transfer.h"

namespace zano::mediadb {

/* What gives all rows of a kind, in the order in which readRow() takes their columns. */
inline const char *selectionOf(const SongRow &) {
    return "SELECT id, path, title, album, artist, album_artist, genre, year, track, disc, "
           "bitrate, "
           "frequency, duration, size, modified, changed FROM songs ORDER BY id";
}
inline const char *selectionOf(const PlaylistRow &) {
    return "SELECT id, path, title, album FROM playlists ORDER BY id";
}
inline const char *selectionOf(const Notice &) {
    return "SELECT id, path, former_path, operation FROM notices ORDER BY id";
}

template <typename Row>
void readRow(const Row &row, SongRow &song) {
    song.id = row.integer(0);
    int column = 1;
    for (std::string *text :
         {&song.path, &song.title, &song.album, &song.artist, &song.albumArtist, &song.genre}) {
        *text = row.text(column++);
    }
    for (int *number : {&song.year, &song.track, &song.disc, &song.bitrate, &song.frequency}) {
        *number = static_cast<int>(row.integer(column++));
    }
    song.duration = row.real(column++);
    for (std::int64_t *number : {&song.stamp.size, &song.stamp.modified, &song.stamp.changed}) {
        *number = row.integer(column++);
    }
}

template <typename Row>
void readRow(const Row &row, PlaylistRow &playlist) {
    playlist.id = row.integer(0);
    playlist.path = row.text(1);
    playlist.title = row.text(2);
    playlist.folder = row.text(3);
}

template <typename Row>
void readRow(const Row &row, Notice &notice) {
    notice.id = row.integer(0);
    notice.path = row.text(1);
    notice.formerPath = row.text(2);
    notice.operation = static_cast<int>(row.integer(3));
}

/* A snapshot of an engine that has forEachRow(callback) for every kind of row. */
template <typename Engine>
class SnapshotOf : public Snapshot {
  public:
    void forEachSong(const std::function<void(const SongRow &)> &callback) override {
        static_cast<Engine *>(this)->forEachRow(callback);
    }
    void forEachPlaylist(const std::function<void(const PlaylistRow &)> &callback) override {
        static_cast<Engine *>(this)->forEachRow(callback);
    }
    void forEachNotice(const std::function<void(const Notice &)> &callback) override {
        static_cast<Engine *>(this)->forEachRow(callback);
    }
};

/* What `ask` gives for each table, by its name. */
template <typename Ask>
Contents ofEachTable(Ask ask) {
    return {ask("songs"), ask("playlists"), ask("notices")};
}

}  // namespace zano::mediadb
