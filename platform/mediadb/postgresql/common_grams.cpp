#include "common_grams.h"

namespace zano::mediadb::postgresql {
namespace {

constexpr std::size_t kBits = 8;
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

bool GramSet::has(std::size_t gram) const {
    return gram / kBits < bits_.size() &&
           (static_cast<unsigned char>(bits_[gram / kBits]) >> gram % kBits & 1U) != 0;
}

bool GramSet::hasEveryTrigramOf(std::string_view text) const {
    return !anyGram(text, [this](std::size_t gram, std::size_t length) {
        return length == kLongest && !has(gram);
    });
}

void GramSet::add(std::size_t gram) {
    bits_.resize((kGramNumbers + kBits - 1) / kBits);
    bits_[gram / kBits] = static_cast<char>(bits_[gram / kBits] | 1 << gram % kBits);
}

void GramCounts::add(std::string_view key) {
    ++keys_;
    anyGram(key, [this](std::size_t gram, std::size_t) {
        counts_[gram] += lastKey_[gram] != keys_ ? 1 : 0;
        lastKey_[gram] = keys_;
        return false;
    });
}

GramSet GramCounts::moreThan(std::int64_t keysOfThree, std::int64_t keysOfFewer) const {
    GramSet grams;
    for (std::size_t gram = 1; gram < kGramNumbers; ++gram) {
        if (counts_[gram] > (gram >= kGramSymbols * kGramSymbols ? keysOfThree : keysOfFewer)) {
            grams.add(gram);
        }
    }
    return grams;
}

}  // namespace zano::mediadb::postgresql
