/* What the fuzzers and the test of their corpora do with one input. Each aborts when what was read
 * is not as promised. */
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdlib>

namespace vorelix::fuzz {

/* Aborts, which a fuzzer reports with the input, when something is not so. */
inline void require(bool isSo) {
    if (!isSo) {
        std::abort();
    }
}

/* As files of the player, the users, the configuration and the iPod. They stand in memory; links
 * below the build's root lead to them from the fixed paths. */
void readAsQueue(const std::uint8_t *bytes, std::size_t size);
void readAsTrackList(const std::uint8_t *bytes, std::size_t size);
void readAsConfiguration(const std::uint8_t *bytes, std::size_t size);
void readAsUsers(const std::uint8_t *bytes, std::size_t size);
void readAsCustomKeys(const std::uint8_t *bytes, std::size_t size);

/* As a playlist of each kind, with every path that its entries may mean. */
void readAsPlaylist(const std::uint8_t *bytes, std::size_t size);

/* Decodes the bytes as a media server's answer, without what would keep the decoder for ever: an
 * "&" that begins none of its entities. Parses what comes out, and the bytes as they came, and asks
 * every node for values. */
void readAsAnswer(const std::uint8_t *bytes, std::size_t size);

}  // namespace vorelix::fuzz
