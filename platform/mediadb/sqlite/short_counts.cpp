#include "short_counts.h"

#include <algorithm>

#include "grams.h"
#include "text/fold.h"
#include "text/utf8.h"

namespace zano::mediadb::sqlite {
namespace {

/* A sign and one or two characters in one number; the second is 0 where there is one. */
constexpr unsigned kCharacterBits = 21;
constexpr std::uint64_t kCharacterMask = (std::uint64_t{1} << kCharacterBits) - 1;

std::uint64_t packed(char32_t sign, char32_t first, char32_t second) {
    return (std::uint64_t{sign} << 2 * kCharacterBits) | (std::uint64_t{second} << kCharacterBits) |
           first;
}

/* As the search index names it. */
std::string gramOf(std::uint64_t packed) {
    std::string gram(1, static_cast<char>(packed >> 2 * kCharacterBits));
    gram += characterText(static_cast<char32_t>(packed & kCharacterMask));
    if (const auto second = packed >> kCharacterBits & kCharacterMask; second != 0) {
        gram += characterText(static_cast<char32_t>(second));
    }
    return gram;
}

}  // namespace

void ShortCounts::add(std::string_view document, int songs) {
    ofDocument_.clear();
    char32_t sign = 0;
    char32_t previous = 0;
    while (!document.empty()) {
        const char32_t character = takeCharacter(document);
        if (isColumnSign(character)) {
            sign = character;
            previous = 0;
        } else if (character != kGramPadding) {
            ofDocument_.push_back(packed(sign, character, 0));
            if (previous != 0) {
                ofDocument_.push_back(packed(sign, previous, character));
            }
            previous = character;
        }
    }
    std::sort(ofDocument_.begin(), ofDocument_.end());
    const auto end = std::unique(ofDocument_.begin(), ofDocument_.end());
    std::for_each(ofDocument_.begin(), end, [&](std::uint64_t gram) { changes_[gram] += songs; });
}

void ShortCounts::write(Connection &connection) {
    Statement change = connection.prepare(
        "INSERT INTO short_counts VALUES(?1, ?2) ON CONFLICT(gram) DO UPDATE SET "
        "songs=songs+excluded.songs RETURNING songs");
    Statement remove = connection.prepare("DELETE FROM short_counts WHERE gram=?1");
    for (const auto &[key, songs] : changes_) {
        if (songs == 0) {
            continue;
        }
        const std::string gram = gramOf(key);
        Using row(change);
        row->bind(1, std::string_view(gram)).bind(2, songs);
        if (row->step() && row->integer(0) == 0) {
            remove.bind(1, std::string_view(gram)).run();
        }
    }
    clear();
}

bool ShortCounts::areIn(Connection &connection) const {
    Statement find = connection.prepare("SELECT songs FROM short_counts WHERE gram=?1");
    const bool isEach = std::all_of(changes_.begin(), changes_.end(), [&](const auto &count) {
        const std::string gram = gramOf(count.first);
        Using row(find);
        row->bind(1, std::string_view(gram));
        return row->step() && row->integer(0) == count.second;
    });
    return isEach && connection.integer("SELECT count(*) FROM short_counts") ==
                         static_cast<std::int64_t>(changes_.size());
}

ShortCounts countShort(Connection &connection) {
    ShortCounts counts;
    Statement rows = connection.prepare(
        "SELECT title_key, artist_key, album_key, genre_key FROM songs WHERE rank IS NOT NULL");
    while (rows.step()) {
        counts.add(gramDocument(rows.text(0), rows.text(1), rows.text(2), rows.text(3)), 1);
    }
    return counts;
}

}  // namespace zano::mediadb::sqlite
