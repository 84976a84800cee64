#include "tokens.h"

#include <algorithm>
#include <array>
#include <utility>

#include "columns.h"

namespace zano::mediadb {
namespace {

constexpr bool isBlank(char c) {
    return c == ' ' || c == '\t' || c == '\r' || c == '\n';
}
constexpr bool isDigit(char c) {
    return c >= '0' && c <= '9';
}
constexpr bool isNamePart(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || isDigit(c) || c == '_';
}
constexpr size_t kShownBytes = 40;

/* Longer signs before their own beginnings. */
constexpr std::array<std::string_view, 11> kSigns = {"<>", "!=", "<=", ">=", "<", ">",
                                                     "=",  "(",  ")",  ",",  "*"};

/* The front of a text that consists of such characters. */
std::string_view front(std::string_view text, bool (*isPart)(char)) {
    size_t length = 0;
    while (length < text.size() && isPart(text[length])) {
        ++length;
    }
    return text.substr(0, length);
}

}  // namespace

std::string Tokenizer::takeText() {
    std::string value = std::move(token_.value);
    next();
    return value;
}

bool Tokenizer::takeSign(std::string_view sign) {
    const bool matches = token_.kind == Token::Kind::Sign && token_.text == sign;
    if (matches) {
        next();
    }
    return matches;
}

bool Tokenizer::takeWord(std::string_view word) {
    const bool matches = token_.kind == Token::Kind::Name && equalsIgnoringCase(token_.text, word);
    if (matches) {
        next();
    }
    return matches;
}

void Tokenizer::expectSign(std::string_view sign) {
    if (!takeSign(sign)) {
        refuse(sign);
    }
}

void Tokenizer::expectWord(std::string_view word) {
    if (!takeWord(word)) {
        refuse(word);
    }
}

void Tokenizer::refuse(std::string_view wanted) const {
    std::string message = "the query has ";
    if (token_.kind == Token::Kind::End) {
        message += "its end";
    } else {
        message.append("\"").append(token_.text.substr(0, kShownBytes)).append("\"");
    }
    message.append(" where ").append(wanted).append(" should stand");
    throw QueryError(message);
}

void Tokenizer::next() {
    rest_.remove_prefix(front(rest_, isBlank).size());
    token_.kind = Token::Kind::End;
    token_.text = {};
    if (rest_.empty()) {
        return;
    }
    if (rest_.front() == '\'') {
        readText();
    } else if (isDigit(rest_.front())) {
        readNumber();
    } else if (isNamePart(rest_.front())) {
        token_.kind = Token::Kind::Name;
        token_.text = front(rest_, isNamePart);
        rest_.remove_prefix(token_.text.size());
    } else {
        const bool isNegative = rest_.size() > 1 && rest_.front() == '-' && isDigit(rest_[1]);
        if (isNegative) {
            readNumber();
            return;
        }
        const auto *sign =
            std::find_if(kSigns.begin(), kSigns.end(), [this](std::string_view candidate) {
                return rest_.substr(0, candidate.size()) == candidate;
            });
        if (sign == kSigns.end()) {
            throw QueryError("the query has a character that has no place there: \"" +
                             std::string(rest_.substr(0, kShownBytes)) + "\"");
        }
        token_.kind = Token::Kind::Sign;
        token_.text = rest_.substr(0, sign->size());
        rest_.remove_prefix(sign->size());
    }
}

void Tokenizer::readText() {
    std::string value;
    const std::string_view whole = rest_;
    rest_.remove_prefix(1);
    for (;;) {
        const size_t quote = rest_.find('\'');
        if (quote == std::string_view::npos) {
            throw QueryError("the query has a text without its closing quote");
        }
        value.append(rest_.substr(0, quote));
        rest_.remove_prefix(quote + 1);
        if (rest_.empty() || rest_.front() != '\'') {
            break;
        }
        value.push_back('\'');
        rest_.remove_prefix(1);
    }
    token_.kind = Token::Kind::Text;
    token_.text = whole.substr(0, whole.size() - rest_.size());
    token_.value = std::move(value);
}

void Tokenizer::readNumber() {
    size_t length = rest_.front() == '-' ? 1 : 0;
    length += front(rest_.substr(length), isDigit).size();
    if (length < rest_.size() && rest_[length] == '.') {
        length += 1 + front(rest_.substr(length + 1), isDigit).size();
    }
    token_.kind = Token::Kind::Number;
    token_.text = rest_.substr(0, length);
    rest_.remove_prefix(length);
    if (!front(rest_, isNamePart).empty()) {
        throw QueryError("the query has a number that ends in letters: \"" +
                         std::string(token_.text) +
                         std::string(front(rest_, isNamePart).substr(0, kShownBytes)) + "\"");
    }
}

}  // namespace zano::mediadb
