#include <gtest/gtest.h>

#include <string>

#include "support/files.h"
#include "support/process.h"
#include "system_paths_internal.h"

namespace {

constexpr const char *kRest = "\r\nX-Content-Type-Options: nosniff\r\n\r\n";
constexpr const char *kJsonHeader =
    "Content-Type: application/json; charset=\"UTF-8\"\r\nCache-Control: no-store";

/* What the program writes, with the end of its action object in front. */
std::string answerOf(const std::string &action) {
    const std::string program = ANSWER;
    const std::string command =
        "'" + program + "' " + action + " 2>&1 >'" + program + ".out'; cat '" + program + ".out'";
    return process::textOf(command);
}

class Answers : public testing::Test {
  protected:
    Answers() { setUp("runvorelix=\"yes\"\n"); }
    static void setUp(const char *settings) { files::write(ZANO_PATH_CONF, settings); }

  private:
    const files::Places places_{ZANO_PATH_CONF};
};

TEST_F(Answers, OfAServiceThatIsOffAreOneRefusal) {
    const std::string refusal =
        "~Action\nContent-Type: text/plain; charset=\"UTF-8\"\r\nCache-Control: no-store" +
        std::string(kRest) + "{\"success\":false}";
    for (const char *settings : {"", "runvorelix=\"no\"", "runvorelix=\"\"", "runvorelix=\"1\"",
                                 "runvorelix=\"yes!\"", "other=\"yes\""}) {
        setUp(settings);
        EXPECT_EQ(answerOf("list"), refusal) << settings;
    }
    std::filesystem::remove(ZANO_PATH_CONF);
    EXPECT_EQ(answerOf("list"), refusal);
    for (const char *settings : {"runvorelix=\"YES\"", "runvorelix=Yes", "runvorelix=\"yEs\""}) {
        setUp(settings);
        EXPECT_EQ(answerOf("only_error").substr(8, 23), "Content-Type: applicati") << settings;
    }
}

TEST_F(Answers, AreTheEnvelopeWithItsHeader) {
    const std::pair<const char *, const char *> cases[] = {
        {"list",
         "{\"numbers\":[5.1,0.333333333333333,-0.1,3.0,123456789.123456,1e+21],\"songs\":["
         "\"Caf\xC3\xA9 <b>\\\"\\u0001\",\"bad \xEF\xBF\xBD\xEF\xBF\xBD\xEF\xBF\xBD"
         "\\\" end\"],\"success\":true,\"total\":2}"},
        {"fail",
         "{\"errno\":{\"key\":\"id\",\"line\":120,\"more\":true,\"section\":\"playlist\"},"
         "\"success\":false}"},
        {"only_error", "{\"errno\":{\"key\":\"id\",\"line\":-1,\"section\":\"playlist\"}}"},
        {"other_shape",
         "{\"errno\":{\"key\":\"b\",\"line\":3,\"section\":\"a\"},\"success\":false}"},
        {"text", "{\"errno\":{\"key\":\"b\",\"line\":3,\"section\":\"a\"}}"},
    };
    for (const auto &[action, body] : cases) {
        EXPECT_EQ(answerOf(action), std::string("~Action\n") + kJsonHeader + kRest + body);
    }
    EXPECT_EQ(answerOf("cached"),
              std::string("Content-Type: text/plain\r\nCache-Control: private") + kRest + "null");
}

}  // namespace
