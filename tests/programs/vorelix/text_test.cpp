#include "text.h"

#include <gtest/gtest.h>

#include <map>
#include <vector>

namespace vorelix {
namespace {

TEST(Text, NothingThatATerminalObeysIsPrinted) {
    const std::pair<std::string, std::string> cases[] = {
        {"plain Ünï 音", "plain Ünï 音"},
        {"\x1b[31mred\x1b]0;title\x07", "␛[31mred␛]0;title␇"},
        {"two\nlines\r\tand\x7f", "two␊lines␍␉and␡"},
        {"c1 \u009b31m", "c1 \uFFFD31m"},
        {"\u202etxt.exe\u2066", "\uFFFDtxt.exe\uFFFD"},
        {"a\xe2\x80\xa8z", "a\xEF\xBF\xBDz"},
        {"latin \xe9t\xe9", "latin \xEF\xBF\xBDt\xEF\xBF\xBD"},
        {"cut \xe9\x9f", "cut \xEF\xBF\xBD\xEF\xBF\xBD"},
        {"surrogate \xed\xa0\x80", "surrogate \xEF\xBF\xBD\xEF\xBF\xBD\xEF\xBF\xBD"},
        {"overlong \xc0\xaf", "overlong \xEF\xBF\xBD\xEF\xBF\xBD"},
        {std::string("nul \0 in", 8), "nul ␀ in"},
    };
    for (const auto &[text, printed] : cases) {
        EXPECT_EQ(printable(text), printed) << text;
    }
    EXPECT_EQ(validUtf8("tab\t \x1b \xff"), "tab\t \x1b \xEF\xBF\xBD");
}

TEST(Text, WidthIsWhatATerminalShows) {
    const std::map<int, std::vector<const char *>> textsOf = {
        {0, {""}},
        {2, {"ド", "ト\u3099", "👍", "👍🏽", "👨\u200d👩\u200d👧\u200d👦", "❤\ufe0f"}},
        {3, {"abc", "Ærø", "e\u0301te\u0301"}},
        {4, {"音楽", "ﾊﾝｶｸ", "한국", "🇩🇪🇫🇷"}},
        {9, {"zero\u200bwidth"}},
    };
    for (const auto &[width, texts] : textsOf) {
        for (const char *text : texts) {
            EXPECT_EQ(displayWidth(text), width) << text;
        }
    }
}

TEST(Text, CutBetweenWholeCharacters) {
    const struct {
        const char *text;
        int width;
        const char *cut;
    } cases[] = {
        {"abcdef", 6, "abcdef"},
        {"abcdef", 5, "abcd…"},
        {"abcdef", 1, "…"},
        {"abcdef", 0, ""},
        {"音楽音楽", 8, "音楽音楽"},
        {"音楽音楽", 7, "音楽音…"},
        {"音楽音楽", 6, "音楽…"},  // half a character is none
        {"e\u0301e\u0301e\u0301", 2, "e\u0301…"},
        {"👨\u200d👩\u200d👧 family", 4, "👨\u200d👩\u200d👧 …"},
    };
    for (const auto &row : cases) {
        EXPECT_EQ(cutToWidth(row.text, row.width), row.cut) << row.text << " in " << row.width;
    }
}

TEST(Text, WordsSurviveAShell) {
    EXPECT_EQ(shellQuoted("beyoncé"), "beyoncé");
    EXPECT_EQ(shellQuoted("../a-b_c.mp3"), "../a-b_c.mp3");
    EXPECT_EQ(shellQuoted(""), "''");
    EXPECT_EQ(shellQuoted("rock 'n' roll $1 \\"), "'rock '\\''n'\\'' roll $1 \\'");
}

}  // namespace
}  // namespace vorelix
