#include "conditions.h"

#include <array>
#include <charconv>
#include <cstdio>
#include <utility>

#include "../query/pattern.h"
#include "../query/tokens.h"
#include "text/fold.h"

namespace zano::mediadb::postgresql {
namespace {

using Kind = Expression::Kind;

Expression literalOf(Value value) {
    Expression literal;
    literal.value = std::move(value);
    return literal;
}

Expression constant(bool isTrue) {
    Expression expression;
    expression.kind = Kind::Compare;
    expression.operation = "=";
    expression.parts = {literalOf(std::int64_t{1}), literalOf(std::int64_t{isTrue ? 1 : 2})};
    return expression;
}

bool isLiteral(const Expression &expression) {
    return expression.kind == Kind::Literal;
}

bool isText(const Expression &expression) {
    switch (expression.kind) {
        case Kind::Column:
            return columnInfo(expression.column).isText;
        case Kind::Call:
            return expression.function == "lower";
        default:
            return std::holds_alternative<std::string>(expression.value);
    }
}

std::string textOf(const Value &value) {
    if (const auto *text = std::get_if<std::string>(&value)) {
        return *text;
    }
    if (const auto *integer = std::get_if<std::int64_t>(&value)) {
        return std::to_string(*integer);
    }
    std::array<char, 40> digits{};
    std::snprintf(digits.data(), digits.size(), "%.15g", std::get<double>(value));
    const std::string text = digits.data();
    return text.find_first_of(".ein") == std::string::npos ? text + ".0" : text;
}

double numberOf(const Value &value) {
    const auto *integer = std::get_if<std::int64_t>(&value);
    return integer != nullptr ? static_cast<double>(*integer) : std::get<double>(value);
}

/* A text that is a number as a whole. */
bool readNumber(const std::string &text, Value &number) {
    const char *end = text.data() + text.size();
    std::int64_t integer = 0;
    if (const auto read = std::from_chars(text.data(), end, integer);
        read.ec == std::errc() && read.ptr == end) {
        number = integer;
        return true;
    }
    double real = 0;
    if (const auto read = std::from_chars(text.data(), end, real, std::chars_format::general);
        read.ec == std::errc() && read.ptr == end) {
        number = real;
        return true;
    }
    return false;
}

/* Makes a literal of the kind of the column beside it, where it can be. */
void convertFor(const Expression &column, Expression &literal) {
    if (column.kind != Kind::Column || isText(column) == isText(literal)) {
        return;
    }
    if (isText(column)) {
        literal.value = textOf(literal.value);
    } else {
        const std::string text = std::get<std::string>(literal.value);
        readNumber(text, literal.value);
    }
}

int signOf(const Value &a, const Value &b) {
    if (a.index() == b.index()) {
        return a < b ? -1 : b < a ? 1 : 0;
    }
    const double x = numberOf(a);
    const double y = numberOf(b);
    return x < y ? -1 : y < x ? 1 : 0;
}

bool holds(std::string_view operation, int sign) {
    return (operation == "=" && sign == 0) || (operation == "<>" && sign != 0) ||
           (operation == "<" && sign < 0) || (operation == "<=" && sign <= 0) ||
           (operation == ">" && sign > 0) || (operation == ">=" && sign >= 0);
}

bool isPath(const Expression &expression) {
    return expression.kind == Kind::Column && expression.column == Column::Path;
}

/* Numbers come before texts. */
Expression typedCompare(Expression expression) {
    Expression &left = expression.parts[0];
    Expression &right = expression.parts[1];
    if (isLiteral(left) != isLiteral(right)) {
        isLiteral(right) ? convertFor(left, right) : convertFor(right, left);
    }
    const bool isFixed = isLiteral(left) || isLiteral(right);
    if (isText(left) != isText(right)) {
        if (!isFixed) {
            throw QueryError("the query compares a text with a number");
        }
        return constant(holds(expression.operation, isText(left) ? 1 : -1));
    }
    if (isLiteral(left) && isLiteral(right)) {
        return constant(holds(expression.operation, signOf(left.value, right.value)));
    }
    if (!isFixed && isPath(left) != isPath(right)) {
        throw QueryError("the query compares a path with another text");
    }
    return expression;
}

Expression typedCall(Expression expression) {
    const Expression &argument = expression.parts[0];
    if (!isLiteral(argument)) {
        return expression;
    }
    const std::string text = textOf(argument.value);
    if (expression.function == "lower") {
        return literalOf(lowerCase(text));
    }
    std::int64_t characters = 0;
    for (std::string_view rest = text; !rest.empty(); ++characters) {
        takeCharacter(rest);
    }
    return literalOf(characters);
}

Expression typedLike(Expression expression) {
    Expression &subject = expression.parts[0];
    if (isLiteral(subject)) {
        const Pattern pattern(std::get<std::string>(expression.parts[1].value),
                              expression.ignoreCase);
        const std::string text = textOf(subject.value);
        const bool isMatch = pattern.matches(expression.ignoreCase ? foldedKey(text) : text);
        return constant(isMatch != expression.negated);
    }
    /* The key of the small letters is the key of the text, and that is stored. */
    while (expression.ignoreCase && subject.kind == Kind::Call && subject.function == "lower") {
        Expression inner = std::move(subject.parts[0]);
        subject = std::move(inner);
    }
    return expression;
}

Expression compareOf(std::string_view operation, Expression left, Expression right) {
    Expression expression;
    expression.kind = Kind::Compare;
    expression.operation = operation;
    expression.parts.push_back(std::move(left));
    expression.parts.push_back(std::move(right));
    return typedCompare(std::move(expression));
}

Expression negatedIf(bool negated, Expression expression) {
    if (!negated) {
        return expression;
    }
    Expression outer;
    outer.kind = Kind::Not;
    outer.parts.push_back(std::move(expression));
    return outer;
}

Expression typedBetween(Expression expression) {
    Expression both;
    both.kind = Kind::And;
    both.parts.push_back(compareOf(">=", expression.parts[0], expression.parts[1]));
    both.parts.push_back(compareOf("<=", expression.parts[0], expression.parts[2]));
    return negatedIf(expression.negated, std::move(both));
}

/* What is of another kind is not in the list. */
Expression typedIn(Expression expression) {
    Expression typed = expression;
    typed.parts.resize(1);
    const Expression &subject = typed.parts[0];
    for (auto item = expression.parts.begin() + 1; item != expression.parts.end(); ++item) {
        convertFor(subject, *item);
        if (isText(subject) != isText(*item)) {
            continue;
        }
        if (isLiteral(subject)) {
            if (signOf(subject.value, item->value) == 0) {
                return constant(!expression.negated);
            }
            continue;
        }
        typed.parts.push_back(std::move(*item));
    }
    return typed.parts.size() == 1 ? constant(expression.negated) : typed;
}

}  // namespace

Expression typedCondition(Expression expression) {
    for (Expression &part : expression.parts) {
        Expression typed = typedCondition(std::move(part));
        part = std::move(typed);
    }
    switch (expression.kind) {
        case Kind::Call:
            return typedCall(std::move(expression));
        case Kind::Compare:
            return typedCompare(std::move(expression));
        case Kind::Like:
            return typedLike(std::move(expression));
        case Kind::In:
            return typedIn(std::move(expression));
        case Kind::Between:
            return typedBetween(std::move(expression));
        case Kind::IsNull:
            return constant(expression.negated);  // no column is ever null
        default:
            return expression;
    }
}

}  // namespace zano::mediadb::postgresql
