#include <gtest/gtest.h>
#include <cstring>

#include "json.h"
#include "numbers.h"

namespace vorelix {
namespace {

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
