/* The folder that holds the music, as the conditions of listings name it. */
#pragma once

#include <unistd.h>

#include <array>

#include "log_internal.h"
#include "system_paths_internal.h"

namespace vorelix {

/* The folder that the music link points to. */
using MusicRoot = std::array<char, 4096>;

/* Reads the music link into a zero-filled buffer; false, and the failure logged, when it cannot
 * be read. */
inline bool readMusicRoot(MusicRoot &root, const LogMessage<const char *> &failure) {
    // The last byte stays the NUL, which readlink does not write.
    if (readlink(ZANO_PATH_MUSIC_LINK, root.data(), root.size() - 1) == -1) {
        failure(ZANO_PATH_MUSIC_LINK);
        return false;
    }
    return true;
}

}  // namespace vorelix
