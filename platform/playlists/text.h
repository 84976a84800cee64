/* The bytes of a playlist as text: encodings, lines, letters of both cases. */
#pragma once

#include <array>
#include <cstddef>
#include <string>
#include <string_view>

#include "text/utf8.h"

namespace zano::playlists {

/* The text of a file. UTF-16, told by its BOM or by the zeros of its first two characters, is
 * converted into `converted`; everything else is a view of the bytes behind a UTF-8 BOM. */
std::string_view fileText(std::string_view bytes, std::string &converted);

bool isAscii(std::string_view text);

/* Windows-1252 as UTF-8. */
std::string fromWindows1252(std::string_view text);

/* Only A-Z have two cases here. */
bool equalsIgnoringCase(std::string_view a, std::string_view b);
bool startsIgnoringCase(std::string_view text, std::string_view start);
/* The first place of `part`, in small letters, or npos. */
std::size_t findIgnoringCase(std::string_view text, std::string_view part);

/* Without spaces and control characters at both ends. */
std::string_view trimmed(std::string_view text);

/* The number at the front of a text, 0 where there is none; what an int cannot hold becomes the
 * nearest that it can. */
int leadingInteger(std::string_view text);
double leadingNumber(std::string_view text);

/* The lines of a text; each ends at LF, CRLF, CR, or at NUL, which damaged files have behind
 * their text. Takes time in proportion to the text, whatever the ends are. */
class Lines {
  public:
    explicit Lines(std::string_view text) : text_(text) {}
    /* false: there is no further line. */
    bool next(std::string_view &line);

  private:
    static constexpr std::array kEnds = {'\n', '\r', '\0'};

    std::string_view text_;
    std::size_t at_ = 0;
    std::array<std::size_t, kEnds.size()> nextEnd_{};  // of each kind; looked for when passed
    bool isStarted_ = false;
};

}  // namespace zano::playlists
