/* Every input that the fuzzer found worth keeping, with the compiler at hand. */
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <vector>

#include "read_playlist.h"

namespace zano::playlists {
namespace {

TEST(FuzzCorpus, PlaylistsAreReadOrRefused) {
    int count = 0;
    for (const auto &file : std::filesystem::directory_iterator(VORELIX_CORPUS)) {
        SCOPED_TRACE(file.path());
        std::ifstream input(file.path(), std::ios::binary);
        const std::vector<char> bytes{std::istreambuf_iterator<char>(input), {}};
        readAsEveryKind(reinterpret_cast<const std::uint8_t *>(bytes.data()), bytes.size());
        ++count;
    }
    EXPECT_GT(count, 10);
}

}  // namespace
}  // namespace zano::playlists
