/* Requests of those who mean no good, or do not know better. */
#include <filesystem>
#include <regex>
#include <set>

#include "support/text.h"
#include "web_server.h"

namespace web_test {
namespace {

using text::repeated;

struct Parameter {
    const char *action;
    const char *name;
    const char *others;  // what else the action needs
    bool isChange;
};

/* Whether the web server itself refuses an address with this: control characters and bytes that
 * no UTF-8 has. */
bool isForTheServer(const std::string &escaped) {
    return std::regex_search(escaped, std::regex("%(FF|00|0A|1B)"));
}

struct Values {
    std::vector<Parameter> parameters;
    std::vector<std::string> bad;
};

/* Every parameter of every action with what it does not take. */
std::vector<Values> badValues() {
    const Values numbers = {
        {{"songs", "offset", "", false},
         {"songs", "limit", "", false},
         {"browse", "offset", "by=artist", false},
         {"browse", "limit", "by=artist", false},
         {"random", "limit", "", false},
         {"playlists", "offset", "", false},
         {"playlists", "limit", "", false},
         {"playlist", "id", "", false},
         {"playlist", "offset", "id=1", false},
         {"playlist", "limit", "id=1", false},
         {"playlist-append", "id", "songs=1", true},
         {"playlist-remove", "id", "positions=0&total=3", true},
         {"playlist-remove", "total", "id=1&positions=0", true},
         {"playlist-move", "id", "from=0&to=1&total=3", true},
         {"playlist-move", "from", "id=1&to=1&total=3", true},
         {"playlist-move", "to", "id=1&from=0&total=3", true},
         {"playlist-move", "total", "id=1&from=0&to=1", true},
         {"playlist-delete", "id", "", true},
         {"key-set", "key", "type=a&value=b&title=c", true}},
        {"", "x", "-1", "+1", "1x", "%201", "0x1", "2147483648", "99999999999999999999",
         "1%20or%201=1", "1%FF", "1%00", repeated(2000, "9")}};
    const Values lists = {{{"playlist-append", "songs", "id=1", true},
                           {"playlist-remove", "positions", "id=1&total=3", true},
                           {"playlist-create", "songs", "title=bad", true}},
                          {"x", "1,,2", "1,", ",1", "1;2", "-1", "1,2147483648", "1)%20or%20(1=1",
                           "%FF", repeated(20000, "1,") + "1"}};
    const Values choices = {{{"songs", "category", "keyword=a", false},
                             {"songs", "sort", "", false},
                             {"songs", "direction", "", false},
                             {"browse", "by", "", false},
                             {"browse", "direction", "by=album", false}},
                            {"", "x", "TITLE", "title;--", "path", "artist%00", "%C3"}};
    const Values texts = {{{"songs", "keyword", "", false},
                           {"songs", "artist", "", false},
                           {"songs", "album", "", false},
                           {"songs", "genre", "", false}},
                          {"%FF", "%ED%A0%80", "a%00b", repeated(1025, "a")}};
    const Values keys = {{{"key-set", "key", "type=a&value=b&title=c", true}}, {"0", "5", "1,2"}};
    const Values keyTexts = {{{"key-set", "type", "key=1&value=b&title=c", true},
                              {"key-set", "value", "key=1&type=b&title=c", true},
                              {"key-set", "title", "key=1&type=b&value=c", true}},
                             {"%FF", "a%00b", repeated(1025, "a")}};
    const Values titles = {{{"playlist-create", "title", "", true}},
                           {"", ".hidden", "a/b", "..%2F..%2Fx", "%0A", "%1B[2J", "a%00b", "%FF",
                            repeated(252, "a"), repeated(1000000, "a")}};
    const Values streams = {
        {{"stream", "song", "", false}, {"mimetype", "extension", "", false}},
        {"", "%22", "../x", "a.b", repeated(1025, "a"), "%FF", "x%00", "12345/", "zzzzzz."}};
    return {numbers, lists, choices, texts, keys, keyTexts, titles, streams};
}

class Hostile : public Front {
  protected:
    Hostile() {
        serveDevice();
        post("action=playlist-create", "title=kept&songs=1,2,3");
    }

