/* Which trigrams are common, so that a search that can find only a few songs is known before it is
 * made: one plan, by the trigram index, serves all of those, and planning would take longer than
 * finding them. Stale knowledge costs time alone. */
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <string_view>
#include <utility>

namespace zano::mediadb::postgresql {

/* Only trigrams of the letters a to z and digits count: what else belongs to a word depends on the
 * locale of the server. */
bool hasGram(std::string_view text);

class CommonGrams {
  public:
    /* A bit for each trigram, as GramCounts writes them; "": all count as common. */
    explicit CommonGrams(std::string bits) : bits_(std::move(bits)) {}

    /* Whether a text has a trigram that few songs have. */
    bool hasRareIn(std::string_view text) const;

  private:
    std::string bits_;
};

/* Counts the trigrams of some keys. */
class GramCounts {
  public:
    static constexpr std::size_t kSymbols = 36;
    static constexpr std::size_t kGrams = kSymbols * kSymbols * kSymbols;

    void add(std::string_view key);
    /* The bits of those that more than so many keys have. */
    std::string commonOnes(std::int64_t keys) const;

  private:
    std::array<std::uint32_t, kGrams> counts_{};
    std::array<std::uint32_t, kGrams> lastKey_{};
    std::uint32_t keys_ = 0;
};

}  // namespace zano::mediadb::postgresql
