#include "common_grams.h"

#include <optional>

namespace zano::mediadb::postgresql {
namespace {

constexpr std::size_t kBits = 8;

std::optional<std::size_t> symbolOf(char character) {
    if (character >= 'a' && character <= 'z') {
        return static_cast<std::size_t>(character - 'a');
    }
    if (character >= '0' && character <= '9') {
        return static_cast<std::size_t>(character - '0') + 26;
    }
    return std::nullopt;
}

/* Calls back with the number of every trigram, until that returns true. */
template <typename Callback>
bool anyGram(std::string_view text, const Callback &callback) {
    std::size_t gram = 0;
    std::size_t length = 0;
    for (const char character : text) {
        const auto symbol = symbolOf(character);
        length = symbol ? length + 1 : 0;
        gram = (gram * GramCounts::kSymbols + symbol.value_or(0)) % GramCounts::kGrams;
        if (length >= 3 && callback(gram)) {
            return true;
        }
    }
    return false;
}

}  // namespace

bool hasGram(std::string_view text) {
    return anyGram(text, [](std::size_t) { return true; });
}

bool CommonGrams::hasRareIn(std::string_view text) const {
    return bits_.size() * kBits >= GramCounts::kGrams && anyGram(text, [this](std::size_t gram) {
               const auto byte = static_cast<unsigned char>(bits_[gram / kBits]);
               return (byte >> (gram % kBits) & 1U) == 0;
           });
}

void GramCounts::add(std::string_view key) {
    ++keys_;
    anyGram(key, [this](std::size_t gram) {
        counts_[gram] += lastKey_[gram] != keys_ ? 1 : 0;
        lastKey_[gram] = keys_;
        return false;
    });
}

std::string GramCounts::commonOnes(std::int64_t keys) const {
    std::string bits((kGrams + kBits - 1) / kBits, '\0');
    for (std::size_t gram = 0; gram < kGrams; ++gram) {
        if (counts_[gram] > keys) {
            bits[gram / kBits] = static_cast<char>(bits[gram / kBits] | 1 << gram % kBits);
        }
    }
    return bits;
}

}  // namespace zano::mediadb::postgresql
