/* libFuzzer's target for the files of the player, the users, the configuration and the iPod; each
 * becomes a fuzzer of its own, named after its corpus:
 *
 *     cmake -B BUILD -DCMAKE_CXX_COMPILER=clang++ -DVORELIX_SANITIZE=ON -DVORELIX_TESTS=ON \
 *           -DVORELIX_FUZZ=ON -DZANO_ROOT=BUILD/root
 *     BUILD/tests/fuzz/queues_fuzz -max_total_time=300 -max_len=30000 NEW tests/fuzz/corpus/queues
 *
 * What it finds new goes to the folder NEW; -merge=1 makes the corpus small again. */
#include "read_state.h"

#include <string_view>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *bytes, std::size_t size) {
    for (const vorelix::fuzz::Target &target : vorelix::fuzz::kTargets) {
        if (std::string_view(target.corpus) == VORELIX_FUZZ_TARGET) {
            target.read(bytes, size);
        }
    }
    return 0;
}
