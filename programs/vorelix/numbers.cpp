#include "numbers.h"

#include <cmath>
#include <cstdio>

namespace vorelix {

namespace {

constexpr int kSecondsOfMinute = 60;
constexpr int kMinutesOfHour = 60;
constexpr int kKilo = 1000;

/* ":05" */
void appendTwoDigits(std::string &text, long long number) {
    text.append(number < 10 ? ":0" : ":").append(std::to_string(number));
}

}  // namespace

std::string numberText(int number) {
    return number == 0 ? "" : std::to_string(number);
}

std::string durationText(double seconds) {
    if (!std::isfinite(seconds) || seconds <= 0) {
        return {};
    }
    const long long all = std::llround(seconds);
    const long long minutes = all / kSecondsOfMinute;
    std::string text;
    if (minutes < kMinutesOfHour) {
        text = std::to_string(minutes);
    } else {
        text = std::to_string(minutes / kMinutesOfHour);
        appendTwoDigits(text, minutes % kMinutesOfHour);
    }
    appendTwoDigits(text, all % kSecondsOfMinute);
    return text;
}

std::string bitrateText(int bitsPerSecond) {
    return bitsPerSecond == 0 ? "" : std::to_string(bitsPerSecond / kKilo) + " kbit/s";
}

std::string frequencyText(int hertz) {
    if (hertz == 0) {
        return {};
    }
    char text[32];
    std::snprintf(text, sizeof(text), "%g kHz", hertz / double{kKilo});
    return text;
}

}  // namespace vorelix
