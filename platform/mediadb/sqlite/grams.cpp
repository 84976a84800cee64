#include "grams.h"

#include <zanoplatform/error.h>
#include <algorithm>
#include <array>
#include <utility>

#include "../catalogue.h"
#include "text/fold.h"

namespace zano::mediadb::sqlite {
namespace {

constexpr size_t kGramCharacters = 3;
/* More tokens than this narrow a search no further. */
constexpr size_t kMaxTokens = 24;
/* Behind the last character of a key, so that it begins a token too. Keys have no controls. */
constexpr std::string_view kPadding = "\x1F\x1F";

struct ColumnSign {
    Column column;
    char sign;
};
constexpr std::array kSigns = {
    ColumnSign{Column::Title, '\x01'},
    ColumnSign{Column::Artist, '\x02'},
    ColumnSign{Column::Album, '\x03'},
    ColumnSign{Column::Genre, '\x04'},
};

char signOf(Column column) {
    return std::find_if(kSigns.begin(), kSigns.end(),
                        [column](const ColumnSign &row) { return row.column == column; })
        ->sign;
}

bool isSign(char c) {
    return isColumnSign(static_cast<unsigned char>(c));
}

/* The number of bytes of the character that begins here; keys are valid UTF-8. */
size_t characterBytes(char first) {
    const auto byte = static_cast<unsigned char>(first);
    return byte < 0x80 ? 1 : byte < 0xE0 ? 2 : byte < 0xF0 ? 3 : 4;
}

/* Calls back with the sign and three characters, for every place of a document. */
template <typename Callback>
int forEachGram(std::string_view document, Callback callback) {
    std::array<char, 1 + 4 * kGramCharacters> token{};
    char sign = '\0';
    for (size_t at = 0; at < document.size();) {
        if (isSign(document[at])) {
            sign = document[at++];
            continue;
        }
        size_t length = 0;
        for (size_t i = 0;
             i < kGramCharacters && at + length < document.size() && !isSign(document[at + length]);
             ++i) {
            length += characterBytes(document[at + length]);
        }
        length = std::min(length, document.size() - at);
        const size_t next = at + std::min(characterBytes(document[at]), document.size() - at);
        token[0] = sign;
        std::copy_n(document.data() + at, length, token.data() + 1);
        if (document[at] != kPadding.front()) {
            const int result = callback(std::string_view(token.data(), length + 1), at, next);
            if (result != SQLITE_OK) {
                return result;
            }
        }
        at = next;
    }
    return SQLITE_OK;
}

using TokenCallback = int (*)(void *, int, const char *, int, int, int);

int tokenize(Fts5Tokenizer *, void *context, int flags, const char *text, int length,
             TokenCallback callback) {
    const std::string_view document(text, static_cast<size_t>(length));
    if ((flags & FTS5_TOKENIZE_QUERY) != 0) {
        return callback(context, 0, text, length, 0, length);
    }
    return forEachGram(document, [&](std::string_view token, size_t begin, size_t end) {
        return callback(context, 0, token.data(), static_cast<int>(token.size()),
                        static_cast<int>(begin), static_cast<int>(end));
    });
}

int createTokenizer(void *, const char **, int, Fts5Tokenizer **tokenizer) {
    static char only;
    *tokenizer = reinterpret_cast<Fts5Tokenizer *>(&only);
    return SQLITE_OK;
}

void deleteTokenizer(Fts5Tokenizer *) {}

std::vector<std::string_view> charactersOf(std::string_view text) {
    std::vector<std::string_view> characters;
    while (!text.empty()) {
        const size_t length = std::min(characterBytes(text.front()), text.size());
        characters.push_back(text.substr(0, length));
        text.remove_prefix(length);
    }
    return characters;
}

std::string quoted(std::string_view token) {
    std::string text = "\"";
    for (const char c : token) {
        text.append(c == '"' ? 2 : 1, c);
    }
    return text.append("\"");
}

std::string signedText(char sign, std::string_view characters) {
    return std::string(1, sign).append(characters);
}

struct TermTokens {
    std::vector<std::string> tokens;
    size_t longest = 0;  // characters of the longest literal
    bool isPrefix = false;
};

/* The tokens that a text must have to match the term; spread over it where there are many. */
void addTokens(char sign, const std::vector<std::string_view> &characters, TermTokens &result) {
    const size_t places =
        characters.size() < kGramCharacters ? 0 : characters.size() - kGramCharacters + 1;
    const size_t stride = 1 + places / kMaxTokens;
    for (size_t i = 0; i < places; i += stride) {
        const char *begin = characters[i].data();
        const std::string_view last = characters[i + kGramCharacters - 1];
        const auto length = static_cast<size_t>(last.data() + last.size() - begin);
        result.tokens.push_back(signedText(sign, {begin, length}));
    }
}

TermTokens tokensOf(const SearchTerm &term) {
    const char sign = signOf(term.column);
    TermTokens result;
    std::string_view longest;
    for (const Pattern::Piece &piece : term.pattern.pieces()) {
        const auto characters = charactersOf(piece.text);
        if (characters.size() > result.longest) {
            result.longest = characters.size();
            longest = piece.text;
        }
        addTokens(sign, characters, result);
    }
    if (result.tokens.empty() && result.longest > 0) {
        result.tokens.push_back(signedText(sign, longest));
        result.isPrefix = true;
    }
    std::sort(result.tokens.begin(), result.tokens.end());
    result.tokens.erase(std::unique(result.tokens.begin(), result.tokens.end()),
                        result.tokens.end());
    result.tokens.resize(std::min(result.tokens.size(), kMaxTokens));
    return result;
}

std::string matchOf(const TermTokens &term) {
    std::string match;
    for (const std::string &token : term.tokens) {
        match.append(match.empty() ? "(" : " AND ").append(quoted(token));
    }
    return match.append(term.isPrefix ? " *)" : ")");
}

}  // namespace

bool isColumnSign(char32_t character) {
    return character >= static_cast<unsigned char>(kSigns.front().sign) &&
           character <= static_cast<unsigned char>(kSigns.back().sign);
}

void addGramTokenizer(sqlite3 *connection) {
    fts5_api *api = nullptr;
    Statement statement(connection, "SELECT fts5(?1)", false);
    statement.bindPointer(1, &api, "fts5_api_ptr");
    statement.step();
    fts5_tokenizer tokenizer{createTokenizer, deleteTokenizer, tokenize};
    if (api == nullptr || api->xCreateTokenizer(api, kGramTokenizer.data(), nullptr, &tokenizer,
                                                nullptr) != SQLITE_OK) {
        throw DatabaseError(KLIB_ERR_DATABASE_FAILED, "this SQLite has no FTS5");
    }
}

std::string gramDocument(std::string_view titleKey, std::string_view artistKey,
                         std::string_view albumKey, std::string_view genreKey) {
    const std::array<std::pair<Column, std::string_view>, 4> keys = {{
        {Column::Title, titleKey},
        {Column::Artist, artistKey},
        {Column::Album, albumKey},
        {Column::Genre, genreKey},
    }};
    std::string document;
    for (const auto &[column, key] : keys) {
        if (!key.empty()) {
            document.push_back(signOf(column));
            document.append(key).append(kPadding);
        }
    }
    return document;
}

std::vector<std::string> beginningsOf(std::string_view token) {
    std::vector<std::string> beginnings;
    size_t length = 1;
    for (const std::string_view character : charactersOf(token.substr(1))) {
        length += character.size();
        /* Padding is no character of a search. */
        if (character.front() != kPadding.front() || length == token.size()) {
            beginnings.emplace_back(token.substr(0, length));
        }
    }
    return beginnings;
}

std::vector<std::string> gramsOf(const SearchTerm &term) {
    return tokensOf(term).tokens;
}

std::optional<GramQuery> gramQueryOf(const std::vector<SearchTerm> &searches) {
    GramQuery query{{}, true, false};
    for (const SearchTerm &term : searches) {
        const TermTokens tokens = tokensOf(term);
        if (tokens.tokens.empty()) {
            return std::nullopt;
        }
        query.isExact = query.isExact && term.pattern.part() && tokens.longest <= kGramCharacters;
        query.isShort = query.isShort || tokens.isPrefix;
        query.match.append(query.match.empty() ? "" : " OR ").append(matchOf(tokens));
    }
    return query;
}

}  // namespace zano::mediadb::sqlite
