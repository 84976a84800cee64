/* How many songs have which few letters in a row, as far as it is good to know before a search is
 * made: where a search can find only a few songs, or nearly fills a page wherever it begins, one
 * plan serves all searches of the kind, and making one for its words takes longer than the rest.
 * Stale knowledge costs time alone.
 *
 * Only the letters a to z and digits count: what else belongs to a word depends on the locale of
 * the server. */
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <string_view>
#include <utility>

namespace zano::mediadb::postgresql {

/* One to three of them in a row, in a number; 0 for any other text. */
std::size_t gramNumber(std::string_view text);
constexpr std::size_t kGramSymbols = 37;  // with 0 for none
constexpr std::size_t kGramNumbers = kGramSymbols * kGramSymbols * kGramSymbols;

/* Whether there are three in a row somewhere. */
bool hasTrigram(std::string_view text);

/* A bit for each number. */
class GramSet {
  public:
    GramSet() = default;
    explicit GramSet(std::string bits) : bits_(std::move(bits)) {}

    bool isKnown() const { return !bits_.empty(); }
    bool has(std::size_t gram) const;
    bool hasEveryTrigramOf(std::string_view text) const;
    void add(std::size_t gram);
    const std::string &bits() const { return bits_; }

  private:
    std::string bits_;
};

/* Counts some keys. */
class GramCounts {
  public:
    void add(std::string_view key);
    /* What more than so many keys have: three in a row, and fewer. */
    GramSet moreThan(std::int64_t keysOfThree, std::int64_t keysOfFewer) const;

  private:
    std::array<std::uint32_t, kGramNumbers> counts_{};
    std::array<std::uint32_t, kGramNumbers> lastKey_{};
    std::uint32_t keys_ = 0;
};

}  // namespace zano::mediadb::postgresql
