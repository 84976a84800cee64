/* How many songs have which few letters in a row, as far as it is good to know before a search is
 * made: which way is the shortest depends on it. Stale knowledge costs time alone.
 *
 * Only the letters a to z and digits count: what else belongs to a word depends on the locale of
 * the server. */
#pragma once

#include <array>
#include <cstdint>
#include <optional>
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

/* Few: all songs that have it are found sooner than a walk along an order comes by a page of them.
 * Many: such a walk is not much longer than the page. */
enum class Share : unsigned char { Few, Some, Many };

/* Of each number, in two bits. */
class GramShares {
  public:
    GramShares() = default;
    explicit GramShares(std::string bits) : bits_(std::move(bits)) {}

    bool isKnown() const { return !bits_.empty(); }
    Share of(std::size_t gram) const;
    /* Of what the text has that the fewest songs have: no more songs have the text itself. Null:
     * there is nothing in it that has a number, or nothing is known. */
    std::optional<Share> leastIn(std::string_view text) const;
    void set(std::size_t gram, Share share);
    const std::string &bits() const { return bits_; }

  private:
    std::string bits_;
};

/* Counts some keys. */
class GramCounts {
  public:
    void add(std::string_view key);
    /* Few are so many keys at most, many are more than so many. */
    GramShares shares(std::int64_t few, std::int64_t many) const;

  private:
    std::array<std::uint32_t, kGramNumbers> counts_{};
    std::array<std::uint32_t, kGramNumbers> lastKey_{};
    std::uint32_t keys_ = 0;
};

}  // namespace zano::mediadb::postgresql
