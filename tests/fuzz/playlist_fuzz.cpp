/* libFuzzer's target for the playlist parser:
 *
 *     cmake -B BUILD -DCMAKE_CXX_COMPILER=clang++ -DVORELIX_SANITIZE=ON -DVORELIX_TESTS=ON \
 *           -DVORELIX_FUZZ=ON -DZANO_ROOT=$PWD/BUILD/root
 *     BUILD/tests/fuzz/playlist_fuzz -max_total_time=600 NEW tests/fuzz/corpus/playlists
 *
 * What it finds new goes to the folder NEW; -merge=1 makes the corpus small again. */
#include "read_playlist.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *bytes, std::size_t size) {
    zano::playlists::readAsEveryKind(bytes, size);
    return 0;
}