    /* Nothing that was refused has left a trace. */
    ~Hostile() override {
        EXPECT_EQ(entriesOf(1), "abc");
        EXPECT_EQ(get("action=playlists")["total"], 1);
        EXPECT_EQ(get("action=songs")["total"], 3);
        std::set<std::string> names;
        for (const auto &each : std::filesystem::recursive_directory_iterator(folder())) {
            names.insert(each.path().filename());
        }
        const std::set<std::string> expected{"a.mp3", "b.mp3", "c.mp3", "kept.m3u", "playlists"};
        EXPECT_EQ(names, expected);
    }
};

TEST_F(Hostile, BadValuesOfEveryParameter) {
    int count = 0;
    for (const Values &values : badValues()) {
        for (const Parameter &parameter : values.parameters) {
            for (const std::string &bad : values.bad) {
                const std::string action = std::string("action=") + parameter.action;
                const std::string rest =
                    std::string(parameter.others) + "&" + parameter.name + "=" + bad;
                const Answer answer = parameter.isChange ? ask({.query = action, .form = rest})
                                                         : ask({.query = action + "&" + rest});
                const bool isAnsweredBefore = !parameter.isChange && isForTheServer(bad);
                EXPECT_EQ(answer.outcome(),
                          std::string("400 ") + (isAnsweredBefore ? "request" : parameter.name))
                    << action << " " << rest.substr(0, 100);
                ++count;
            }
        }
    }
    EXPECT_GE(count, 250);
}

TEST_F(Hostile, WhatIsMissingOrNotThere) {
    const std::pair<Ask, const char *> cases[] = {
        {{.query = ""}, "404 action"},
        {{.query = "action="}, "404 action"},
        {{.query = "action=Songs"}, "404 action"},
        {{.query = "action=songs%20"}, "404 action"},
        {{.query = "action=../songs"}, "404 action"},
        {{.query = "action=" + repeated(7000, "a")}, "404 action"},
        {{.query = "action=nope", .form = "a=1"}, "404 action"},
        {{.query = "action=songs&action=nope"}, "404 action"},
        {{.query = "action=songs%FF"}, "400 request"},
        {{.query = "action=playlist-delete", .form = "id=9&action=playlist-delete%FF"},
         "400 action"},
        {{.query = "action=playlist-delete", .form = "id=9&%FF=1"}, "400 query"},
        {{.query = "action=playlist-delete", .form = "id=9&more=%FF"}, "400 more"},
        {{.query = "action=browse"}, "400 by"},
        {{.query = "action=playlist"}, "400 id"},
        {{.query = "action=playlist&id=2"}, "404 id"},
        {{.query = "action=playlist&id=2147483647"}, "404 id"},
        {{.query = "action=mimetype"}, "400 extension"},
        {{.query = "action=stream"}, "400 song"},
        {{.query = "action=stream&song=1"}, "400 song"},
        {{.query = "action=playlist-create", .form = "songs=1"}, "400 title"},
        {{.query = "action=playlist-create", .form = "title=kept"}, "409 title"},
        {{.query = "action=playlist-create", .form = "title=new&songs=1,9"}, "404 songs"},
        {{.query = "action=playlist-append", .form = "id=1"}, "400 songs"},
        {{.query = "action=playlist-append", .form = "id=1&songs=1,9"}, "404 songs"},
        {{.query = "action=playlist-append", .form = "id=2&songs=1"}, "404 id"},
        {{.query = "action=playlist-remove", .form = "id=1&total=3"}, "400 positions"},
        {{.query = "action=playlist-remove", .form = "id=1&total=3&positions=3"}, "400 positions"},
        {{.query = "action=playlist-remove", .form = "id=1&total=2&positions=0"}, "409 total"},
        {{.query = "action=playlist-move", .form = "id=1&total=3&from=3&to=0"}, "400 from"},
        {{.query = "action=playlist-move", .form = "id=1&total=3&from=0&to=3"}, "400 to"},
        {{.query = "action=playlist-move", .form = "id=1&total=4&from=0&to=3"}, "409 total"},
        {{.query = "action=playlist-delete", .form = "id=2"}, "404 id"},
        {{.query = "action=key-set", .form = "key=1&value=a&title=b"}, "400 type"},
        {{.query = "action=key-set", .form = "key=1&type=a&title=b"}, "400 value"},
        {{.query = "action=key-set", .form = "key=1&type=a&value=b"}, "400 title"},
        {{.query = "action=playlist-delete",
          .form = "x",
          .headers = "Content-Type: text/plain\r\n"},
         "400 body"},
        {{.query = "action=playlist-delete", .form = "id=1&x=" + repeated(1U << 20, "a")},
         "413 body"},
        {{.query = "action=playlist-delete", .form = "id=1&x=" + repeated(3U << 20, "a")},
         "413 body"},
        {{.query = "action=songs&keyword=" + repeated(1U << 20, "a")}, "431 request"},
        {{.query = "action=songs", .method = "FOO"}, "501 method"},
        {{.query = "action=songs&keyword=\xFF"}, "400 request"},
        {{.query = "action=songs", .path = "/webapi/x"}, "404 address"},
        {{.query = "action=songs", .path = "/webapi2"}, "404 address"},
        {{.path = "/../../../../etc/passwd"}, "404 address"},
        {{.path = "/%2e%2e/%2e%2e/etc/passwd"}, "404 address"},
        {{.path = "/errors/error-404.html"}, "404 address"},
        {{.query = "action=rights", .user = nullptr}, "401 user"},
        {{.query = "action=rights", .user = &kLiar, .headers = "Remote-User: admin\r\n"},
         "401 user"},
    };
    for (const auto &[asked, outcome] : cases) {
        SCOPED_TRACE(asked.path + "?" + asked.query.substr(0, 80) + asked.form.substr(0, 80));
        const Answer answer = ask(asked);
        EXPECT_EQ(answer.outcome(), outcome);
        EXPECT_EQ(answer.headers.at("content-type"), "application/json");
    }
}

TEST_F(Hostile, HugeNumbersAreNoFault) {
    for (const char *query : {"action=songs&offset=2147483647&limit=500",
                              "action=browse&by=album&offset=2147483647&direction=desc",
                              "action=playlists&offset=2147483647",
                              "action=playlist&id=1&offset=2147483647&limit=500"}) {
        EXPECT_GT(get(query)["total"].asInt(), 0) << query;
    }
}

TEST_F(Hostile, OtherMethods) {
    const std::pair<const char *, const char *> methods[] = {
        {"songs", "GET, HEAD"}, {"stream", "GET, HEAD"}, {"playlist-delete", "POST"}};
    for (const auto &[action, allowed] : methods) {
        const bool isChange = std::string(allowed) == "POST";
        for (const std::string method : {isChange ? "GET" : "POST", "PUT", "DELETE", "PATCH"}) {
            const Answer answer =
                ask({.query = std::string("action=") + action + "&id=1", .method = method});
            EXPECT_EQ(answer.outcome(), "405 method") << action << " " << method;
            EXPECT_EQ(answer.headers.at("allow"), allowed);
        }
    }
}

TEST_F(Hostile, ChangesThatAnotherSiteAsksFor) {
    const std::pair<const char *, const char *> cases[] = {
        {"", "404 id"},
        {"Sec-Fetch-Site: same-origin\r\n", "404 id"},
        {"Origin: http://127.0.0.1:80\r\nHost: 127.0.0.1:80\r\n", "400 request"},
        {"Sec-Fetch-Site: cross-site\r\n", "403 origin"},
        {"Sec-Fetch-Site: same-site\r\n", "403 origin"},
        {"Sec-Fetch-Site: none\r\n", "403 origin"},
        {"Origin: http://evil.example\r\n", "403 origin"},
        {"Origin: null\r\n", "403 origin"},
        {"Origin: http://127.0.0.1\r\n", "403 origin"},
        {"Origin: http://127.0.0.1:1\r\n", "403 origin"},
    };
    for (const auto &[headers, outcome] : cases) {
        EXPECT_EQ(
            ask({.query = "action=playlist-delete", .form = "id=9", .headers = headers}).outcome(),
            outcome)
            << headers;
    }
    EXPECT_EQ(ask({.query = "action=playlist-delete",
                   .form = "id=9",
                   .headers = "Origin: http://nas:8080\r\n",
                   .host = "NAS:8080"})
                  .outcome(),
              "404 id");
}

TEST_F(Hostile, NoActionWithoutItsRight) {
    const struct {
        const char *action;
        const char *form;
        unsigned right;  // of User::rights
    } actions[] = {
        {"rights", "", 0},           {"songs", "", 2},
        {"browse", "", 2},           {"random", "", 2},
        {"mimetype", "", 2},         {"stream", "", 2},
        {"playlists", "", 4},        {"playlist", "", 4},
        {"playlist-create", "x", 4}, {"playlist-append", "x", 4},
        {"playlist-remove", "x", 4}, {"playlist-move", "x", 4},
        {"playlist-delete", "x", 4}, {"keys", "", 1},
        {"key-set", "x", 1},
    };
    for (const User *user : {&kAdmin, &kStreamer, &kLister, &kNobody}) {
        const Json::Value rights = ask({.query = "action=rights", .user = user}).json();
        EXPECT_EQ(rights["mask"].asUInt(), user->rights);
        EXPECT_EQ(rights["user"], user->name);
        EXPECT_EQ(rights["streaming"], (user->rights & 2) != 0);
        EXPECT_EQ(rights["playlist"], (user->rights & 4) != 0);
        for (const auto &row : actions) {
            const std::string outcome =
                ask({.query = std::string("action=") + row.action, .form = row.form, .user = user})
                    .outcome();
            const bool isAllowed = (user->rights & row.right) == row.right;
            const char *const names[] = {"", "403 usb", "403 streaming", "", "403 playlist"};
            const std::string refused = names[row.right];
            EXPECT_EQ(outcome == refused, !isAllowed)
                << user->name << " " << row.action << ": " << outcome;
            EXPECT_EQ(outcome.substr(0, 3) == "403", !isAllowed) << outcome;
        }
    }
}

}  // namespace
}  // namespace web_test
