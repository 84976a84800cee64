#include "render.h"

#include <algorithm>
#include <optional>
#include <span>
#include <utility>

#include "text/fold.h"
#include "text/utf8.h"
#include "tokens.h"

namespace zano::mediadb {

namespace {

/* False for what JSON has no place for: bytes that are no characters, as paths may have. */
bool appendJson(std::string &json, const std::string &text) {
    if (!isUtf8(text)) {
        return false;
    }
    json.push_back('"');
    for (const char c : text) {
        if (static_cast<unsigned char>(c) < 0x20) {
            constexpr std::string_view kDigits = "0123456789abcdef";
            json.append("\\u00").append(1, kDigits[static_cast<unsigned char>(c) >> 4]);
            json.push_back(kDigits[c & 0xF]);
            continue;
        }
        json.append(c == '"' || c == '\\' ? "\\" : "").push_back(c);
    }
    json.push_back('"');
    return true;
}

/* Values of one kind, integers or texts; null when they are not. */
std::optional<std::string> jsonArray(std::span<const Expression> items) {
    const size_t kind = items.front().value.index();
    std::string json;
    for (const Expression &item : items) {
        json.push_back(json.empty() ? '[' : ',');
        const auto *integer = std::get_if<std::int64_t>(&item.value);
        const auto *text = std::get_if<std::string>(&item.value);
        if (integer != nullptr) {
            json.append(std::to_string(*integer));
        }
        const bool isWritten = integer != nullptr || (text != nullptr && appendJson(json, *text));
        if (!isWritten || item.value.index() != kind) {
            return std::nullopt;
        }
    }
    return json.append("]");
}

/* '{"a","b"}', which engines with arrays read; of paths the bytes, of integers the digits. */
std::string arrayText(std::span<const Expression> items, bool isPaths) {
    std::string array;
    for (const Expression &item : items) {
        array.push_back(array.empty() ? '{' : ',');
        const auto *text = std::get_if<std::string>(&item.value);
        if (text == nullptr) {
            array.append(std::to_string(std::get<std::int64_t>(item.value)));
        } else if (isPaths) {
            appendPathElement(array, *text);
        } else {
            appendTextElement(array, *text);
        }
    }
    return array.append("}");
}

bool isPath(const Expression &expression) {
    return expression.kind == Expression::Kind::Column && expression.column == Column::Path;
}

bool isNumber(const Expression &expression) {
    return (expression.kind == Expression::Kind::Column && !columnInfo(expression.column).isText) ||
           (expression.kind == Expression::Kind::Call && expression.function == "length");
}

}  // namespace

void appendTextElement(std::string &array, std::string_view text) {
    array.push_back('"');
    for (const char c : text) {
        array.append(c == '"' || c == '\\' ? "\\" : "").push_back(c);
    }
    array.push_back('"');
}

void appendPathElement(std::string &array, std::string_view path) {
    constexpr std::string_view kDigits = "0123456789abcdef";
    array.append("\"\\\\x");
    for (const char c : path) {
        array.push_back(kDigits[static_cast<unsigned char>(c) >> 4]);
        array.push_back(kDigits[c & 0xF]);
    }
    array.push_back('"');
}

std::string_view orderColumn(Column column) {
    const ColumnInfo &info = columnInfo(column);
    return info.key.empty() ? info.name : info.key;
}

Sql &Sql::bind(Value value) {
    values_.push_back(std::move(value));
    text_.push_back(dialect_->parameterSign);
    if (dialect_->parametersAreNumbered) {
        text_.append(std::to_string(values_.size()));
    }
    if (std::holds_alternative<std::int64_t>(values_.back())) {
        text_.append(dialect_->integerCast);
    } else if (std::holds_alternative<double>(values_.back())) {
        text_.append(dialect_->realCast);
    }
    return *this;
}

/* A column or call as a text. */
void Sql::addText(const Expression &expression, std::string_view qualifier) {
    const bool isPathOfBytes = isPath(expression) && !dialect_->pathText.empty();
    if (isPathOfBytes) {
        add(dialect_->pathText).add("(");
    }
    addCondition(expression, qualifier);
    add(isPathOfBytes ? ")" : "");
    add(isNumber(expression) ? dialect_->textCast : "");
}

/* The folded key of a text. */
void Sql::addKey(const Expression &expression, std::string_view qualifier) {
    const bool isColumn = expression.kind == Expression::Kind::Column;
    if (isColumn && !columnInfo(expression.column).key.empty()) {
        add(qualifier).add(columnInfo(expression.column).key);
    } else if (isColumn && dialect_->allTextsHaveKeys && !isNumber(expression)) {
        add(qualifier).add(columnInfo(expression.column).name).add("_key");
    } else if (isNumber(expression) && !dialect_->textCast.empty()) {
        addText(expression, qualifier);
    } else {
        add(dialect_->fold).add("(");
        addText(expression, qualifier);
        add(")");
    }
}

void Sql::addOrder(const std::vector<OrderTerm> &order, std::string_view qualifier) {
    std::string_view separator;
    for (const OrderTerm &term : order) {
        add(separator).add(qualifier).add(orderColumn(term.column));
        add(term.descending ? " DESC" : "");
        separator = ", ";
    }
}

void Sql::addFullOrder(const std::vector<OrderTerm> &order, std::string_view qualifier) {
    addOrder(order, qualifier);
    add(order.empty() ? "" : ", ").add(qualifier).add("id");
}

/* With both values where there is one, so that the pages of a listing are one statement. */
void Sql::addPage(std::int64_t offset, std::int64_t limit) {
    if (offset <= 0 && limit <= 0) {
        return;
    }
    add(" LIMIT ");
    if (limit > 0) {
        bind(limit);
    } else {
        add(dialect_->unlimited);
    }
    add(" OFFSET ").bind(offset);
}

void Sql::addPathRange(std::string_view prefix, std::string_view qualifier) {
    add("(").add(qualifier).add("path >= ").bind(std::string(prefix));
    if (auto end = endOfPrefix(prefix)) {
        add(" AND ").add(qualifier).add("path < ").bind(std::move(*end));
    }
    add(")");
}

void Sql::addCondition(const Expression &expression, std::string_view qualifier) {
    using Kind = Expression::Kind;
    const std::string_view no = expression.negated ? "NOT " : "";
    switch (expression.kind) {
        case Kind::Column:
            add(qualifier).add(columnInfo(expression.column).name);
            break;
        case Kind::Literal:
            bind(expression.value);
            break;
        case Kind::Call:
            add(expression.function == "lower" ? dialect_->lower : dialect_->length).add("(");
            addText(expression.parts[0], qualifier);
            add(")");
            break;
        case Kind::Not:
            add("(NOT ");
            addCondition(expression.parts[0], qualifier);
            add(")");
            break;
        case Kind::And:
            addJoined(expression, " AND ", qualifier);
            break;
        case Kind::Or:
            addJoined(expression, " OR ", qualifier);
            break;
        case Kind::Compare:
            addCompare(expression, qualifier);
            break;
        case Kind::Like:
            add("(").add(no);
            addLike(expression, qualifier);
            add(")");
            break;
        case Kind::In:
            add("(").add(no);
            addIn(expression, qualifier);
            add(")");
            break;
        case Kind::Between:
            add("(");
            addCondition(expression.parts[0], qualifier);
            add(" ").add(no).add("BETWEEN ");
            addCondition(expression.parts[1], qualifier);
            add(" AND ");
            addCondition(expression.parts[2], qualifier);
            add(")");
            break;
        case Kind::IsNull:
            add("(");
            addCondition(expression.parts[0], qualifier);
            add(expression.negated ? " IS NOT NULL)" : " IS NULL)");
            break;
    }
}

void Sql::addJoined(const Expression &expression, std::string_view word,
                    std::string_view qualifier) {
    std::string_view separator = "(";
    for (const Expression &part : expression.parts) {
        add(separator);
        addCondition(part, qualifier);
        separator = word;
    }
    add(")");
}

void Sql::addCompare(const Expression &expression, std::string_view qualifier) {
    const Expression &left = expression.parts[0];
    const Expression &right = expression.parts[1];
    add("(");
    addCondition(left, qualifier);
    add(expression.operation);
    addCondition(right, qualifier);
    /* Equal texts have equal keys, and only the keys are indexed. */
    const bool isKeyed = expression.operation == "=" && left.kind == Expression::Kind::Column &&
                         !columnInfo(left.column).key.empty() &&
                         right.kind == Expression::Kind::Literal &&
                         std::holds_alternative<std::string>(right.value);
    if (isKeyed) {
        add(" AND ").add(qualifier).add(columnInfo(left.column).key).add("=");
        bind(foldedKey(std::get<std::string>(right.value)));
    }
    add(")");
}

/* The list as one array; false when its values are of several kinds. */
bool Sql::addInArray(const Expression &expression) {
    const std::span items(expression.parts.begin() + 1, expression.parts.end());
    const size_t kind = items.front().value.index();
    const bool isOfOneKind = std::all_of(items.begin(), items.end(), [&](const Expression &item) {
        return item.value.index() == kind && !std::holds_alternative<double>(item.value);
    });
    if (isOfOneKind) {
        const bool isIntegers = std::holds_alternative<std::int64_t>(items.front().value);
        add("=ANY(").bind(arrayText(items, isPath(expression.parts[0])));
        add(isIntegers ? dialect_->integerArrayCast : "").add(")");
    }
    return isOfOneKind;
}

/* Many values are one array, so that statements for lists of any length are one statement. */
void Sql::addIn(const Expression &expression, std::string_view qualifier) {
    addCondition(expression.parts[0], qualifier);
    if (!dialect_->integerArrayCast.empty() && addInArray(expression)) {
        return;
    }
    const auto items = expression.parts.begin() + 1;
    auto array = dialect_->listOfValues.empty()
                     ? std::nullopt
                     : jsonArray(std::span(items, expression.parts.end()));
    if (array) {
        add(" IN (").add(dialect_->listOfValues).add("(").bind(std::move(*array)).add("))");
        return;
    }
    std::string_view separator = " IN (";
    for (auto item = items; item != expression.parts.end(); ++item) {
        add(separator);
        addCondition(*item, qualifier);
        separator = ",";
    }
    add(")");
}

void Sql::addLike(const Expression &expression, std::string_view qualifier) {
    const Expression &subject = expression.parts[0];
    const Pattern pattern(std::get<std::string>(expression.parts[1].value), expression.ignoreCase);
    if (pattern.matchesEverything()) {
        add("1=1");
        return;
    }
    /* Bytes are matched as they are; but one character of a path may be several. */
    const bool hasCharacters = std::any_of(
        pattern.pieces().begin(), pattern.pieces().end(),
        [](const auto &piece) { return piece.kind == Pattern::Piece::Kind::AnyCharacter; });
    const auto addSubject = [&] {
        if (expression.ignoreCase) {
            addKey(subject, qualifier);
        } else if (hasCharacters || isNumber(subject)) {
            addText(subject, qualifier);
        } else {
            addCondition(subject, qualifier);
        }
    };
    if (const auto text = pattern.exact()) {
        addSubject();
        add("=").bind(std::string(*text));
    } else if (const auto part = pattern.part();
               part && expression.ignoreCase && !dialect_->position.empty()) {
        add(dialect_->position).add("(");
        addSubject();
        add(",").bind(std::string(*part)).add(")>0");
    } else if (isPath(subject) && pattern.prefix() && !expression.ignoreCase) {
        addPathRange(*pattern.prefix(), qualifier);
    } else {
        const bool isFunction = !dialect_->like.empty();
        add(dialect_->like).add(isFunction ? "(" : "");
        addSubject();
        add(isFunction ? "," : " LIKE ").bind(pattern.likeText());
        add(isFunction ? ")" : "");
    }
}

}  // namespace zano::mediadb
