/* What the fuzzers and the test of their corpora do with one input: as a file of the player, the
 * users, the configuration or the iPod. Each aborts when what was read is not as promised. The
 * files stand in memory; links below the build's root lead to them from the fixed paths. */
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

namespace vorelix::fuzz {

using Read = void (*)(const std::uint8_t *bytes, std::size_t size);

void readAsQueue(const std::uint8_t *bytes, std::size_t size);
void readAsTrackList(const std::uint8_t *bytes, std::size_t size);
void readAsConfiguration(const std::uint8_t *bytes, std::size_t size);
void readAsUsers(const std::uint8_t *bytes, std::size_t size);
void readAsCustomKeys(const std::uint8_t *bytes, std::size_t size);

struct Target {
    const char *corpus; /* its folder */
    Read read;
};
inline constexpr std::array<Target, 5> kTargets{{{"queues", readAsQueue},
                                                 {"track_lists", readAsTrackList},
                                                 {"configurations", readAsConfiguration},
                                                 {"users", readAsUsers},
                                                 {"custom_keys", readAsCustomKeys}}};

}  // namespace vorelix::fuzz
