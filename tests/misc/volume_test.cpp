#include <vorelix/misc/misc.h>

#include "support/platform_stand_in.h"

namespace {

class Volume : public stand_in::Test {};

TEST_F(Volume, OnlyUsbVolumesCount) {
    const struct {
        int parsed;
        int type;
        int result;
    } cases[] = {{0, 4, 1}, {7, 4, 1}, {0, 1, -1}, {0, 0, -1}, {0, 5, -1}, {-1, 4, -1}};
    for (const auto &each : cases) {
        stand_in::script().volumeResult = each.parsed;
        stand_in::script().volumeType = each.type;
        EXPECT_EQ(ZANOAudioIsUSBVolume("/volume1/a.mp3"), each.result)
            << each.parsed << " " << each.type;
    }
    EXPECT_EQ(stand_in::takeTrace(), "");
    EXPECT_EQ(ZANOAudioIsUSBVolume(nullptr), -1);
    EXPECT_EQ(stand_in::takeTrace(), "3 misc:298 Bad parameter.\n");
}

}  // namespace
