#include <gtest/gtest.h>
#include <cstring>

#include "commands.h"
#include "json.h"
#include "numbers.h"
#include "paging.h"

namespace vorelix {
namespace {

/* The plain ones are seen where the program prints them. */
TEST(PageLine, SaysWhereAndHowToGoOn) {
    const struct {
        std::vector<std::string> words;
        Span span;
        bool byPage;
        int shown;
        int total;
        const char *line;
    } cases[] = {
        {{"vorelix", "list", "--page", "2"},
         {50, 50},
         true,
         50,
         100,
         "songs 51-100 of 100 (page 2 of 2)"},
        {{"vorelix", "--json", "list", "--desc", "--page=2"},
         {50, 50},
         true,
         50,
         151,
         "songs 51-100 of 151 (page 2 of 4; next: vorelix --json list --desc --page 3)"},
        {{"./my bin/vorelix", "list", "--offset", "3", "--limit", "2"},
         {3, 2},
         false,
         2,
         9,
         "songs 4-5 of 9 (next: './my bin/vorelix' list --limit 2 --offset 5)"},
        {{"vorelix", "list", "--", "--page", "it's \x1b"},
         {0, 5},
         true,
         5,
         6,
         "songs 1-5 of 6 (page 1 of 2; next: vorelix list --page 2 -- --page 'it'\\''s ␛')"},
    };
    for (const auto &row : cases) {
        Request request;
        request.command = &allCommands().front();
        request.words = row.words;
        request.span = row.span;
        request.byPage = row.byPage;
        EXPECT_EQ(pageLine("songs", request, row.shown, row.total), row.line);
    }
}

TEST(Json, PathsThatAreNotUtf8AreWhole) {
    ZANO_MEDIA_INFO song{};
    std::strcpy(song.path, "/m/\xe9t\xe9.mp3");
    std::strcpy(song.title, "a\"b\\\x1b\xff");
    song.duration = 187.2459F;
    const Json::Value object = songObject(song);
    EXPECT_EQ(object["path"], "/m/\xEF\xBF\xBDt\xEF\xBF\xBD.mp3");
    EXPECT_EQ(object["pathBytes"], "L20v6XTpLm1wMw==");
    EXPECT_EQ(object["title"], "a\"b\\\x1b\xEF\xBF\xBD");
    const std::string text = documentOf(object);
    EXPECT_NE(text.find("\"duration\" : 187.246,"), std::string::npos) << text;
    EXPECT_NE(text.find("\\u001b"), std::string::npos) << text;
    EXPECT_FALSE(songObject(ZANO_MEDIA_INFO{}).isMember("pathBytes"));
}

TEST(Json, Base64) {
    const std::pair<const char *, const char *> cases[] = {
        {"", ""}, {"f", "Zg=="}, {"fo", "Zm8="}, {"foo", "Zm9v"}, {"\xff\xfe\xfd!", "//79IQ=="}};
    for (const auto &[bytes, text] : cases) {
        EXPECT_EQ(base64(bytes), text);
    }
}

TEST(Numbers, AsPeopleReadThem) {
    EXPECT_EQ(durationText(59.6), "1:00");
    EXPECT_EQ(durationText(3599.4), "59:59");
    EXPECT_EQ(durationText(-1), "");
    EXPECT_EQ(frequencyText(48000), "48 kHz");
}

}  // namespace
}  // namespace vorelix
