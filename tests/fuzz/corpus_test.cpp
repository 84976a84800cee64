/* Every input that the fuzzers found worth keeping, with the compiler at hand. */
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <vector>

#include "read_answer.h"
#include "read_playlist.h"
#include "read_state.h"

namespace vorelix::fuzz {
namespace {

void readCorpus(const Target &target) {
    int count = 0;
    const std::filesystem::path folder = std::filesystem::path(VORELIX_CORPORA) / target.corpus;
    for (const auto &file : std::filesystem::directory_iterator(folder)) {
        SCOPED_TRACE(file.path());
        std::ifstream input(file.path(), std::ios::binary);
        const std::vector<char> bytes{std::istreambuf_iterator<char>(input), {}};
        target.read(reinterpret_cast<const std::uint8_t *>(bytes.data()), bytes.size());
        ++count;
    }
    EXPECT_GT(count, 5) << folder;
}

TEST(FuzzCorpus, PlaylistsAreReadOrRefused) {
    readCorpus({"playlists", zano::playlists::readAsEveryKind});
}

TEST(FuzzCorpus, FilesOfTheDeviceAreReadOrRefused) {
    for (const Target &target : kTargets) {
        readCorpus(target);
    }
}

TEST(FuzzCorpus, AnswersOfMediaServersAreReadOrRefused) {
    testing::internal::CaptureStderr();  // libxml2 has a word to say about most
    readCorpus({"answers", readAsAnswer});
    testing::internal::GetCapturedStderr();
}

}  // namespace
}  // namespace vorelix::fuzz
