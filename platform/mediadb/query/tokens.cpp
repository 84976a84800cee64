#include "tokens.h"

#include <algorithm>
#include <array>
#include <utility>

#include "columns.h"

namespace zano::mediadb {
namespace {

constexpr std::string_view kBlanks = " \t\r\n";
constexpr std::string_view kNameCharacters =
    "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789_";
constexpr std::string_view kDigits = "0123456789";
constexpr size_t kShownBytes = 40;

/* Longer signs before their own beginnings. */
constexpr std::array<std::string_view, 11> kSigns = {"<>", "!=", "<=", ">=", "<", ">",
                                                     "=",  "(",  ")",  ",",  "*"};

std::string_view front(std::string_view text, std::string_view characters) {
    return text.substr(0, std::min(text.find_first_not_of(characters), text.size()));
}

}  // namespace

Token Tokenizer::take() {
    Token taken = std::move(token_);
    next();
    return taken;
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
        message += "\"" + token_.text.substr(0, kShownBytes) + "\"";
    }
    message.append(" where ").append(wanted).append(" should stand");
    throw QueryError(message);
}

void Tokenizer::next() {
    rest_.remove_prefix(front(rest_, kBlanks).size());
    token_ = Token();
    if (rest_.empty()) {
        return;
    }
    if (rest_.front() == '\'') {
        readText();
    } else if (kDigits.find(rest_.front()) != std::string_view::npos) {
        readNumber();
    } else if (kNameCharacters.find(rest_.front()) != std::string_view::npos) {
        token_ = {Token::Kind::Name, std::string(front(rest_, kNameCharacters))};
        rest_.remove_prefix(token_.text.size());
    } else {
        const bool isNegative = rest_.size() > 1 && rest_.front() == '-' &&
                                kDigits.find(rest_[1]) != std::string_view::npos;
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
        token_ = {Token::Kind::Sign, std::string(*sign)};
        rest_.remove_prefix(sign->size());
    }
}

void Tokenizer::readText() {
    std::string value;
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
    token_ = {Token::Kind::Text, std::move(value)};
}

void Tokenizer::readNumber() {
    size_t length = rest_.front() == '-' ? 1 : 0;
    length += front(rest_.substr(length), kDigits).size();
    if (length < rest_.size() && rest_[length] == '.') {
        length += 1 + front(rest_.substr(length + 1), kDigits).size();
    }
    token_ = {Token::Kind::Number, std::string(rest_.substr(0, length))};
    rest_.remove_prefix(length);
    if (!front(rest_, kNameCharacters).empty()) {
        throw QueryError("the query has a number that ends in letters: \"" + token_.text +
                         std::string(front(rest_, kNameCharacters).substr(0, kShownBytes)) + "\"");
    }
}

}  // namespace zano::mediadb
