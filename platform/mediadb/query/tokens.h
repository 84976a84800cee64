/* Splits a query text into names, numbers, texts and signs. */
#pragma once

#include <stdexcept>
#include <string>
#include <string_view>

namespace zano::mediadb {

/* The text is not a query that the media database takes. */
class QueryError : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

struct Token {
    enum class Kind { End, Name, Number, Text, Sign };
    Kind kind = Kind::End;
    std::string_view text;  // a view of the query
    std::string value;      // of a Text, with '' read as one quote
};

class Tokenizer {
  public:
    /* The text must outlive the tokenizer. Throws QueryError, as next() does. */
    explicit Tokenizer(std::string_view text) : rest_(text) { next(); }

    const Token &peek() const { return token_; }
    /* Goes on to the next token. */
    void skip() { next(); }
    /* The value of a Text, which is then behind. */
    std::string takeText();

    bool takeSign(std::string_view sign);
    /* Keywords in any mix of case. */
    bool takeWord(std::string_view word);
    void expectSign(std::string_view sign);
    void expectWord(std::string_view word);
    [[noreturn]] void refuse(std::string_view wanted) const;

  private:
    void next();
    void readText();
    void readNumber();

    std::string_view rest_;
    Token token_;
};

}  // namespace zano::mediadb
