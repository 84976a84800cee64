#include "parse.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <utility>

namespace zano::mediadb {
namespace {

constexpr size_t kMaxBytes = 8U << 20;
constexpr int kMaxDepth = 100;
/* What one query may cost before its time limit can stop it. */
constexpr size_t kMaxPatternBytes = 64U << 10;
constexpr int kMaxPredicates = 500;
constexpr int kMaxListedTexts = 50000;

constexpr std::array<std::string_view, 2> kFunctions = {"lower", "length"};
constexpr std::array<std::pair<std::string_view, std::string_view>, 7> kComparisons = {{
    {"=", "="},
    {"<>", "<>"},
    {"!=", "<>"},
    {"<", "<"},
    {"<=", "<="},
    {">", ">"},
    {">=", ">="},
}};
constexpr std::array kAllColumns = {
    Column::Id,     Column::Path,     Column::Title,   Column::Album,
    Column::Artist, Column::Genre,    Column::Track,   Column::Disc,
    Column::Year,   Column::Duration, Column::Bitrate, Column::Frequency,
};

std::string_view viewOf(const char *text) {
    const std::string_view view = text != nullptr ? std::string_view(text) : std::string_view();
    if (view.size() > kMaxBytes) {
        throw QueryError("the query is longer than 8 MB");
    }
    return view;
}

bool isBlank(std::string_view text) {
    return text.find_first_not_of(" \t\r\n") == std::string_view::npos;
}

Value numberOf(std::string_view text) {
    std::int64_t integer = 0;
    const char *end = text.data() + text.size();
    if (std::from_chars(text.data(), end, integer).ptr == end) {
        return integer;
    }
    double real = 0;
    const auto [stop, error] = std::from_chars(text.data(), end, real);
    if (error != std::errc() || stop != end) {
        throw QueryError("the query has a number out of range: " + std::string(text.substr(0, 40)));
    }
    return real;
}

/* Recursive descent; depth_ bounds the recursion whatever the text nests. */
class ConditionParser {
  public:
    ConditionParser(Table table, std::string_view text) : table_(table), tokens_(text) {}

    Expression parse() {
        Expression whole = alternatives();
        if (tokens_.peek().kind != Token::Kind::End) {
            tokens_.refuse("the end");
        }
        return whole;
    }

  private:
    struct Deeper {
        explicit Deeper(int &depth) : level(depth) {
            if (++level > kMaxDepth) {
                --level;
                throw QueryError("the query is nested too deeply");
            }
        }
        ~Deeper() { --level; }
        Deeper(const Deeper &) = delete;
        Deeper &operator=(const Deeper &) = delete;
        int &level;
    };

    Expression joined(Expression::Kind kind, std::string_view word,
                      Expression (ConditionParser::*part)()) {
        Expression first = (this->*part)();
        if (!tokens_.takeWord(word)) {
            return first;
        }
        Expression all;
        all.kind = kind;
        all.parts.push_back(std::move(first));
        do {
            all.parts.push_back((this->*part)());
        } while (tokens_.takeWord(word));
        return all;
    }

    Expression alternatives() {
        return joined(Expression::Kind::Or, "or", &ConditionParser::conjunction);
    }

    Expression conjunction() {
        return joined(Expression::Kind::And, "and", &ConditionParser::negation);
    }

    Expression negation() {
        const Deeper deeper(depth_);
        if (!tokens_.takeWord("not")) {
            return predicate();
        }
        Expression expression;
        expression.kind = Expression::Kind::Not;
        expression.parts.push_back(negation());
        return expression;
    }

    Expression predicate() {
        if (tokens_.takeSign("(")) {
            Expression inner = alternatives();
            tokens_.expectSign(")");
            return inner;
        }
        if (++predicates_ > kMaxPredicates) {
            throw QueryError("the query has more than " + std::to_string(kMaxPredicates) +
                             " comparisons");
        }
        Expression left = operand();
        if (tokens_.peek().kind == Token::Kind::Sign) {
            for (const auto &[sign, operation] : kComparisons) {
                if (tokens_.takeSign(sign)) {
                    Expression compare;
                    compare.kind = Expression::Kind::Compare;
                    compare.operation = operation;
                    compare.parts.push_back(std::move(left));
                    compare.parts.push_back(operand());
                    return compare;
                }
            }
        }
        return wordPredicate(std::move(left));
    }

    Expression wordPredicate(Expression left) {
        Expression expression;
        expression.parts.push_back(std::move(left));
        if (tokens_.takeWord("is")) {
            expression.kind = Expression::Kind::IsNull;
            expression.negated = tokens_.takeWord("not");
            tokens_.expectWord("null");
            return expression;
        }
        expression.negated = tokens_.takeWord("not");
        if (tokens_.takeWord("ilike")) {
            expression.ignoreCase = true;
            readPattern(expression);
        } else if (tokens_.takeWord("like")) {
            readPattern(expression);
        } else if (tokens_.takeWord("in")) {
            readList(expression);
        } else if (tokens_.takeWord("between")) {
            expression.kind = Expression::Kind::Between;
            expression.parts.push_back(operand());
            tokens_.expectWord("and");
            expression.parts.push_back(operand());
        } else {
            tokens_.refuse("a comparison");
        }
        return expression;
    }

    void readPattern(Expression &expression) {
        expression.kind = Expression::Kind::Like;
        if (tokens_.peek().kind != Token::Kind::Text) {
            tokens_.refuse("a pattern in quotes");
        }
        Expression pattern;
        if (tokens_.peek().value.size() > kMaxPatternBytes) {
            throw QueryError("the query has a pattern of more than 64 KB");
        }
        pattern.value = tokens_.takeText();
        expression.parts.push_back(std::move(pattern));
    }

