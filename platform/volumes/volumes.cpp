#include <zanoplatform/volumes.h>

#include <zanoplatform/error.h>

#include <algorithm>
#include <chrono>
#include <exception>

#include "mount_table.h"
#include "strings/error_internal.h"

namespace {

zano::volumes::MountTable &systemMounts() {
    /* About as long as writing a playlist takes. */
    constexpr std::chrono::milliseconds kFolderLifetime(100);
    static zano::volumes::MountTable mounts(zano::volumes::processMounts(), "/sys/dev/block",
                                            kFolderLifetime);
    return mounts;
}

int fail(int code, const char *text) {
    zano::setError(code, text);
    return -1;
}

}  // namespace

int VolumePathParse(const char *path, VOLUME_INFO *volume) {
    try {
        zano::clearError();
        if (path == nullptr || volume == nullptr || path[0] != '/') {
            return fail(KLIB_ERR_BAD_PARAMETER, "a volume is asked for by an absolute path");
        }
        const auto found = systemMounts().volumeOf(path);
        if (!found || found->mountPoint.size() >= sizeof volume->mountPoint) {
            return fail(KLIB_ERR_VOLUMES_UNREADABLE, "the mounts cannot be read");
        }
        volume->size = sizeof *volume;
        volume->type = found->type;
        const auto end = std::copy(found->mountPoint.begin(), found->mountPoint.end(),
                                   std::begin(volume->mountPoint));
        *end = '\0';
        return 0;
    } catch (const std::exception &) {
        return fail(KLIB_ERR_OUT_OF_MEMORY, "out of memory while looking for a volume");
    }
}
