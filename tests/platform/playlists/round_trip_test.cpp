/* What the library writes is read back entry for entry, whatever the names are, and although
 * none of the files is there. */
#include "music.h"

namespace zano::playlists {
namespace {

struct Written {
    std::string title;
    std::string artist;
    std::string path;  // below the folder above the music
    int year = 0;
    int duration = 0;
};

/* The three forms as the library's writer gives them. */
std::string asM3u(const std::vector<Written> &list) {
    std::ostringstream text;
    text << "#EXTM3U\r\n";
    for (const Written &each : list) {
        if (!each.title.empty()) {
            text << "#EXTINF:" << each.duration << "," << each.title << "\r\n";
        }
        if (!each.artist.empty()) {
            text << "#EXTINFARTIST:" << each.artist << "\r\n";
        }
        if (each.year != 0) {
            text << "#EXTINFYEAR:" << each.year << "\r\n";
        }
        text << "../" << each.path << "\r\n";
    }
    return text.str();
}

std::string asPls(const std::vector<Written> &list) {
    std::ostringstream text;
    text << "[playlist]\r\n";
    int number = 0;
    for (const Written &each : list) {
        text << "File" << ++number << "=../" << each.path << "\r\n";
    }
    text << "NumberOfEntries=" << number << "\r\nVersion=2\r\n";
    return text.str();
}

std::string asWpl(const std::vector<Written> &list) {
    std::ostringstream text;
    text << "<?wpl version=\"1.0\"?>\r\n<smil>\r\n<head></head>\r\n<body>\r\n<seq>\r\n";
    for (const Written &each : list) {
        text << "<media src=\"../" << each.path << "\"/>\r\n";
    }
    text << "</seq>\r\n</body>\r\n</smil>\n\n";
    return text.str();
}

class RoundTripTest : public MusicTest {
  protected:
    int below(int end) { return std::uniform_int_distribution(0, end - 1)(random_); }

    /* Every printable character of ASCII but /, others of each length, and bytes of no encoding. */
    std::string text(int length) {
        static const std::string others[] = {"\u00e9", "e\u0301", "\u20ac", "\U0001F3B5", "\xff",
                                             "\xc3",   "&amp;",   "%20",    "..",         "\\"};
        std::string made;
        while (static_cast<int>(made.size()) < length) {
            const char c = static_cast<char>(' ' + below('~' - ' ' + 1));
            made += below(8) == 0 ? others[below(10)] : std::string(1, c == '/' ? 'x' : c);
        }
        return made;
    }

    /* Of the names that steps "." and ".." would hide, one letter keeps them apart. */
    std::string path() {
        std::string made = "a" + text(1 + below(30));
        for (int depth = below(5); depth > 0; --depth) {
            made += "/b" + text(below(20));
        }
        const bool isLong = below(20) == 0;
        return isLong ? made + std::string(4000 - made.size(), 'l') : made;
    }

    std::vector<Written> list() {
        std::vector<Written> made;
        for (int left = below(12); left > 0; --left) {
            made.push_back({below(3) == 0 ? "" : letters(below(200)),
                            below(2) == 0 ? "" : letters(below(200)), path(), below(3) * 1000, 0});
            made.back().duration = made.back().title.empty() ? 0 : below(4000) - 1;
        }
        return made;
    }

    std::string letters(int length) {
        std::string made;
        for (const char c : text(length)) {
            made.push_back(static_cast<signed char>(c) < 0 ? '?' : c);
        }
        return made;
    }

    std::string expected(const std::vector<Written> &list, bool withTags) const {
        std::ostringstream lines;
        for (const Written &each : list) {
            lines << "     ~/../" << each.path << "|" << (withTags ? each.title : "") << "|"
                  << (withTags ? each.artist : "") << "|||" << (withTags ? each.year : 0) << "|0|0|"
                  << (withTags ? each.duration : 0) << "\n";
        }
        return lines.str();
    }

  private:
    std::mt19937 random_{20};
};

TEST_F(RoundTripTest, WhatIsWrittenIsReadBack) {
    for (int round = 0; round < 100; ++round) {
        const std::vector<Written> written = list();
        ASSERT_EQ(dump(write("l.m3u", asM3u(written))), expected(written, true)) << round;
        ASSERT_EQ(dump(write("l.pls", asPls(written))), expected(written, false)) << round;
        ASSERT_EQ(dump(write("l.wpl", asWpl(written))), expected(written, false)) << round;
    }
}

}  // namespace
}  // namespace zano::playlists
