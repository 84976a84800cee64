/* What the fuzzer and the test of its corpus do with one input. */
#pragma once

#include <cstddef>
#include <cstdint>

namespace zano::playlists {

/* Reads the bytes as a playlist of each kind, and makes every path that its entries may mean.
 * Aborts when one of them is not as promised. */
void readAsEveryKind(const std::uint8_t *bytes, std::size_t size);

}  // namespace zano::playlists
