#include <gtest/gtest.h>
#include <zanoplatform/error.h>
#include <zanoplatform/settings.h>
#include <zanoplatform/sql_escape.h>
#include <zanoplatform/strings.h>

#include <array>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <memory>
#include <string>
#include <vector>

#include "support/files.h"
#include "system_paths_internal.h"

namespace {

struct FreeList {
    void operator()(SZLIST *list) const { KLIBCSzListFree(list); }
};

std::string joined(PSZLIST list) {
    std::string text;
    for (int i = 0; i < list->count; ++i) {
        text.append(KLIBCSzListGet(list, i)).append("|");
    }
    return text;
}

TEST(Lists, SplitKeepsEmptyItemsAndReplacesWhatWasThere) {
    const std::unique_ptr<SZLIST, FreeList> owner(KLIBCSzListAlloc(1));
    PSZLIST list = owner.get();
    const std::vector<std::tuple<const char *, const char *, int, const char *>> cases = {
        {"7,3,7", ",", 3, "7|3|7|"}, {"", ",", 0, ""},
        {"a", ",", 1, "a|"},         {",", ",", 2, "||"},
        {"a,,b,", ",", 4, "a||b||"}, {"a--b", "--", 2, "a|b|"},
    };
    for (const auto &[text, separator, count, items] : cases) {
        EXPECT_EQ(KLIBCStrSep(text, separator, &list), count) << text;
        EXPECT_EQ(joined(list), items) << text;
    }
    EXPECT_EQ(KLIBCStrSep("a", "", &list), -1);
    EXPECT_EQ(KLIBCStrSep(nullptr, ",", &list), -1);
    EXPECT_EQ(list->count, 0);
    EXPECT_EQ(KLIBCSzListGet(list, 0), nullptr);
    EXPECT_EQ(KLIBCSzListAlloc(-1), nullptr);
}

TEST(Lists, FindBeforeAndAfterSorting) {
    const std::unique_ptr<SZLIST, FreeList> owner(KLIBCSzListAlloc(2));
    PSZLIST list = owner.get();
    KLIBCStrSep("10,9,2,10", ",", &list);
    EXPECT_EQ(KLIBCSzListFind(list, "10"), 0);
    KLIBCSzListSortItems(list, 1);
    EXPECT_EQ(joined(list), "10|10|2|9|");
    EXPECT_EQ(KLIBCSzListFind(list, "10"), 0);
    EXPECT_EQ(KLIBCSzListFind(list, "9"), 3);
    EXPECT_EQ(KLIBCSzListFind(list, "1"), -1);
    KLIBCStrSep("4,0,30", ",", &list);
    EXPECT_EQ(joined(list), "0|30|4|") << "kept sorted when it is filled anew";
    EXPECT_EQ(KLIBCSzListFind(list, "30"), 1);
    KLIBCSzListSortItems(list, 0);
    KLIBCStrSep("4,0,30", ",", &list);
    EXPECT_EQ(joined(list), "4|0|30|");
    EXPECT_EQ(KLIBCSzListFind(list, "30"), 2);
    EXPECT_EQ(KLIBCSzListFind(list, "99"), -1);
}

TEST(Strings, FormattedAndTrimmedInPlace) {
    char *text = KLIBCStrGet("path = '%s'", "/m/a");
    EXPECT_STREQ(text, "path = '/m/a'");
    KLIBCStrPut(text);
    for (const auto &[given, wanted] : std::vector<std::pair<std::string, std::string>>{
             {" \t a b \r\n", "a b"}, {" \r\n\t", ""}, {"", ""}, {"x", "x"}}) {
        std::string buffer = given;
        EXPECT_EQ(KLIBCStrTrimSpace(buffer.data()), buffer.data());
        EXPECT_STREQ(buffer.c_str(), wanted.c_str());
    }
}

TEST(SqlEscape, QuotesAndBackslashesAreDoubledWithinTheirBuffers) {
    std::array<char, 16> out{};
    EXPECT_EQ(ZANODBEscapeString(out.data(), "a'b''", 5), 8);
    EXPECT_STREQ(out.data(), "a''b''''");
    EXPECT_EQ(ZANODBEscapeString(out.data(), "a'b", 1), 1);
    EXPECT_EQ(ZANODBEscapeString(nullptr, "a", 1), -1);
    EXPECT_EQ(ZANODBEscapeString(out.data(), "a", -1), -1);
    EXPECT_EQ(ZANODBEscapeBackslash(out.data(), 5, "\\\\"), 4);
    EXPECT_STREQ(out.data(), "\\\\\\\\");
    EXPECT_EQ(ZANODBEscapeBackslash(out.data(), 4, "\\\\"), -1);
    EXPECT_STREQ(out.data(), "");
}

TEST(SqlEscape, TemplatesTakeTheirTextsInOrderAndAsTheyAre) {
    const auto filled = [](char *text) {
        std::string copy = text != nullptr ? text : "(null)";
        std::free(text);
        return copy;
    };
    EXPECT_EQ(filled(ZANODBEscapeStringEX3(1,
                                           "path like '@ZANO:NEVAR/%%' and @ZANO:NEVAR ilike "
                                           "'%%@ZANO:NEVAR%%'",
                                           "/m", "title", "50%% @ZANO:NEVAR")),
              "path like '/m/%' and title ilike '%50%% @ZANO:NEVAR%'");
    EXPECT_EQ(filled(ZANODBEscapeStringEX3(1, "100%% % @ZANO:NEVA")), "100% % @ZANO:NEVA");
    EXPECT_EQ(filled(ZANODBEscapeStringEX3(1, "@ZANO:NEVAR", nullptr)), "(null)");
    EXPECT_EQ(filled(ZANODBEscapeStringEX3(2, "x")), "(null)");
}

TEST(Settings, LinesWithAndWithoutQuotes) {
    const files::Places places{ZANO_PATH_CONF};
    std::ofstream(ZANO_PATH_CONF)
        << "# a comment\n\n  runvorelix = \"yes\"  \r\nplain=text\n"
           "#off=\"x\"\nempty=\"\"\nhalf=\"\ntwice=1\ntwice=\"2=3\"\nnothing\n=x\n";
    const ZanoConf conf;
    EXPECT_EQ(conf.Info("runvorelix", "no"), "yes");
    EXPECT_EQ(conf.Info("plain", ""), "text");
    EXPECT_EQ(conf.Info("empty", "fallback"), "");
    EXPECT_EQ(conf.Info("half", ""), "\"");
    EXPECT_EQ(conf.Info("twice", ""), "2=3");
    EXPECT_EQ(conf.Info("off", "fallback"), "fallback");
    EXPECT_EQ(conf.Info("nothing", "fallback"), "fallback");
    std::filesystem::remove(ZANO_PATH_CONF);
    EXPECT_EQ(ZanoConf().Info("plain", "fallback"), "fallback");
    std::filesystem::create_directory(ZANO_PATH_CONF);
    EXPECT_EQ(ZanoConf().Info("plain", "fallback"), "fallback") << "of a folder";
}

}  // namespace
