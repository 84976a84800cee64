/* A pattern of `like` or `ilike`, taken apart. */
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace zano::mediadb {

class Pattern {
  public:
    struct Piece {
        enum class Kind { Literal, AnyText, AnyCharacter };
        Kind kind;
        std::string text;  // of a literal
    };

    /* % stands for any text, _ for one character, \ takes the meaning from what follows; a \ at
     * the very end stands for itself. With fold, literals become their folded keys. */
    Pattern(std::string_view text, bool fold);

    const std::vector<Piece> &pieces() const { return pieces_; }

    bool matchesEverything() const;
    /* The text, when the pattern asks for just this: the whole, the beginning, or a part. */
    std::optional<std::string_view> exact() const;
    std::optional<std::string_view> prefix() const;
    std::optional<std::string_view> part() const;

    /* Whether a text is matched, in time proportional to text and pattern at the worst. */
    bool matches(std::string_view text) const;

    /* The pattern as text again, with \ as its escape character. */
    std::string likeText() const;

  private:
    void addWildcard(Piece::Kind kind);
    void addLiteral(std::string literal, bool fold);
    bool isLiteral(size_t index) const;
    bool isAnyText(size_t index) const;

    std::vector<Piece> pieces_;
};

/* The first text in byte order that lies behind every text with this prefix; null: none does. */
std::optional<std::string> endOfPrefix(std::string_view prefix);

}  // namespace zano::mediadb
