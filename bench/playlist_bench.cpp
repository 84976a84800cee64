/* usage: playlist_bench CATALOGUE [Google Benchmark's options]
 *
 * Reads, writes and edits playlists of 10 000 and 100 000 entries through the library, beside plain
 * loops that split the same bytes into the same records and write them with as many calls. Half of
 * the entries are songs of the catalogue, made by generate_catalogue; the loops look none of them
 * up. The settings that the library reads, and the playlists, are written below the build's own
 * root.
 */
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>
#include <vorelix/vorelix.h>
#include <zanoplatform/media_database.h>
#include <zanoplatform/playlist_parser.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <iterator>
#include <memory>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "report.h"
#include "root.h"

namespace zano::bench {
namespace {

struct FreeList {
    void operator()(ZANO_PLAYLIST_REC *list) const { ZANOPlaylistRecFree(list); }
};
using List = std::unique_ptr<ZANO_PLAYLIST_REC, FreeList>;

ZANO_PLAYLIST_REC *newRecord(std::string_view path) {
    auto *record = static_cast<ZANO_PLAYLIST_REC *>(std::calloc(1, sizeof(ZANO_PLAYLIST_REC)));
    path.copy(record->info.path, sizeof record->info.path - 1);
    return record;
}

/* The records of an m3u file without extended lines. */
List readPlainly(const std::string &path, std::string_view folder) {
    std::ifstream file(path, std::ios::binary);
    const std::string bytes{std::istreambuf_iterator<char>(file), {}};
    std::string absolute;
    List head;
    ZANO_PLAYLIST_REC **tail = nullptr;
    for (std::size_t at = 0; at < bytes.size();) {
        const std::size_t end = std::min(bytes.find('\n', at), bytes.size());
        std::string_view line(bytes.data() + at, end - at);
        at = end + 1;
        line = line.substr(0, line.find('\r'));
        if (line.empty() || line.front() == '#') {
            continue;
        }
        absolute.assign(folder).append("/").append(line);
        ZANO_PLAYLIST_REC *record = newRecord(absolute);
        if (tail == nullptr) {
            head.reset(record);
        } else {
            *tail = record;
        }
        tail = &record->next;
    }
    return head;
}

/* With relative paths. */
void writePlainly(const ZANO_PLAYLIST_REC *list, const std::string &path,
                  const std::string &folder) {
    std::string climb;
    for (const char c : folder) {
        climb.append(c == '/' ? "../" : "");
    }
    const int file = open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0666);
    flock(file, LOCK_EX | LOCK_NB);
    const auto put = [file](std::string_view text) {
        if (write(file, text.data(), text.size()) != static_cast<ssize_t>(text.size())) {
            throw std::runtime_error("a short write");
        }
    };
    put("#EXTM3U\r\n");
    std::string line;
    for (; list != nullptr; list = list->next) {
        const std::string_view entry = list->info.path;
        if (entry.substr(0, folder.size()) == folder) {
            line.assign(entry.substr(folder.size() + 1));
        } else {
            line.assign(climb).append(entry.substr(1));
        }
        put(line.append("\r\n"));
    }
    flock(file, LOCK_UN);
    close(file);
    chmod(path.c_str(), 0777);
}

class Playlists {
  public:
    Playlists(int entries, const std::string &folder)
        : entries_(entries), folder_(folder), path_(folder + "/list.m3u") {
        MEDIA_DB_RESULT *songs = MediaInfoDBOpen(MEDIA_TABLE_SONGS, "path", nullptr, nullptr,
                                                 nullptr, 0, entries / 2, 0);
        ZANO_PLAYLIST_REC **tail = nullptr;
        ZANO_MEDIA_INFO row;
        for (int i = 0; i < entries; ++i) {
            const bool isSong = i % 2 == 0 && MediaInfoDBGet(songs, &row) == 0;
            const std::string file = folder + "/file " + std::to_string(i) + ".mp3";
            ZANO_PLAYLIST_REC *record = newRecord(isSong ? row.path : file.c_str());
            record->info.id = 1;
            if (tail == nullptr) {
                list_.reset(record);
            } else {
                *tail = record;
            }
            tail = &record->next;
        }
        MediaInfoDBClose(songs);
        if (ZANOWriteMusicPlaylist(list_.get(), path_.c_str()) != 0) {
            throw std::runtime_error("cannot write " + path_);
        }
    }

    void addAll() {
        add("read/library", [this] { return isWhole(readThroughLibrary()); });
        add("read/raw", [this] { return isWhole(readPlainly(path_, folder_)); });
        add("write/library",
            [this] { return ZANOWriteMusicPlaylist(list_.get(), path_.c_str()) == 0; });
        add("write/raw", [this] {
            writePlainly(list_.get(), path_, folder_);
            return true;
        });
        add("edit/library",
            [this] { return ZANOPersonalPlaylistRemoveSongs(path_.c_str(), "999999999") == 0; });
        add("edit/raw", [this] {
            const List list = readPlainly(path_, folder_);
            writePlainly(list.get(), path_, folder_);
            return isWhole(list);
        });
    }

  private:
    List readThroughLibrary() const {
        int total = 0;
        return List(ParsePlayListByFieldGivenPath(path_.c_str(), &total, 0, 0, "*", 1));
    }

    bool isWhole(const List &list) const {
        return ZANOPlaylistRecCount(list.get()) == static_cast<unsigned>(entries_);
    }

    void add(const std::string &name, const std::function<bool()> &action) const {
        const std::string whole = std::to_string(entries_) + " entries, " + name;
        benchmark::RegisterBenchmark(whole.c_str(), [action](benchmark::State &state) {
            for (auto _ : state) {
                if (!action()) {
                    state.SkipWithError("failed");
                    return;
                }
            }
        });
    }

    int entries_;
    std::string folder_;
    std::string path_;
    List list_;
};

}  // namespace
}  // namespace zano::bench

int main(int argc, char **argv) {
    using zano::bench::Playlists;
    std::vector<std::unique_ptr<Playlists>> lists;
    return zano::bench::runComparison(
        argc, argv, "playlist_bench", [&lists](const std::string &catalogue) {
            const std::string root = zano::bench::prepareRoot(catalogue);
            for (const int entries : {10000, 100000}) {
                const std::string folder = root + "/" + std::to_string(entries);
                std::filesystem::create_directories(folder);
                lists.push_back(std::make_unique<Playlists>(entries, folder));
                lists.back()->addAll();
            }
        });
}
