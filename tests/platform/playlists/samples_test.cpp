#include <regex>

#include "format.h"
#include "locations.h"
#include "music.h"
#include "support/files.h"
#include "text.h"

namespace zano::playlists {
namespace {

/* Playlists as the library and other programs write them, in tests/data/playlists; beside each
 * NAME stands NAME.dump, what is read from it. */
std::vector<std::filesystem::path> samples() {
    std::vector<std::filesystem::path> paths;
    for (const auto &file : std::filesystem::directory_iterator(VORELIX_SAMPLES)) {
        if (file.path().extension() != ".dump") {
            paths.push_back(file.path());
        }
    }
    return paths;
}

class SamplesTest : public MusicTest {};

/* "/music/" in a sample that needs an absolute path stands for the music folder. */
std::string placedAt(const std::string &folder, const std::string &text) {
    return std::regex_replace(text, std::regex("(//|localhost)/music/"), "$1" + folder + "/");
}

TEST_F(SamplesTest, AreReadAsTheirDumpsSay) {
    ASSERT_GT(samples().size(), 30U);
    for (const auto &sample : samples()) {
        const std::string name = sample.filename().string();
        const std::string path = write(name, placedAt(music().string(), files::read(sample)));
        EXPECT_EQ(dump(path), files::read(sample.string() + ".dump")) << name;
        std::filesystem::remove(path);
    }
}

/* Whatever is cut off, what is before it stays as it is read from the whole, line by line, and
 * nothing behind the end is looked at. */
TEST_F(SamplesTest, CutAtEveryByteAreReadOrRefused) {
    for (const auto &sample : samples()) {
        const std::string whole = files::read(sample);
        for (std::size_t size = 0; size < whole.size(); ++size) {
            const std::vector<char> bytes(whole.begin(),
                                          whole.begin() + static_cast<std::ptrdiff_t>(size));
            std::string converted;
            Playlist playlist;
            try {
                readPlaylist(fileText({bytes.data(), size}, converted), sample.string(), playlist);
            } catch (const PlaylistError &error) {
                EXPECT_EQ(error.code(), KLIB_ERR_PLAYLIST_NOT_ONE) << sample << size;
            }
            const Locations locations("/music", playlist.texts);
            for (const Entry &entry : playlist.entries) {
                ASSERT_EQ(locations.path(entry.location).empty(), false);
                locations.otherPaths(entry);
            }
        }
    }
}

TEST(M3u, ACutListKeepsTheEntriesBeforeTheCut) {
    const std::string whole = files::read(std::filesystem::path(VORELIX_SAMPLES) / "library.m3u");
    Playlist all;
    readM3u(whole, all);
    for (std::size_t size = 0; size < whole.size(); ++size) {
        Playlist cut;
        readM3u(std::string_view(whole).substr(0, size), cut);
        for (std::size_t i = 0; i + 1 < cut.entries.size(); ++i) {
            ASSERT_EQ(cut.entries[i].location, all.entries[i].location) << size;
            ASSERT_EQ(cut.entries[i].tags.title, all.entries[i].tags.title) << size;
        }
    }
}

}  // namespace
}  // namespace zano::playlists
