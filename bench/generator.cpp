#include "generator.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <string>

namespace zano::bench {
namespace {

constexpr std::array kWords = {
    "blue",  "night", "heart",  "river",    "golden", "stone",    "silent", "under",    "morning",
    "city",  "lost",  "fire",   "dance",    "street", "secret",   "home",   "rain",     "little",
    "moon",  "song",  "road",   "Träume",   "café",   "señor",    "été",    "Ångström", "ночь",
    "песня", "город", "любовь", "愛",       "夜の街", "ドライブ", "北京",   "μουσική",  "τραγούδι",
    "first", "again", "never",  "tomorrow", "light",  "shadow",   "glass",
};
constexpr std::array kGenres = {"Pop",   "Rock", "Electronic", "Hip-Hop", "Classical", "Metal",
                                "R&B",   "Folk", "House",      "Country", "Soul",      "Blues",
                                "Latin", "Punk", "Ambient",    "Chanson", "Schlager",  "Enka"};
constexpr std::int64_t kSongsPerAlbum = 11;
constexpr std::int64_t kFewSongs = 12;

/* SplitMix64: a good hash of a number, from its author's public-domain text. */
std::uint64_t mixed(std::uint64_t value) {
    value += 0x9E3779B97F4A7C15ULL;
    value = (value ^ (value >> 30)) * 0xBF58476D1CE4E5B9ULL;
    value = (value ^ (value >> 27)) * 0x94D049BB133111EBULL;
    return value ^ (value >> 31);
}

/* The n-th draw for a thing: below `bound`, small numbers far more often. */
std::uint64_t skewed(std::uint64_t seed, std::uint64_t bound) {
    const double uniform = static_cast<double>(mixed(seed) >> 11) / 9007199254740992.0;
    return std::min(
        bound - 1, static_cast<std::uint64_t>(static_cast<double>(bound) * std::pow(uniform, 2.5)));
}

std::string words(std::uint64_t seed, int count) {
    std::string text;
    for (int i = 0; i < count; ++i) {
        text.append(i == 0 ? "" : " ");
        text.append(kWords[mixed(seed * 7 + static_cast<std::uint64_t>(i)) % kWords.size()]);
    }
    return text;
}

std::string titleOf(std::int64_t index, std::int64_t count) {
    const auto seed = static_cast<std::uint64_t>(index);
    std::string title = words(seed + 1000000007, 1 + static_cast<int>(mixed(seed) % 3));
    title.append(" ").append(std::to_string(mixed(seed) % 1000));
    if (index % 2 == 0) {
        title.append(" wavelike");
    }
    if (index % 200 == 1) {
        title.append(" quixotic");
    }
    if (index % std::max<std::int64_t>(1, count / kFewSongs) == 3) {
        title.append(" zyzzyvas");
    }
    return title;
}

}  // namespace

mediadb::Song makeSong(std::int64_t index, std::int64_t count) {
    const std::int64_t album = index / kSongsPerAlbum;
    const auto albumSeed = static_cast<std::uint64_t>(album);
    const auto artists = static_cast<std::uint64_t>(std::max<std::int64_t>(1, count / 50));
    const std::uint64_t artist = skewed(albumSeed * 3 + 1, artists);
    mediadb::Song song;
    song.artist = words(artist + 77, 2) + " " + std::to_string(artist % 97);
    song.album = words(albumSeed + 555, 2) + " " + std::to_string(album % 31);
    song.title = titleOf(index, count);
    song.genre = kGenres[skewed(artist + 5, kGenres.size())];
    song.year = 1955 + static_cast<int>(mixed(albumSeed) % 70);
    song.track = 1 + static_cast<int>(index % kSongsPerAlbum);
    song.disc = 1;
    song.duration = 120 + static_cast<double>(mixed(static_cast<std::uint64_t>(index) + 3) % 300);
    song.bitrate = 192000;
    song.frequency = 44100;
    song.path = "/volume1/music/" + song.artist + "/" + std::to_string(album) + " " + song.album +
                "/" + std::to_string(song.track) + " " + song.title + ".mp3";
    std::replace(song.path.begin() + 15, song.path.end(), '\\', '-');
    song.stamp = {4000000 + index, 1700000000000000000 + index, 1700000000000000000 + index};
    return song;
}

void fill(mediadb::Catalogue &catalogue, std::int64_t count, const Progress &progress) {
    constexpr std::int64_t kBatch = 10000;
    for (std::int64_t begin = 0; begin < count; begin += kBatch) {
        catalogue.begin();
        for (std::int64_t i = begin; i < std::min(count, begin + kBatch); ++i) {
            catalogue.putSong(makeSong(i, count));
        }
        catalogue.commit();
        progress(std::min(count, begin + kBatch));
    }
    catalogue.finish({});
}

}  // namespace zano::bench
