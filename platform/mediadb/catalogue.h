/* The writing side of the media database, for the indexer.
 *
 * One writer at a time: a second one waits up to ten seconds for the first batch to end, then
 * begin() throws. Readers are never blocked and see whole batches only. Every failure throws
 * DatabaseError; a batch that was not committed is undone, by the destructor or by the next
 * opening after a kill. Not for use from two threads at once.
 */
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

namespace zano::mediadb {

/* A failure of the database; code() is a KLIB_ERR_* value, what() says what was tried. */
class DatabaseError : public std::runtime_error {
  public:
    DatabaseError(int code, const std::string &message)
        : std::runtime_error(message), code_(code) {}
    int code() const { return code_; }

  private:
    int code_;
};

/* A text for users or logs in which the password of a database's address, if it has one, is
 * replaced by stars wherever it stands. */
std::string withoutPassword(std::string text, const std::string &location);

/* What tells that a file changed. Times in nanoseconds since the epoch, size in bytes. */
struct FileStamp {
    std::int64_t size = 0;
    std::int64_t modified = 0;
    std::int64_t changed = 0;
    bool operator==(const FileStamp &) const = default;
};

/* What the tags of a file say. Texts are valid UTF-8 without NUL, empty where the file has none;
 * numbers are 0 where unknown and never negative. */
struct Tags {
    std::string title;
    std::string album;
    std::string artist;
    std::string albumArtist;
    std::string genre;
    int year = 0;
    int track = 0;
    int disc = 0;
    double duration = 0;  // seconds
    int bitrate = 0;      // bits per second
    int frequency = 0;    // hertz
};

/* A song as it is stored. */
struct Song : Tags {
    std::string path;  // the bytes that open the file
    FileStamp stamp;
};

/* A playlist file. path: the bytes that open it; texts are valid UTF-8 without NUL. */
struct PlaylistFile {
    std::string path;
    std::string title;
    std::string folder;  // the name of the folder that it lies in: the column "album"
};

/* A notice left by KLIBZanoFileIndexAdd. */
struct Notice {
    std::int64_t id = 0;
    std::string path;
    std::string formerPath;  // empty: none
    int operation = 0;
};

class Catalogue {
  public:
    virtual ~Catalogue() = default;
    Catalogue(const Catalogue &) = delete;
    Catalogue &operator=(const Catalogue &) = delete;

    /* Calls back for every song at or below a folder, in byte order of the paths. folder has no
     * trailing '/'; "" means all songs. The callback must not use the catalogue. */
    using FileCallback = std::function<void(std::string_view path, const FileStamp &)>;
    virtual void forEachFile(const std::string &folder, const FileCallback &callback) = 0;

    /* A batch: everything between begin and commit becomes visible at once. */
    virtual void begin() = 0;
    virtual void commit() = 0;
    virtual void rollback() noexcept = 0;

    /* Within a batch. putSong inserts, or replaces the row of the same path and keeps its id. */
    virtual void putSong(const Song &song) = 0;
    /* true when there was a row of that path. */
    virtual bool removeSong(const std::string &path) = 0;
    virtual bool removePlaylist(const std::string &path) = 0;
    /* Within a batch. A row of the same path stays as it is: who edits playlists names them. */
    virtual void addPlaylist(const PlaylistFile &playlist) = 0;

    /* The paths of the playlists at or below a folder, as for forEachFile(), in byte order. */
    virtual std::vector<std::string> playlists(const std::string &folder) = 0;

    /* Ends a scan, outside of a batch: brings the order and search indexes up to date with all
     * songs and refreshes the planner's statistics. Cheap when nothing changed. A first scan
     * builds them only here, and lists slowly but rightly until then; a kill in the middle
     * loses nothing but this work. progress (may be empty) is called with parts done and in all.
     * false: there was nothing to do. */
    using Progress = std::function<void(int done, int total)>;
    virtual bool finish(const Progress &progress) = 0;

    /* The number of songs. */
    virtual std::int64_t songCount() = 0;

    /* The oldest notices, at most `limit`; and their removal, within a batch. */
    virtual std::vector<Notice> notices(int limit) = 0;
    virtual void removeNotice(std::int64_t id) = 0;

    /* Throws when the database is damaged: the engine's own check, and that keys, orders, search
     * index, counted values and anchors agree with the rows. Writes nothing. */
    virtual void check() = 0;

  protected:
    Catalogue() = default;
};

/* Opens the catalogue that the setting `mediadb` names, for writing. A missing database and its
 * folder are made; an older schema is brought up to date; a file that is not a media database
 * or is from a newer version is left as it is and throws. */
std::unique_ptr<Catalogue> openCatalogue();

/* The same for a given location, "sqlite:/path/to/file". */
std::unique_ptr<Catalogue> openCatalogue(const std::string &location);

/* The setting's value: what openCatalogue() would open. */
std::string configuredLocation();

}  // namespace zano::mediadb
