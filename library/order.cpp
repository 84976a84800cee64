#include <vorelix/library/musiclib.h>

#include <array>
#include <cstdio>
#include <string_view>

#include "bounded_text_internal.h"

namespace {

constexpr std::array<std::string_view, 9> kTieBreaks{"album", "disc", "track", "title",   "artist",
                                                     "genre", "year", "path",  "duration"};

}  // namespace

int GenerateOrderString(const char *primary, char *out, int size) {
    const std::string_view first = primary != nullptr ? primary : "";
    vorelix::BoundedText<1024> order;
    order.append(first);
    for (const std::string_view column : kTieBreaks) {
        // Intended and kept: letter for letter, so "lower(title) desc" keeps "title", and always
        // ascending, whatever the direction of the first term.
        if (!first.starts_with(column)) {
            order.append(order.empty() ? "" : ", ", column);
        }
    }
    const bool writable = out != nullptr && size > 0;
    return std::snprintf(writable ? out : nullptr, writable ? static_cast<std::size_t>(size) : 0,
                         " %s ", order.text());
}
