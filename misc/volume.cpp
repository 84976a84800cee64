#include <vorelix/misc/misc.h>
#include <zanoplatform/volumes.h>

#include "log_internal.h"

namespace {

constexpr vorelix::LogMessage<> kBadParameter{"misc", "%s:%d Bad parameter.", 298};

}  // namespace

int ZANOAudioIsUSBVolume(const char *path) {
    if (path == nullptr) {
        kBadParameter();
        return -1;
    }
    VOLUME_INFO volume{};
    return VolumePathParse(path, &volume) >= 0 && volume.type == VOLUME_TYPE_USB ? 1 : -1;
}
