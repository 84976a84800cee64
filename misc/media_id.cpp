#include <vorelix/misc/misc.h>

#include <algorithm>
#include <array>
#include <bit>
#include <charconv>
#include <cstddef>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <optional>
#include <string_view>
#include <system_error>

namespace {

constexpr int kHexadecimal = 16;
constexpr unsigned int kBitsOfDigit = 4;
constexpr std::size_t kMaskDigits = 6;
constexpr std::size_t kLongestNumber = 8;
constexpr std::size_t kLongestText = kMaskDigits + 2 * kLongestNumber;

int digitsOf(unsigned int number) {
    return std::max(1,
                    static_cast<int>((std::bit_width(number) + kBitsOfDigit - 1) / kBitsOfDigit));
}

/* The number of a text that is all hexadecimal digits and fits 32 bits. Without a digit it is 0: a
 * text may end behind the mask. */
std::optional<unsigned int> numberOf(std::string_view digits) {
    unsigned int number = 0;
    const char *const end = digits.data() + digits.size();
    const auto [rest, error] = std::from_chars(digits.data(), end, number, kHexadecimal);
    if (!digits.empty() && (error != std::errc() || rest != end)) {
        return std::nullopt;
    }
    return number;
}

}  // namespace

char *MediaIDEncryption(unsigned id) {
    std::srand(id);
    unsigned int mask = 0;
    unsigned int reversed = 0;
    for (unsigned int digit = 0; digit < kMaskDigits; ++digit) {
        const unsigned int value = static_cast<unsigned int>(std::rand()) % kHexadecimal;
        mask = mask << kBitsOfDigit | value;
        reversed |= value << kBitsOfDigit * digit;
    }
    const unsigned int one = mask ^ id;
    const unsigned int other = reversed ^ id;
    const int width = std::max(digitsOf(one), digitsOf(other));
    std::array<char, kLongestText + 1> text{};
    std::snprintf(text.data(), text.size(), "%06x%0*x%0*x", mask, width, one, width, other);
    return strdup(text.data());
}

int MediaIDDecryption(const char *text) {
    const std::string_view all(text != nullptr ? text : "");
    if (all.size() < kMaskDigits) {
        return -1;
    }
    std::array<char, kMaskDigits> backwards{};
    std::reverse_copy(all.begin(), all.begin() + kMaskDigits, backwards.begin());
    const std::size_t width = (all.size() - kMaskDigits) / 2;
    const auto mask = numberOf(all.substr(0, kMaskDigits));
    const auto reversed = numberOf({backwards.data(), backwards.size()});
    const auto one = numberOf(all.substr(kMaskDigits, width));
    const auto other = numberOf(all.substr(kMaskDigits + width, width));
    if (!mask || !reversed || !one || !other || (*mask ^ *one) != (*reversed ^ *other)) {
        return -1;
    }
    return static_cast<int>(*mask ^ *one);
}
