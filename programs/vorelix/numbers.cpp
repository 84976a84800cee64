#include "numbers.h"

#include <cmath>
#include <cstdio>

namespace vorelix {

namespace {

constexpr int kSecondsOfMinute = 60;
constexpr int kMinutesOfHour = 60;
constexpr int kKilo = 1000;

std::string twoDigits(long long number) {
    return (number < 10 ? "0" : "") + std::to_string(number);
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
    const std::string rest = ":" + twoDigits(all % kSecondsOfMinute);
    const long long minutes = all / kSecondsOfMinute;
    if (minutes < kMinutesOfHour) {
        return std::to_string(minutes) + rest;
    }
    return std::to_string(minutes / kMinutesOfHour) + ":" + twoDigits(minutes % kMinutesOfHour) +
           rest;
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
