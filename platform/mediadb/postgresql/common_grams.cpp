#include "common_grams.h"

#include <algorithm>

namespace zano::mediadb::postgresql {
namespace {

constexpr std::size_t kInByte = 4;
constexpr unsigned kMask = 3;
constexpr std::size_t kLongest = 3;

std::size_t symbolOf(char character) {
    if (character >= 'a' && character <= 'z') {
        return static_cast<std::size_t>(character - 'a') + 1;
    }
    if (character >= '0' && character <= '9') {
        return static_cast<std::size_t>(character - '0') + 27;
    }
    return 0;
}

/* Calls back with the number and the length of everything in a text that has one, until that
 * returns true. */
template <typename Callback>
bool anyGram(std::string_view text, const Callback &callback) {
    for (std::size_t begin = 0; begin < text.size(); ++begin) {
        std::size_t number = 0;
        for (std::size_t length = 1; length <= kLongest && begin + length <= text.size();
             ++length) {
            const std::size_t symbol = symbolOf(text[begin + length - 1]);
            if (symbol == 0) {
                break;
            }
            number = number * kGramSymbols + symbol;
            if (callback(number, length)) {
                return true;
            }
        }
    }
    return false;
}

}  // namespace

std::size_t gramNumber(std::string_view text) {
    std::size_t found = 0;
    anyGram(text, [&](std::size_t number, std::size_t length) {
        found = length == text.size() ? number : 0;
        return found != 0;
    });
    return found;
}

bool hasTrigram(std::string_view text) {
    return anyGram(text, [](std::size_t, std::size_t length) { return length == kLongest; });
}

Share GramShares::of(std::size_t gram) const {
    if (gram / kInByte >= bits_.size()) {
        return Share::Few;
    }
    const auto byte = static_cast<unsigned char>(bits_[gram / kInByte]);
    return static_cast<Share>(byte >> gram % kInByte * 2 & kMask);
}

std::optional<Share> GramShares::leastIn(std::string_view text) const {
    std::optional<Share> least;
    anyGram(text, [&](std::size_t gram, std::size_t) {
        least = std::min(least.value_or(Share::Many), of(gram));
        return least == Share::Few;
    });
    return isKnown() ? least : std::nullopt;
}

void GramShares::set(std::size_t gram, Share share) {
    bits_.resize((kGramNumbers + kInByte - 1) / kInByte);
    char &byte = bits_[gram / kInByte];
    byte = static_cast<char>(byte | static_cast<unsigned>(share) << gram % kInByte * 2);
}

void GramCounts::add(std::string_view key) {
    ++keys_;
    anyGram(key, [this](std::size_t gram, std::size_t) {
        counts_[gram] += lastKey_[gram] != keys_ ? 1 : 0;
        lastKey_[gram] = keys_;
        return false;
    });
}

GramShares GramCounts::shares(std::int64_t few, std::int64_t many) const {
    GramShares shares;
    for (std::size_t gram = 0; gram < kGramNumbers; ++gram) {
        const std::int64_t count = counts_[gram];
        shares.set(gram, count > many ? Share::Many : count > few ? Share::Some : Share::Few);
    }
    return shares;
}

}  // namespace zano::mediadb::postgresql