    void readList(Expression &expression) {
        expression.kind = Expression::Kind::In;
        tokens_.expectSign("(");
        do {
            expression.parts.push_back(literal());
            const bool isNumber =
                std::holds_alternative<std::int64_t>(expression.parts.back().value);
            if (!isNumber && ++listedTexts_ > kMaxListedTexts) {
                throw QueryError("the query lists more than " + std::to_string(kMaxListedTexts) +
                                 " texts");
            }
        } while (tokens_.takeSign(","));
        tokens_.expectSign(")");
    }

    Expression literal() {
        Expression expression;
        if (tokens_.peek().kind == Token::Kind::Number) {
            expression.value = numberOf(tokens_.peek().text);
            tokens_.skip();
        } else if (tokens_.peek().kind == Token::Kind::Text) {
            expression.value = tokens_.takeText();
        } else {
            tokens_.refuse("a number or a text");
        }
        return expression;
    }

    Expression operand() {
        const Deeper deeper(depth_);
        if (tokens_.peek().kind != Token::Kind::Name) {
            return literal();
        }
        const std::string_view name = tokens_.peek().text;
        tokens_.skip();
        if (tokens_.takeSign("(")) {
            return call(name);
        }
        const auto column = findColumn(table_, name);
        if (!column) {
            throw QueryError("the query names no column of the table: \"" +
                             std::string(name.substr(0, 40)) + "\"");
        }
        Expression expression;
        expression.kind = Expression::Kind::Column;
        expression.column = *column;
        return expression;
    }

    Expression call(std::string_view name) {
        const auto *function = std::find_if(
            kFunctions.begin(), kFunctions.end(),
            [name](std::string_view known) { return equalsIgnoringCase(known, name); });
        if (function == kFunctions.end()) {
            throw QueryError("the query calls a function that is not allowed: \"" +
                             std::string(name.substr(0, 40)) + "\"");
        }
        Expression expression;
        expression.kind = Expression::Kind::Call;
        expression.function = *function;
        expression.parts.push_back(operand());
        tokens_.expectSign(")");
        return expression;
    }

    Table table_;
    Tokenizer tokens_;
    int depth_ = 0;
    int predicates_ = 0;
    int listedTexts_ = 0;
};

Column takeColumn(Table table, Tokenizer &tokens) {
    if (tokens.peek().kind == Token::Kind::Name) {
        if (const auto column = findColumn(table, tokens.peek().text)) {
            tokens.skip();
            return *column;
        }
    }
    tokens.refuse("a column");
}

void expectEnd(const Tokenizer &tokens) {
    if (tokens.peek().kind != Token::Kind::End) {
        tokens.refuse("the end");
    }
}

OrderTerm takeOrderTerm(Table table, Tokenizer &tokens) {
    OrderTerm term{};
    if (tokens.takeWord("lower")) {
        tokens.expectSign("(");
        term.column = takeColumn(table, tokens);
        tokens.expectSign(")");
    } else {
        term.column = takeColumn(table, tokens);
    }
    if (tokens.takeWord("desc")) {
        term.descending = true;
    } else {
        tokens.takeWord("asc");
    }
    return term;
}

}  // namespace

std::vector<SelectedColumn> parseSelect(Table table, const char *text) {
    std::vector<SelectedColumn> selected;
    Tokenizer tokens(viewOf(text));
    if (text == nullptr || tokens.takeSign("*")) {
        expectEnd(tokens);
        for (const Column column : kAllColumns) {
            if (table == Table::Songs || columnInfo(column).inPlaylists) {
                selected.push_back({column, column});
            }
        }
        return selected;
    }
    do {
        const Column column = takeColumn(table, tokens);
        const Column field = tokens.takeWord("as") ? takeColumn(table, tokens) : column;
        if (columnInfo(column).isText != columnInfo(field).isText) {
            throw QueryError("the query puts a text into a number, or a number into a text");
        }
        selected.push_back({column, field});
    } while (tokens.takeSign(","));
    expectEnd(tokens);
    return selected;
}

std::optional<Expression> parseCondition(Table table, const char *text) {
    const std::string_view view = viewOf(text);
    if (isBlank(view)) {
        return std::nullopt;
    }
    return ConditionParser(table, view).parse();
}

std::optional<Column> parseDistinct(Table table, const char *text) {
    const std::string_view view = viewOf(text);
    if (isBlank(view)) {
        return std::nullopt;
    }
    Tokenizer tokens(view);
    const Column column = takeColumn(table, tokens);
    expectEnd(tokens);
    return column;
}

void parseOrder(const char *text, Query &query) {
    const std::string_view view = viewOf(text);
    if (isBlank(view)) {
        return;
    }
    Tokenizer tokens(view);
    if (tokens.takeWord("random")) {
        tokens.expectSign("(");
        tokens.expectSign(")");
        query.random = true;
    } else {
        do {
            query.order.push_back(takeOrderTerm(query.table, tokens));
        } while (tokens.takeSign(","));
    }
    expectEnd(tokens);
}

std::optional<Column> parseCountExpression(Table table, const char *text) {
    Tokenizer tokens(viewOf(text));
    std::optional<Column> distinct;
    if (tokens.takeWord("distinct")) {
        distinct = takeColumn(table, tokens);
    } else if (!tokens.takeSign("*")) {
        takeColumn(table, tokens);
    }
    expectEnd(tokens);
    return distinct;
}

}  // namespace zano::mediadb
