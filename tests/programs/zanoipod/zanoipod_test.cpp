/* From an iPod that libgpod makes, through the program, to the readers of the library. */
#include <gpod/itdb.h>
#include <gtest/gtest.h>
#include <vorelix/vorelix.h>
#include <zanoplatform/media_database.h>

#include <algorithm>
#include <functional>
#include <vector>

#include "support/files.h"
#include "support/process.h"
#include "support/text.h"
#include "system_paths_internal.h"

namespace {

namespace fs = std::filesystem;
using text::contains;

const std::string kFolder = ZANO_PATH_IPOD_FOLDER;
const std::string kTracks = kFolder + "tracks.m3u";

class ZanoIPod : public testing::Test {
  protected:
    ZanoIPod() : ipod_(folder_.path("iPod")) {
        EXPECT_EQ(ZANOSonmiraRestoreConf(), 1);
        fs::create_directory(ipod_);
        files::write(folder_.path("song.mp3"), "not read by anybody");
    }

    /* Makes an iPod with what fill() puts into its database. */
    void make(const std::function<void(Itdb_iTunesDB &)> &fill) const {
        ASSERT_TRUE(itdb_init_ipod(ipod_.c_str(), nullptr, "Test", nullptr));
        Itdb_iTunesDB *const database = itdb_parse(ipod_.c_str(), nullptr);
        ASSERT_NE(database, nullptr);
        fill(*database);
        EXPECT_TRUE(itdb_write(database, nullptr));
        itdb_free(database);
    }

    Itdb_Track *add(Itdb_iTunesDB &database, const char *title) const {
        Itdb_Track *const track = itdb_track_new();
        track->title = g_strdup(title);
        track->tracklen = 215499;
        track->bitrate = 192;
        track->samplerate = 44100;
        itdb_track_add(&database, track, -1);
        itdb_playlist_add_track(itdb_playlist_mpl(&database), track, -1);
        EXPECT_TRUE(itdb_cp_track_to_ipod(track, folder_.path("song.mp3").c_str(), nullptr));
        return track;
    }

    static Itdb_Playlist *addPlaylist(Itdb_iTunesDB &database, const char *name,
                                      const std::vector<Itdb_Track *> &tracks) {
        Itdb_Playlist *const playlist = itdb_playlist_new(name, 0);
        itdb_playlist_add(&database, playlist, -1);
        for (Itdb_Track *track : tracks) {
            itdb_playlist_add_track(playlist, track, -1);
        }
        return playlist;
    }

    /* The exit code, and what is printed to both outputs. */
    int run(const std::string &arguments) {
        const process::Outcome outcome = process::run(ZANOIPOD " " + arguments + " 2>&1");
        printed_ = outcome.text;
        return outcome.status;
    }

    /* "title|artist|duration", a line for each track; the files of all have to be there. */
    static std::string songs(const std::string &path) {
        ZANO_PLAYLIST_REC *list = nullptr;
        EXPECT_GE(ZANOIPodListSongsAll(path.c_str(), &list, 0, 0), 0);
        std::string text;
        for (const auto *node = list; node != nullptr; node = node->next) {
            text += std::string(node->info.title) + "|" + node->info.artist + "|" +
                    std::to_string(static_cast<int>(node->info.duration)) + "\n";
            EXPECT_EQ(files::read(node->info.path), "not read by anybody");
        }
        ZANOPlaylistRecFree(list);
        return text;
    }

    static std::string playlists() {
        ZANO_PLAYLIST *list = nullptr;
        EXPECT_EQ(ZANOIPodPlaylistGetAll(&list), 0);
        std::string titles;
        for (const auto *node = list; node != nullptr; node = node->next) {
            titles += std::string(node->title) + "\n";
        }
        ZANOPlayListFree(list);
        return titles;
    }

