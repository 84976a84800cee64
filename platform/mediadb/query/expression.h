/* A query as it was understood: what the engines work from. */
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "columns.h"

namespace zano::mediadb {

/* A value that is bound to a statement, never written into its text. */
using Value = std::variant<std::int64_t, double, std::string>;

struct Expression {
    enum class Kind {
        Column,   // column
        Literal,  // value
        Call,     // function, parts: its arguments
        Not,      // parts[0]
        And,      // parts: two or more
        Or,       // parts: two or more
        Compare,  // operation = <> < <= > >=, parts: two
        Like,     // parts: text and pattern; ignoreCase, negated
        In,       // parts: what is looked for, then the list; negated
        Between,  // parts: three; negated
        IsNull,   // parts[0]; negated
    };
    Kind kind = Kind::Literal;
    Column column = Column::Id;
    Value value;
    std::string_view function;   // a name with static storage
    std::string_view operation;  // likewise
    bool negated = false;
    bool ignoreCase = false;
    std::vector<Expression> parts;
};

/* A column of the table, and the field of the record that receives it. */
struct SelectedColumn {
    Column column;
    Column field;
};

struct OrderTerm {
    Column column;
    bool descending = false;
    bool operator==(const OrderTerm &) const = default;
};

struct Query {
    Table table = Table::Songs;
    std::vector<SelectedColumn> select;
    std::optional<Expression> condition;
    std::optional<Column> distinct;
    std::vector<OrderTerm> order;
    bool random = false;  // in random order; `order` is empty then
    std::int64_t offset = 0;
    std::int64_t limit = 0;  // 0: no limit
};

struct CountQuery {
    Table table = Table::Songs;
    std::optional<Column> distinct;
    std::optional<Expression> condition;
};

}  // namespace zano::mediadb
