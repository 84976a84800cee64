/* libFuzzer's target for one of the readers; each becomes a fuzzer of its own:
 *
 *     cmake -B BUILD -DCMAKE_CXX_COMPILER=clang++ -DVORELIX_SANITIZE=ON -DVORELIX_TESTS=ON \
 *           -DVORELIX_FUZZ=ON -DZANO_ROOT=$PWD/BUILD/root
 *     BUILD/tests/fuzz/playlist_fuzz -max_total_time=600 NEW tests/fuzz/corpus/playlists
 *     BUILD/tests/fuzz/queues_fuzz -max_total_time=300 -max_len=30000 NEW tests/fuzz/corpus/queues
 *     BUILD/tests/fuzz/upnp_fuzz -max_total_time=600 -close_fd_mask=2 -dict=tests/fuzz/upnp.dict \
 *           NEW tests/fuzz/corpus/answers
 *
 * What it finds new goes to the folder NEW; -merge=1 makes the corpus small again. */
#include "readers.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *bytes, std::size_t size) {
    vorelix::fuzz::VORELIX_FUZZ_READER(bytes, size);
    return 0;
}
