/* Every input that the fuzzers found worth keeping, with the compiler at hand. */
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <vector>

#include "readers.h"

namespace vorelix::fuzz {
namespace {

void readCorpus(const char *name, void (*read)(const std::uint8_t *, std::size_t)) {
    int count = 0;
    const std::filesystem::path folder = std::filesystem::path(VORELIX_CORPORA) / name;
    for (const auto &file : std::filesystem::directory_iterator(folder)) {
        SCOPED_TRACE(file.path());
        std::ifstream input(file.path(), std::ios::binary);
        const std::vector<char> bytes{std::istreambuf_iterator<char>(input), {}};
        read(reinterpret_cast<const std::uint8_t *>(bytes.data()), bytes.size());
        ++count;
    }
    EXPECT_GT(count, 5) << folder;
}

TEST(FuzzCorpus, IsReadOrRefused) {
    readCorpus("playlists", readAsPlaylist);
    readCorpus("queues", readAsQueue);
    readCorpus("track_lists", readAsTrackList);
    readCorpus("configurations", readAsConfiguration);
    readCorpus("users", readAsUsers);
    readCorpus("custom_keys", readAsCustomKeys);
    testing::internal::CaptureStderr();  // libxml2 has a word to say about most answers
    readCorpus("answers", readAsAnswer);
    testing::internal::GetCapturedStderr();
}

}  // namespace
}  // namespace vorelix::fuzz
