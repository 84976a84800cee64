/* Turns entries into records: finds the file that each means, and its row. */
#pragma once

#include <zanoplatform/media_database.h>

#include <cstdint>
#include <cstdlib>
#include <memory>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "folder_names.h"
#include "locations.h"
#include "playlist.h"

namespace zano::playlists {

struct FreeRecords {
    void operator()(ZANO_PLAYLIST_REC *list) const { ZANOPlaylistRecFree(list); }
};
using RecordList = std::unique_ptr<ZANO_PLAYLIST_REC, FreeRecords>;

/* The columns that a caller wants: "*" (or ""), or names separated by commas. */
class Fields {
  public:
    /* Throws PlaylistError for a name that is no column. */
    explicit Fields(std::string_view list);

    bool has(std::string_view column) const;
    /* For a query: the columns wanted, and the path, by which rows find their entries. */
    const std::string &select() const { return select_; }

  private:
    std::string select_;
    std::vector<std::string_view> columns_;
    bool areAll_ = false;
};

class Resolver {
  public:
    /* folder: of the playlist file, absolute, without / at its end. All arguments outlive it. */
    Resolver(std::string_view folder, Playlist &playlist, const Fields &fields);

    /* The records in the order of the entries; to be called once. Throws PlaylistError. */
    RecordList records(int &total);

  private:
    struct Place {
        std::string_view path;
        RecordList row;             // from the media database; null: it has none
        std::uint32_t reading = 0;  // which of the paths looked up the row belongs to
        bool isWeb = false;
        bool isFound = false;  // in the database or on the disk
    };

    /* A path to look up for an entry. Of several that have rows the first reading counts. */
    struct Wanted {
        std::string_view path;
        std::uint32_t entry;
        std::uint32_t reading;
    };

    void lookUpAsTheyStand();
    void lookUpOtherReadings();
    void lookUpOtherReadings(std::span<const std::uint32_t> entries);
    void findOnDisk(std::span<const Wanted> readings, std::vector<Wanted> &renamed);
    std::vector<std::uint32_t> entriesToSearch();

    void lookUp(std::span<const Wanted> wanted);
    static std::string conditionOf(std::span<const Wanted *const> batch);
    void lookUpBatch(std::span<const Wanted *const> batch);
    void assign(const Wanted &wanted, RecordList row);

    bool isKept(std::size_t entry) const;
    RecordList recordOf(std::size_t entry);
    RecordList recordFromTags(std::size_t entry) const;

    std::string_view folder_;
    Playlist &playlist_;
    const Fields &fields_;
    std::vector<Place> places_;
    FolderNames folderNames_;
};

}  // namespace zano::playlists
