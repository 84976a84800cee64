/* usage: queue_bench [Google Benchmark's options]
 *
 * Loads and saves a player's queue of 10 000 songs through the library, beside plain loops with the
 * same system calls and one allocation for each song. The files are written below the build's own
 * root, and removed at the end.
 */
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>
#include <vorelix/vorelix.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "report.h"

namespace zano::bench {
namespace {

constexpr int kSongs = 10000;
const std::string kFolder = ZANO_ROOT "/queue";
const std::string kPath = kFolder + "/queue";

/* What a program without the library would keep. */
struct Queue {
    PlayerInfo info{{0, 1, 0}, 0};
    std::vector<ZANO_MEDIA_INFO *> songs;
    Queue() = default;
    ~Queue() {
        for (ZANO_MEDIA_INFO *song : songs) {
            std::free(song);
        }
    }
    Queue(const Queue &) = delete;
    Queue &operator=(const Queue &) = delete;
};

template <typename Songs>
void fill(Songs &songs) {
    for (int id = 1; id <= kSongs; ++id) {
        auto *const song = static_cast<ZANO_MEDIA_INFO *>(std::calloc(1, sizeof(ZANO_MEDIA_INFO)));
        song->id = id;
        std::snprintf(song->path, sizeof song->path, "/volume1/music/%d.mp3", id);
        songs.push_back(song);
    }
}

bool loadPlainly() {
    struct stat status {};
    if (stat(kPath.c_str(), &status) != 0) {
        return false;
    }
    const int file = open(kPath.c_str(), O_RDONLY);
    bool isWhole = flock(file, LOCK_EX | LOCK_NB) == 0;
    const auto size = static_cast<std::size_t>(lseek(file, 0, SEEK_END));
    lseek(file, 0, SEEK_SET);
    Queue queue;
    isWhole = isWhole && read(file, &queue.info, sizeof queue.info) == sizeof queue.info;
    lseek(file, 0, SEEK_CUR);
    const std::size_t total = (size - sizeof queue.info) / sizeof(ZANO_MEDIA_INFO);
    for (std::size_t at = 0; at < total; ++at) {
        auto *const song = static_cast<ZANO_MEDIA_INFO *>(std::malloc(sizeof(ZANO_MEDIA_INFO)));
        isWhole = isWhole && read(file, song, sizeof *song) == sizeof *song;
        queue.songs.push_back(song);
    }
    flock(file, LOCK_UN);
    close(file);
    return isWhole && queue.songs.size() == kSongs;
}

bool savePlainly(const Queue &queue) {
    const int file = open(kPath.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
    bool isWhole = flock(file, LOCK_EX | LOCK_NB) == 0;
    isWhole = isWhole && write(file, &queue.info, sizeof queue.info) == sizeof queue.info;
    for (const ZANO_MEDIA_INFO *song : queue.songs) {
        isWhole = isWhole && write(file, song, sizeof *song) == sizeof *song;
    }
    flock(file, LOCK_UN);
    close(file);
    return isWhole;
}

bool loadThroughLibrary() {
    const std::unique_ptr<PlaylistInfo> list(AudioFile::PlaylistFileLoad(kPath.c_str(), 0, 0));
    return list != nullptr && list->songs.size() == kSongs;
}

void add(const char *name, const std::function<bool()> &action) {
    benchmark::RegisterBenchmark(name, [action](benchmark::State &state) {
        for (auto _ : state) {
            if (!action()) {
                state.SkipWithError("failed");
                return;
            }
        }
    });
}

}  // namespace
}  // namespace zano::bench

int main(int argc, char **argv) {
    using namespace zano::bench;
    std::filesystem::create_directories(kFolder);
    PlaylistInfo list;
    Queue queue;
    fill(list.songs);
    fill(queue.songs);
    add("10000 songs, save/library",
        [&list] { return AudioFile::PlaylistFileSave(kPath.c_str(), &list) == 0; });
    add("10000 songs, save/raw", [&queue] { return savePlainly(queue); });
    add("10000 songs, load/library", loadThroughLibrary);
    add("10000 songs, load/raw", loadPlainly);
    benchmark::Initialize(&argc, argv);
    RatioReporter reporter;
    benchmark::RunSpecifiedBenchmarks(&reporter);
    std::filesystem::remove_all(kFolder);
    return 0;
}
