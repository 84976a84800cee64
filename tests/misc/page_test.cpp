#include <gtest/gtest.h>
#include <vorelix/misc/misc.h>

#include <algorithm>
#include <climits>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>
#include <tuple>
#include <vector>

namespace {

const std::string kFirst =
    R"(<a href="javascript:ChangePageNo(null, 1);"><img src="images/first_page.png" alt="six" border=0></a>&nbsp;)";

std::string previous(const char *page) {
    return R"(<a href="javascript:ChangePageNo(null, )" + std::string(page) +
           R"();"><img src="images/previous_page.png" alt="five" border=0></a>)";
}

std::string field(const char *page, const char *state, const char *pages) {
    return R"(&nbsp;&nbsp;<span class="search_text">Page</span> <input type="text" id="newPageNo" size="3" value=")" +
           std::string(page) +
           R"(" style="text-align:center" onKeyPress="ChangePageNo(event, -1);" )" + state + ">" +
           R"( , <span class="search_text">of )" + pages + "&nbsp;&nbsp;</span>\n";
}

std::string nextAndLast(const char *next, const char *last) {
    return R"(<a href="javascript:ChangePageNo(null, )" + std::string(next) +
           R"();"><img src="images/next_page.png" alt="seven" border=0></a>&nbsp;)"
           R"(<a href="javascript:ChangePageNo(null, )" +
           last + R"();"><img src="images/last_page.png" alt="eight" border=0></a>)";
}

TEST(PageBar, LeadsToThePagesThereAre) {
    const std::tuple<int, int, std::string> cases[] = {
        {1, 1, field("1", "disabled", "1")},
        {1, 0, field("1", "disabled", "0")},
        {2, 3, kFirst + previous("1") + field("2", "", "3") + nextAndLast("3", "3")},
        {3, 3, kFirst + previous("2") + field("3", "", "3")},
        {INT_MAX, INT_MIN,
         kFirst + previous("2147483646") + field("2147483647", "disabled", "-2147483648")},
    };
    for (const auto &[page, pages, bar] : cases) {
        testing::internal::CaptureStdout();
        const int result =
            ZANOAudioPrintPageNav(page, pages, "Page", "of", "five", "six", "seven", "eight");
        EXPECT_EQ(testing::internal::GetCapturedStdout(), bar);
        const std::string last = bar.substr(bar.rfind(page < pages ? "<a " : " , "));
        EXPECT_EQ(result, static_cast<int>(last.size())) << bar;
    }
}

TEST(PageFooter, NamesTheHostAndTheMaker) {
    testing::internal::CaptureStdout();
    const int result = ZANOAudioPrintPageFooter("http://a1", "a2", "a3", "a4");
    const std::string text = testing::internal::GetCapturedStdout();
    const std::string host =
        "<div align=\"right\" class=\"foot\">Hosted by <a href=\"http://a1\" target=\"_blank\" "
        "class=\"page_nav_link\">a3</a> a2 a4</div>\n";
    EXPECT_EQ(text.substr(0, host.size()), host);
    const std::string notice = text.substr(host.size());
    EXPECT_TRUE(notice.starts_with("<div align=\"right\" class=\"copyright\">")) << notice;
    EXPECT_EQ(notice.find('\n'), notice.size() - 1);
    EXPECT_EQ(result, static_cast<int>(notice.size()));
}

TEST(Html, IsEscapedWhereTheBufferHoldsTheWorstCase) {
    const std::tuple<const char *, int, const char *> cases[] = {
        {"a<b", 18, "a&lt;b"},
        {"a<b", 17, "?"},
        {"", 100, "?"},
        {"'&\">", 24, "'&amp;&quot;&gt;"},
        {"\"\"", 12, "&quot;&quot"},
        {"\"\"", 13, "&quot;&quot;"},
        {"x", 6, "x"},
        {"x", 0, "?"},
        {"x", -1, "?"},
        {"\xC3\xA9\x01", 18, "\xC3\xA9\x01"},
        {nullptr, 100, "?"},
    };
    for (const auto &[source, size, expected] : cases) {
        // Of exactly that size, so that the sanitizer sees a step beyond.
        std::vector<char> out(static_cast<std::size_t>(std::max(size, 2)), '?');
        ZANOHtmlSpecialChar(source, out.data(), size);
        if (*expected == '?') {  // nothing is written
            EXPECT_EQ(std::count(out.begin(), out.end(), '?'), static_cast<long>(out.size()));
        } else {
            EXPECT_STREQ(out.data(), expected) << source << " in " << size;
        }
    }
    ZANOHtmlSpecialChar("x", nullptr, 6);
}

std::string scrambled(unsigned int id) {
    char *const text = MediaIDEncryption(id);
    const std::string copy(text);
    std::free(text);
    return copy;
}

TEST(MediaId, ComesBackFromItsTextAndFromNoOther) {
    for (const unsigned int id : {0U, 1U, 15U, 4711U, 0xFFFFFFU, 0x1000000U, 0x80000000U, ~1U}) {
        const std::string text = scrambled(id);
        EXPECT_EQ(text, scrambled(id));
        EXPECT_LE(text.size(), 22U);
        EXPECT_EQ(text.find_first_not_of("0123456789abcdef"), std::string::npos) << text;
        EXPECT_EQ(MediaIDDecryption(text.c_str()), static_cast<int>(id)) << text;
        EXPECT_EQ(MediaIDDecryption((text + "z").c_str()), static_cast<int>(id)) << text;
        for (std::size_t at = 6; at < text.size(); ++at) {
            for (const char other : {'0', '9', 'f', 'g', ' ', '-'}) {
                std::string changed = text;
                changed[at] = other;
                if (changed != text) {
                    EXPECT_EQ(MediaIDDecryption(changed.c_str()), -1) << changed;
                }
            }
        }
    }
}

TEST(MediaId, IsMaskedByDigitsOfTheGenerator) {
    const unsigned int id = 0xABCDEF12;
    std::srand(id);
    std::string digits;
    for (int digit = 0; digit < 6; ++digit) {
        digits += "0123456789abcdef"[std::rand() % 16];
    }
    const std::string text = scrambled(id);
    EXPECT_EQ(text.substr(0, 6), digits);
    ASSERT_EQ(text.size(), 22U);
    const auto mask = std::stoul(digits, nullptr, 16);
    EXPECT_EQ(std::stoul(text.substr(6, 8), nullptr, 16), mask ^ id);
    EXPECT_EQ(std::stoul(text.substr(14), nullptr, 16),
              std::stoul(std::string(digits.rbegin(), digits.rend()), nullptr, 16) ^ id);
}

TEST(MediaId, OfOtherTextsIsNone) {
    for (const char *none :
         {"", "12345", "123456", "12344321", "zzzzzz", "000000zz", "0000001ffffffff1ffffffff",
          "0000000000000005000000005", "-00000-1-1", "0x00x0", "00000000/../../etc/passwd"}) {
        EXPECT_EQ(MediaIDDecryption(none), -1) << none;
    }
    EXPECT_EQ(MediaIDDecryption(nullptr), -1);
    EXPECT_EQ(MediaIDDecryption("abccba"), 0xABCCBA);
    EXPECT_EQ(MediaIDDecryption("abccba00"), 0xABCCBA);
    EXPECT_EQ(MediaIDDecryption("000000000000005000000005"), 5);
}

}  // namespace
