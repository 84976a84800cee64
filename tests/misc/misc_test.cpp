#include <gtest/gtest.h>
#include <vorelix/misc/misc.h>

#include <string>
#include <vector>

namespace {

struct Case {
    std::string text;
    std::string expected;
};

/* The texts stand in blocks of exactly their size, so that the sanitizer sees a step beyond. */
void expectEach(void (*function)(char *), const std::vector<Case> &cases) {
    for (const Case &each : cases) {
        std::vector<char> buffer(each.text.c_str(), each.text.c_str() + each.text.size() + 1);
        function(buffer.data());
        EXPECT_STREQ(buffer.data(), each.expected.c_str()) << testing::PrintToString(each.text);
    }
    function(nullptr);
}

TEST(Trim, OnlyLineEndsAtTheEnd) {
    expectEach(trimTrailingNewline, {{"", ""},
                                     {"\n", ""},
                                     {"\r\n\r\n", ""},
                                     {"song.mp3\r\n\r\n", "song.mp3"},
                                     {"song.mp3\n\n\r", "song.mp3"},
                                     {"a\nb\n", "a\nb"},
                                     {"\n a \t\n", "\n a \t"},
                                     {"a", "a"}});
}

TEST(Trim, WritesNulOverEveryLineEnd) {
    std::string text = "ab\r\n\n";
    trimTrailingNewline(text.data());
    EXPECT_EQ(text, std::string("ab\0\0\0", 5));
}

TEST(Strip, BlanksAtBothEnds) {
    expectEach(strstrip, {{"", ""},
                          {" ", ""},
                          {" \n\r\t \t", ""},
                          {"  a b\n", "a b"},
                          {"\t\r\n a", "a"},
                          {"a \r\n", "a"},
                          {"a\v ", "a\v"},
                          {"\xC2\xA0 a", "\xC2\xA0 a"},
                          {"a", "a"}});
}

}  // namespace
