#include "search_internal.h"

#include <zanoplatform/sql_escape.h>

#include <array>
#include <cstddef>

namespace vorelix::musiclib {

namespace {

constexpr const char *kAnyTemplate =
    "path like '@ZANO:NEVAR/%%' and (title ilike '%%@ZANO:NEVAR%%' or artist ilike "
    "'%%@ZANO:NEVAR%%' or album ilike '%%@ZANO:NEVAR%%' or genre ilike '%%@ZANO:NEVAR%%')";
constexpr const char *kColumnTemplate =
    "path like '@ZANO:NEVAR/%%' and @ZANO:NEVAR ilike '%%@ZANO:NEVAR%%'";

constexpr std::array<const char *, 5> kColumns{"", "title", "artist", "album", "genre"};

}  // namespace

const char *columnOf(int category) {
    const auto index = static_cast<std::size_t>(category);
    return index < kColumns.size() ? kColumns.at(index) : "";
}

bool makeCondition(int category, const MusicRoot &root, const char *escapedKeyword, int bufferSize,
                   const ConditionFailures &failures, HeapText &condition) {
    if (category == kNoSearch) {
        return true;
    }
    const bool any = category == kAnyColumn;
    condition.reset(any ? ZANODBEscapeStringEX3(1, kAnyTemplate, root.data(), escapedKeyword,
                                                escapedKeyword, escapedKeyword, escapedKeyword)
                        : ZANODBEscapeStringEX3(1, kColumnTemplate, root.data(), columnOf(category),
                                                escapedKeyword));
    if (condition == nullptr) {
        (any ? failures.any : failures.column)(bufferSize);
        return false;
    }
    return true;
}

}  // namespace vorelix::musiclib
