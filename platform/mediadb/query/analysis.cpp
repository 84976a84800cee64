#include "analysis.h"

#include <algorithm>
#include <utility>

namespace zano::mediadb {
namespace {

std::optional<SearchTerm> searchTermOf(const Expression &expression) {
    const bool isSearch = expression.kind == Expression::Kind::Like && expression.ignoreCase &&
                          !expression.negated &&
                          expression.parts[0].kind == Expression::Kind::Column &&
                          !columnInfo(expression.parts[0].column).key.empty();
    if (!isSearch) {
        return std::nullopt;
    }
    return SearchTerm{expression.parts[0].column,
                      Pattern(std::get<std::string>(expression.parts[1].value), true)};
}

std::vector<SearchTerm> searchesOf(const Expression &expression) {
    std::vector<SearchTerm> searches;
    const bool isGroup = expression.kind == Expression::Kind::Or;
    const size_t count = isGroup ? expression.parts.size() : 1;
    for (size_t i = 0; i < count; ++i) {
        auto term = searchTermOf(isGroup ? expression.parts[i] : expression);
        if (!term) {
            return {};
        }
        searches.push_back(std::move(*term));
    }
    return searches;
}

std::string pathPrefixOf(const Expression &expression) {
    const bool isPathLike = expression.kind == Expression::Kind::Like && !expression.ignoreCase &&
                            !expression.negated &&
                            expression.parts[0].kind == Expression::Kind::Column &&
                            expression.parts[0].column == Column::Path;
    if (!isPathLike) {
        return {};
    }
    const Pattern pattern(std::get<std::string>(expression.parts[1].value), false);
    return std::string(pattern.prefix().value_or(std::string_view()));
}

void collect(const Expression &expression, std::vector<Conjunct> &conjuncts) {
    if (expression.kind == Expression::Kind::And) {
        for (const Expression &part : expression.parts) {
            collect(part, conjuncts);
        }
        return;
    }
    Conjunct conjunct{&expression, pathPrefixOf(expression), searchesOf(expression)};
    const bool isAlwaysTrue =
        std::any_of(conjunct.searches.begin(), conjunct.searches.end(),
                    [](const SearchTerm &term) { return term.pattern.matchesEverything(); });
    if (!isAlwaysTrue) {
        conjuncts.push_back(std::move(conjunct));
    }
}

}  // namespace

std::vector<Conjunct> conjunctsOf(const std::optional<Expression> &condition) {
    std::vector<Conjunct> conjuncts;
    if (condition) {
        collect(*condition, conjuncts);
    }
    return conjuncts;
}

const std::vector<OrderTerm> &tieBreaks() {
    static const std::vector<OrderTerm> terms = {
        {Column::Album}, {Column::Disc}, {Column::Track}, {Column::Title},    {Column::Artist},
        {Column::Genre}, {Column::Year}, {Column::Path},  {Column::Duration},
    };
    return terms;
}

std::optional<OrderTerm> leadingTermOf(const std::vector<OrderTerm> &order) {
    if (order.empty()) {
        return std::nullopt;
    }
    const OrderTerm leading = order.front();
    auto term = order.begin() + 1;
    for (const OrderTerm &wanted : tieBreaks()) {
        if (term != order.end() && *term == wanted) {
            ++term;
        } else if (wanted.column != leading.column) {
            return std::nullopt;
        }
    }
    return term == order.end() ? std::optional(leading) : std::nullopt;
}

}  // namespace zano::mediadb
