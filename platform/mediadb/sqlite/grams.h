/* The search index: which songs have which three characters in a row in which column.
 *
 * It is an FTS5 table whose row ids are the songs' ranks (their places in the default order),
 * so that matches come out in page order. A document is the folded keys of one song, each
 * behind its column's sign; a token is the sign and three characters. The end of each key is
 * padded, so every character begins a token, and a search for one or two characters is a
 * prefix of tokens. The token of a search for one to three characters thus is its answer; a
 * longer search names candidates, which have to be looked at.
 */
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "../query/analysis.h"
#include "handle.h"

namespace zano::mediadb::sqlite {

/* The tokenizer's name in the schema: it is on disk, and so is what it makes of a document. */
constexpr std::string_view kGramTokenizer = "zanograms";

/* A document holds the keys of a song, each behind the sign of its column, padded at its end. */
bool isColumnSign(char32_t character);
constexpr char32_t kGramPadding = U'\x1F';

/* Makes the tokenizer known to a connection, which needs it to read or write the index. */
void addGramTokenizer(sqlite3 *connection);

/* The document of a song. */
std::string gramDocument(std::string_view titleKey, std::string_view artistKey,
                         std::string_view albumKey, std::string_view genreKey);

/* The tokens of a term without quotes, as they are counted in gram_counts: for a term of one or
 * two characters the prefix of tokens itself. */
std::vector<std::string> gramsOf(const SearchTerm &term);

/* A token and its beginnings of one and two characters, each with the sign. */
std::vector<std::string> beginningsOf(std::string_view token);

/* What to ask the index for a group of search terms joined by `or`. */
struct GramQuery {
    std::string match;     // for MATCH
    bool isExact = false;  // its rows need not be looked at
    bool isShort = false;  // made of one or two characters: a prefix, of many tokens perhaps
};

/* Null when one of the terms has no literal character. */
std::optional<GramQuery> gramQueryOf(const std::vector<SearchTerm> &searches);

}  // namespace zano::mediadb::sqlite
