/* Writes conditions and orders in the SQL of an engine. Every value is bound, none is written
 * into the text; the few words that differ between engines are in Dialect. */
#pragma once

#include <string>
#include <vector>

#include "analysis.h"

namespace zano::mediadb {

struct Dialect {
    /* "$1", or "?" alone: SQLite keeps a list of numbered ones, which it walks for each. */
    char parameterSign;
    bool parametersAreNumbered;
    /* Functions of the engine: position of a key in a key (0: not there; "" where LIKE has an index
     * for that), the folded key of a text, its small letters, its number of characters. */
    std::string_view position;
    std::string_view fold;
    std::string_view lower;
    std::string_view length;
    /* A function of text and pattern with the meaning of LIKE; "" for the engine's own LIKE,
     * with \ as its escape character. */
    std::string_view like;
    /* "SELECT .. FROM function", which gives the values of a JSON array; "" where there is
     * none. */
    std::string_view listOfValues;

    /* For an engine that wants to know the kind of everything; else empty. What follows a
     * parameter for an integer and for a real, what makes a text of a number, the function that
     * makes a text of a path, and what follows an array of integers in a list. */
    std::string_view integerCast;
    std::string_view realCast;
    std::string_view textCast;
    std::string_view pathText;
    std::string_view integerArrayCast;
    /* Every text column has a folded key, "column_key", for it has no function that makes one. */
    bool allTextsHaveKeys;
    /* What stands behind LIMIT where there is an OFFSET alone. */
    std::string_view unlimited;
};

/* A statement being put together: its text and its values. */
class Sql {
  public:
    explicit Sql(const Dialect &dialect) : dialect_(&dialect) { text_.reserve(kUsualBytes); }

    Sql &add(std::string_view text) {
        text_.append(text);
        return *this;
    }
    /* Another statement behind this one, which has no parameters yet. */
    void append(const Sql &other) {
        text_.append(other.text_);
        values_.insert(values_.end(), other.values_.begin(), other.values_.end());
    }
    /* A parameter with its value. */
    Sql &bind(Value value);

    /* A condition; `qualifier` ("songs.", say) stands before every column. */
    void addCondition(const Expression &expression, std::string_view qualifier);
    /* path >= prefix and path < its end. */
    void addPathRange(std::string_view prefix, std::string_view qualifier);
    /* Columns with their folded keys where they have one. */
    void addOrder(const std::vector<OrderTerm> &order, std::string_view qualifier);
    /* The same, with ties broken by id. */
    void addFullOrder(const std::vector<OrderTerm> &order, std::string_view qualifier);
    /* LIMIT and OFFSET; nothing when both are 0. */
    void addPage(std::int64_t offset, std::int64_t limit);

    const std::string &text() const { return text_; }
    const std::vector<Value> &values() const { return values_; }

  private:
    void addJoined(const Expression &expression, std::string_view word, std::string_view qualifier);
    void addLike(const Expression &expression, std::string_view qualifier);
    void addCompare(const Expression &expression, std::string_view qualifier);
    void addIn(const Expression &expression, std::string_view qualifier);
    bool addInArray(const Expression &expression);
    void addText(const Expression &expression, std::string_view qualifier);
    void addKey(const Expression &expression, std::string_view qualifier);

    static constexpr size_t kUsualBytes = 512;

    const Dialect *dialect_;
    std::string text_;
    std::vector<Value> values_;
};

/* One element of an array in text form, as PostgreSQL reads it: of texts, and of bytes. */
void appendTextElement(std::string &array, std::string_view text);
void appendPathElement(std::string &array, std::string_view path);

/* The column that orders: the folded key where there is one. */
std::string_view orderColumn(Column column);

}  // namespace zano::mediadb
