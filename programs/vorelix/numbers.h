/* Numbers of a song as people read them; "" where the number is 0, which means unknown. */
#pragma once

#include <string>

namespace vorelix {

std::string numberText(int number);
std::string durationText(double seconds);    // 3:05, 1:02:03
std::string bitrateText(int bitsPerSecond);  // 320 kbit/s
std::string frequencyText(int hertz);        // 44.1 kHz

}  // namespace vorelix
