/* A media database of its own for each test, which the settings point to. Tests that use it hold
 * ctest's lock "root", since there is one settings file. */
#pragma once

#include <gtest/gtest.h>
#include <zanoplatform/error.h>
#include <zanoplatform/media_database.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <random>
#include <string>
#include <utility>
#include <vector>

#include "mediadb/catalogue.h"
#include "mediadb/clock_tick.h"
#include "support/files.h"
#include "system_paths_internal.h"

namespace zano::mediadb {

class MediaDatabaseTest : public testing::Test {
  protected:
    /* `location`: "" for a file of SQLite in a folder of its own. */
    explicit MediaDatabaseTest(std::string location = "") : location_(std::move(location)) {
        if (location_.empty()) {
            location_ = "sqlite:" + databasePath();
        }
        setSetting(location_);
    }

    std::string databasePath() const { return folder_.path("media.db"); }
    const std::string &location() const { return location_; }
    static void setSetting(const std::string &value) {
        files::write(ZANO_PATH_CONF, "mediadb=\"" + value + "\"\n");
        awaitTick();
    }
    /* The settings and the database file are looked at once in a tick of the clock. */
    static void awaitTick() {
        ClockTick tick;
        tick.isAnother();
        while (!tick.isAnother()) {
        }
    }

    static Song song(const std::string &path, const std::string &title) {
        Song made;
        made.path = path;
        made.title = title;
        return made;
    }

    /* One batch, and the end of a scan. */
    static void put(Catalogue &catalogue, const std::vector<Song> &songs) {
        catalogue.begin();
        for (const Song &each : songs) {
            catalogue.putSong(each);
        }
        catalogue.commit();
        catalogue.finish({});
    }

    struct Page {
        int offset = 0;
        int limit = 0;
    };

    void putThreeSongs() const {
        put(*openCatalogue(location()), {song("/music/a", "One"), song("/music/b", "Two"),
                                         song("/music/c", std::string(4000, 'a'))});
    }

    /* The rows of a query as lines of the selected fields' texts: "title" or "path". A failed
     * open gives one line "failed: " with the error's text. */
    static std::vector<std::string> rows(const char *condition, const char *order,
                                         Page page = {0, 0}, const char *distinct = nullptr,
                                         const char *select = "*") {
        MEDIA_DB_RESULT *result =
            MediaInfoDBOpen(0, select, condition, distinct, order, page.offset, page.limit, 0);
        if (result == nullptr) {
            return {std::string("failed: ") + KLIBCErrTextGet()};
        }
        std::vector<std::string> lines;
        auto record = std::make_unique<ZANO_MEDIA_INFO>();
        while (MediaInfoDBGet(result, record.get()) == 0) {
            lines.emplace_back(std::string(select) == "*" ? record->path : record->title);
        }
        EXPECT_EQ(KLIBCErrGet(), KLIB_ERR_NONE) << KLIBCErrTextGet();
        if (page.offset == 0 && page.limit == 0) {
            EXPECT_EQ(result->rowCount, static_cast<int>(lines.size())) << "rowCount";
        }
        MediaInfoDBClose(result);
        return lines;
    }

    static std::vector<std::string> found(const std::string &keyword) {
        auto hits = rows(("title ilike '%" + keyword + "%'").c_str(), "path");
        EXPECT_FALSE(!hits.empty() && hits[0].substr(0, 6) == "failed") << keyword << hits[0];
        return hits;
    }

  private:
    const files::Places places_{ZANO_PATH_CONF};
    const files::Folder folder_;
    std::string location_;
};

}  // namespace zano::mediadb