    const files::Places places_{ZANO_PATH_AUDIO_FOLDER};
    files::Folder folder_;
    std::string ipod_;
    std::string printed_;
};

TEST_F(ZanoIPod, TracksAndPlaylistsReachTheReaders) {
    const std::string longTitle = std::string(253, 'x') + "éé";
    std::string goneFile;
    make([&](Itdb_iTunesDB &database) {
        Itdb_Track *const first = add(database, "Ærlig: Ø");
        first->artist = g_strdup("  A\r\nB ");
        first->album = g_strdup("#title: no title");
        first->genre = g_strdup("Rock");
        Itdb_Track *const second = add(database, longTitle.c_str());
        Itdb_Track *const untitled = add(database, " ");
        Itdb_Track *const gone = add(database, "Gone");
        gchar *const path = itdb_filename_on_ipod(gone);
        goneFile = path;
        g_free(path);
        addPlaylist(database, "Road/Trip", {second, gone, first, first});
        addPlaylist(database, "Road/Trip", {untitled});
        addPlaylist(database, "tracks", {first});
        addPlaylist(database, "", {});
        addPlaylist(database, ".hidden", {});
        addPlaylist(database, std::string(300, 'p').c_str(), {});
        Itdb_Playlist *const podcasts = addPlaylist(database, "Podcasts", {second});
        itdb_playlist_set_podcasts(podcasts);
    });
    fs::remove(goneFile);
    EXPECT_EQ(run(ipod_), 0) << printed_;
    EXPECT_TRUE(contains(printed_, "left out 'Gone'"));
    const std::string first = "Ærlig: Ø|A  B|215\n";
    const std::string second = std::string(253, 'x') + "||215\n";
    const std::string all = songs(kTracks);
    EXPECT_EQ(all.find(first + second), 0U) << all;
    EXPECT_TRUE(contains(all, ".mp3||215\n")) << "the name of the file";
    EXPECT_EQ(std::count(all.begin(), all.end(), '\n'), 3);
    EXPECT_EQ(playlists(), "Playlist\nPodcasts\nRoad_Trip 2\nRoad_Trip\n_hidden\n" +
                               std::string(251, 'p') + "\ntracks 2\n");
    EXPECT_EQ(songs(kFolder + "Road_Trip.m3u"), second + first + first);
    EXPECT_EQ(songs(kFolder + "tracks 2.m3u"), first);
    EXPECT_EQ(songs(kFolder + "Podcasts.m3u"), second);
    EXPECT_EQ(songs(kFolder + "Playlist.m3u"), "");
    ZANO_MEDIA_INFO info{};
    EXPECT_EQ(ZANOIPodInfoGet(&info, 1), 0);
    EXPECT_EQ(std::string(info.title) + "|" + info.artist + "|" + info.album + "|" + info.genre,
              "Ærlig: Ø|A  B|#title: no title|Rock");
    EXPECT_EQ(info.bitrate, 192000);
    EXPECT_EQ(info.frequency, 44100);
}

TEST_F(ZanoIPod, AnotherIPodTakesThePlaceOfTheOneBefore) {
    make([&](Itdb_iTunesDB &database) { addPlaylist(database, "Old", {add(database, "a")}); });
    EXPECT_EQ(run(ipod_), 0);
    EXPECT_EQ(playlists(), "Old\n");
    const std::string before = files::read(kTracks);
    for (const std::string name : {"none", "song.mp3", "."}) {
        EXPECT_EQ(run(folder_.path(name)), 1) << name;
        EXPECT_TRUE(contains(printed_, "could not read an iPod at"));
    }
    EXPECT_EQ(run(""), 2);
    {
        const files::FullDisk disk(100);
        EXPECT_EQ(run(ipod_), 1);
    }
    EXPECT_EQ(files::read(kTracks), before);
    fs::remove_all(ipod_);
    fs::create_directory(ipod_);
    make([&](Itdb_iTunesDB &database) { addPlaylist(database, "New", {add(database, "b")}); });
    fs::create_directory(ZANO_PATH_AUDIO_FOLDER "/.ipod.new");  // as of a killed one
    EXPECT_EQ(run(ipod_), 0);
    EXPECT_EQ(playlists(), "New\n");
    EXPECT_EQ(songs(kTracks), "b||215\n");
    EXPECT_FALSE(fs::exists(ZANO_PATH_AUDIO_FOLDER "/.ipod.new"));
}

}  // namespace
