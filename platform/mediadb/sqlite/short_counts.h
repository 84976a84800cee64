/* How many songs have each one and each two characters in a row, in which column: the answer to a
 * count of a search for so few, for which the search index would have to merge the lists of many
 * tokens. Kept with the search index, in the table short_counts, and as exact as that. */
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "handle.h"

namespace zano::mediadb::sqlite {

/* Songs that come and go; counted in memory until they are written. */
class ShortCounts {
  public:
    /* The document of a song as the search index takes it; `songs` is 1 or -1. */
    void add(std::string_view document, int songs);
    void clear() { changes_.clear(); }

    /* Adds them to the table, within a transaction, and begins anew. */
    void write(Connection &connection);
    /* Whether the table says the same. */
    bool areIn(Connection &connection) const;

  private:
    std::unordered_map<std::uint64_t, std::int64_t> changes_;
    std::vector<std::uint64_t> ofDocument_;
};

/* Counts all songs of a catalogue that has a search index. */
ShortCounts countShort(Connection &connection);

}  // namespace zano::mediadb::sqlite
