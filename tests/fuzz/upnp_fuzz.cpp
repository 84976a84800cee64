/* libFuzzer's target for the decoder and parser of media servers' answers, built as
 * playlist_fuzz.cpp says:
 *
 *     BUILD/tests/fuzz/upnp_fuzz -max_total_time=600 -close_fd_mask=2 -dict=tests/fuzz/upnp.dict \
 *           NEW tests/fuzz/corpus/answers */
#include "read_answer.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *bytes, std::size_t size) {
    vorelix::fuzz::readAsAnswer(bytes, size);
    return 0;
}
