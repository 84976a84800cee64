/* A folder of music, a media database that knows most of it, and what is read from playlists. */
#pragma once

#include <zanoplatform/playlist_parser.h>

#include <memory>

#include "../mediadb/fixture.h"

namespace zano::playlists {

struct FreeList {
    void operator()(ZANO_PLAYLIST_REC *list) const { ZANOPlaylistRecFree(list); }
};
using List = std::unique_ptr<ZANO_PLAYLIST_REC, FreeList>;

class MusicTest : public mediadb::MediaDatabaseTest {
  protected:
    MusicTest() : music_(std::filesystem::path(databasePath()).parent_path() / "music") {
        std::filesystem::create_directories(music_);
        auto catalogue = mediadb::openCatalogue(location());
        std::vector<mediadb::Song> songs;
        for (const char *name :
             {"Artist/Album/01 First.mp3", "Artist/Album/02 Second.mp3",
              "K\u00e4se/Br\u00f6tchen.mp3", "Nfd/Cafe\u0301.mp3", "Mix\u00e9/e\u0301\u00e9.mp3",
              "100% #1 & more.mp3", "#hash.mp3", "raw\xff.mp3", "a & b.mp3"}) {
            songs.push_back(song((music_ / name).string(), "title of " + std::string(name)));
            songs.back().artist = "artist";
            songs.back().year = 2001;
            songs.back().duration = 61.5;
            touch(name);
        }
        put(*catalogue, songs);
        for (const char *name : {"loose.mp3", "#on disk.mp3", "R&amp;B.mp3"}) {
            touch(name);
        }
    }

    const std::filesystem::path &music() const { return music_; }

    std::string write(const std::string &name, const std::string &contents) const {
        const std::string path = (music_ / name).string();
        std::filesystem::create_directories(std::filesystem::path(path).parent_path());
        std::ofstream(path, std::ios::binary) << contents;
        return path;
    }
    void touch(const std::string &name) const { write(name, ""); }

    /* A line for each record, "~" for the music folder; or the error. */
    std::string dump(const std::string &path, const char *fields = "*") const {
        int total = -1;
        const List list(ParsePlayListByFieldGivenPath(path.c_str(), &total, 0, 0, fields, 1));
        return dump(list.get(), total);
    }

    std::string dump(const ZANO_PLAYLIST_REC *list, int total) const {
        std::ostringstream text;
        if (KLIBCErrGet() != KLIB_ERR_NONE) {
            text << std::hex << "error " << KLIBCErrGet() << " " << shortened(KLIBCErrTextGet());
            EXPECT_TRUE(list == nullptr && total == 0) << text.str();
            return text.str() + "\n";
        }
        int count = 0;
        for (const auto *at = list; at != nullptr; at = at->next, ++count) {
            const ZANO_MEDIA_INFO &info = at->info;
            text << (info.id != 0 ? "song " : "     ") << shortened(info.path);
            for (const char *tag : {info.title, info.artist, info.album, info.genre}) {
                text << "|" << tag;
            }
            text << "|" << info.year << "|" << info.disc << "|" << info.track << "|"
                 << info.duration << "\n";
        }
        EXPECT_EQ(total, count);
        return text.str();
    }

    /* The folder's own name differs from run to run. */
    std::string shortened(std::string text) const {
        const std::string names[][2] = {{music_.string(), "~"},
                                        {music_.parent_path().string(), "~/.."}};
        for (const auto &[name, sign] : names) {
            for (auto at = text.find(name); at != std::string::npos; at = text.find(name)) {
                text.replace(at, name.size(), sign);
            }
        }
        return text;
    }

  private:
    std::filesystem::path music_;
};

}  // namespace zano::playlists
