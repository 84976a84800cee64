/* What the fuzzer and the test of its corpus do with one answer of a media server. */
#pragma once

#include <cstddef>
#include <cstdint>

namespace vorelix::fuzz {

/* Decodes the bytes as a response, without what would keep the decoder for ever: an "&" that begins
 * none of its entities. Parses what comes out, and the bytes as they came, and asks every node for
 * values. Aborts when something is not as promised. */
void readAsAnswer(const std::uint8_t *bytes, std::size_t size);

}  // namespace vorelix::fuzz
