#include "pattern.h"

#include <algorithm>
#include <utility>

#include "text/fold.h"

namespace zano::mediadb {

Pattern::Pattern(std::string_view text, bool fold) {
    std::string literal;
    for (size_t i = 0; i < text.size(); ++i) {
        if (text[i] == '\\' && i + 1 < text.size()) {
            literal.push_back(text[++i]);
        } else if (text[i] == '%' || text[i] == '_') {
            addLiteral(std::exchange(literal, {}), fold);
            addWildcard(text[i] == '%' ? Piece::Kind::AnyText : Piece::Kind::AnyCharacter);
        } else {
            literal.push_back(text[i]);
        }
    }
    addLiteral(std::move(literal), fold);
}

void Pattern::addWildcard(Piece::Kind kind) {
    const bool repeats = kind == Piece::Kind::AnyText && !pieces_.empty() &&
                         pieces_.back().kind == Piece::Kind::AnyText;
    if (!repeats) {
        pieces_.push_back({kind, {}});
    }
}

void Pattern::addLiteral(std::string literal, bool fold) {
    if (fold) {
        literal = foldedKey(literal);
    }
    if (!literal.empty()) {
        pieces_.push_back({Piece::Kind::Literal, std::move(literal)});
    }
}

bool Pattern::isLiteral(size_t index) const {
    return index < pieces_.size() && pieces_[index].kind == Piece::Kind::Literal;
}

bool Pattern::isAnyText(size_t index) const {
    return index < pieces_.size() && pieces_[index].kind == Piece::Kind::AnyText;
}

bool Pattern::matchesEverything() const {
    return pieces_.size() == 1 && isAnyText(0);
}

std::optional<std::string_view> Pattern::exact() const {
    if (pieces_.empty()) {
        return std::string_view();
    }
    return pieces_.size() == 1 && isLiteral(0) ? std::optional<std::string_view>(pieces_[0].text)
                                               : std::nullopt;
}

std::optional<std::string_view> Pattern::prefix() const {
    return pieces_.size() == 2 && isLiteral(0) && isAnyText(1)
               ? std::optional<std::string_view>(pieces_[0].text)
               : std::nullopt;
}

std::optional<std::string_view> Pattern::part() const {
    return pieces_.size() == 3 && isAnyText(0) && isLiteral(1) && isAnyText(2)
               ? std::optional<std::string_view>(pieces_[1].text)
               : std::nullopt;
}

/* When a piece does not fit, only the last % can take more: the pieces before it have found their
 * first places, and later ones could not do better. */
bool Pattern::matches(std::string_view text) const {
    size_t piece = 0;
    std::optional<size_t> lastAnyText;
    std::string_view lastRest;
    std::string_view rest = text;
    for (;;) {
        if (piece == pieces_.size() && rest.empty()) {
            return true;
        }
        if (isAnyText(piece)) {
            lastAnyText = piece++;
            lastRest = rest;
        } else if (isLiteral(piece) &&
                   rest.substr(0, pieces_[piece].text.size()) == pieces_[piece].text) {
            rest.remove_prefix(pieces_[piece++].text.size());
        } else if (piece < pieces_.size() && !isLiteral(piece) && !rest.empty()) {
            takeCharacter(rest);
            ++piece;
        } else if (lastAnyText && !lastRest.empty()) {
            takeCharacter(lastRest);
            rest = lastRest;
            piece = *lastAnyText + 1;
        } else {
            return false;
        }
    }
}

std::string Pattern::likeText() const {
    std::string text;
    for (const Piece &piece : pieces_) {
        if (piece.kind != Piece::Kind::Literal) {
            text.push_back(piece.kind == Piece::Kind::AnyText ? '%' : '_');
            continue;
        }
        for (const char c : piece.text) {
            if (c == '%' || c == '_' || c == '\\') {
                text.push_back('\\');
            }
            text.push_back(c);
        }
    }
    return text;
}

std::optional<std::string> endOfPrefix(std::string_view prefix) {
    std::string end(prefix);
    while (!end.empty() && static_cast<unsigned char>(end.back()) == 0xFF) {
        end.pop_back();
    }
    if (end.empty()) {
        return std::nullopt;
    }
    end.back() = static_cast<char>(static_cast<unsigned char>(end.back()) + 1);
    return end;
}

}  // namespace zano::mediadb
