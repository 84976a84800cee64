/* The rights of users, by the names that their file has for them. */
#pragma once

#include <vorelix/users/audiousers.h>

namespace vorelix {

struct Right {
    const char *name;
    unsigned bit;
};

inline constexpr Right kRights[] = {
    {"usb", AudioUsers::kUsb},           {"streaming", AudioUsers::kStreaming},
    {"playlist", AudioUsers::kPlaylist}, {"upnp", AudioUsers::kUpnp},
    {"editsong", AudioUsers::kEditSong},
};

}  // namespace vorelix
