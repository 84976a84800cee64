#include <vorelix/misc/misc.h>

#include <tuple>

#include "support/platform_stand_in.h"

namespace {

class Volume : public stand_in::Test {};

TEST_F(Volume, OnlyUsbVolumesCount) {
    for (const auto &[parsed, type, result] :
         {std::tuple{0, 4, 1}, {7, 4, 1}, {0, 1, -1}, {0, 0, -1}, {0, 5, -1}, {-1, 4, -1}}) {
        stand_in::script().volumeResult = parsed;
        stand_in::script().volumeType = type;
        EXPECT_EQ(ZANOAudioIsUSBVolume("/volume1/a.mp3"), result) << parsed << " " << type;
    }
    EXPECT_EQ(stand_in::takeTrace(), "");
    EXPECT_EQ(stand_in::outcome(ZANOAudioIsUSBVolume(nullptr)), "-1 3 misc:298 Bad parameter.\n");
}

}  // namespace
