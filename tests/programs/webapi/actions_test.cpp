#include <cstring>

#include "support/json.h"
#include "support/process.h"
#include "support/text.h"
#include "system_paths_internal.h"
#include "web_server.h"

namespace web_test {
namespace {

using json::textOf;
using json::titlesOf;
using text::contains;

/* What the program prints, started as a server does. */
std::string printed(const std::string &environment, const std::string &body = "") {
    const std::string command = "printf '%s' '" + body + "' | env -i ASAN_OPTIONS=detect_leaks=1 " +
                                environment + " '" + WEBAPI "' 2>&1";
    return process::textOf(command);
}

TEST_F(Front, SongsAreListedFoundSortedAndPaged) {
    serveDevice();
    addSong("/elsewhere/d.mp3", "d");
    addSong(folder().string() + "2/e.mp3", "e");
    const struct {
        const char *query;
        const char *titles;
        int total;
    } cases[] = {
        {"", "abc", 3},
        {"&direction=desc", "cba", 3},
        {"&sort=artist&direction=desc", "bca", 3},
        {"&sort=track", "abc", 3},
        {"&sort=duration&offset=1&limit=1", "b", 3},
        {"&offset=3", "", 3},
        {"&keyword=B", "b", 1},
        {"&keyword=two&category=artist", "bc", 2},
        {"&keyword=two&category=title", "", 0},
        {"&keyword=two&category=artist&limit=1", "b", 2},
        {"&keyword=%25", "a", 1},
        {"&keyword=_", "a", 1},
        {"&keyword=%5C", "a", 1},
        {"&keyword='", "a", 1},
        {"&keyword=d", "", 0},
        {"&artist=Two", "bc", 2},
        {"&artist=two", "", 0},
        {"&artist=It's+%25_%5C+one", "a", 1},
        {"&album=", "abc", 3},
        {"&album=x", "", 0},
    };
    for (const auto &row : cases) {
        const Json::Value answer = get(std::string("action=songs") + row.query);
        EXPECT_EQ(titlesOf(answer["songs"]), row.titles) << row.query;
        EXPECT_EQ(answer["total"], row.total) << row.query;
    }
    EXPECT_EQ(textOf(get("action=browse&by=artist")),
              R"({"names":["It's %_\\ one","Two"],"success":true,"total":2})");
    EXPECT_EQ(textOf(get("action=browse&by=artist&direction=desc&limit=1")),
              R"({"names":["Two"],"success":true,"total":2})");
    EXPECT_EQ(get("action=random&limit=2")["songs"].size(), 2U);
    EXPECT_EQ(get("action=mimetype&extension=MP3")["mimetype"], "audio/mpeg");
    EXPECT_EQ(get("action=mimetype&extension=xyz")["mimetype"], "application/octet-stream");
    const Answer head = ask({.query = "action=songs", .method = "HEAD"});
    EXPECT_EQ(head.status, 200);
    EXPECT_EQ(head.body, "");
}

TEST_F(Front, PlaylistsAreMadeEditedAndDeleted) {
    serveDevice();
    EXPECT_EQ(textOf(post("action=playlist-create", "title=%C3%89t%C3%A9+%3Cb%3E&songs=1,2,1")),
              R"({"id":1,"success":true})");
    EXPECT_EQ(post("action=playlist-create", "title=empty")["id"], 2);
    EXPECT_EQ(post("action=playlist-append", "id=2&songs=3")["total"], 1);
    EXPECT_EQ(textOf(get("action=playlists&limit=1&offset=1")),
              R"({"playlists":[{"id":1,"title":"Été <b>"}],"success":true,"total":2})");
    const struct {
        const char *action;
        const char *form;
        const char *titles;
    } edits[] = {
        {"append", "songs=3,2", "abacb"},
        {"move", "from=0&to=4&total=5", "bacba"},
        {"move", "from=3&to=0&total=5", "bbaca"},
        {"move", "from=1&to=1&total=5", "bbaca"},
        {"remove", "positions=4,0,4&total=5", "bac"},
    };
    for (const auto &edit : edits) {
        const Json::Value answer =
            post(std::string("action=playlist-") + edit.action, std::string("id=1&") + edit.form);
        EXPECT_EQ(answer["total"].asUInt(), strlen(edit.titles));
        EXPECT_EQ(entriesOf(1), edit.titles);
    }
    EXPECT_EQ(textOf(get("action=playlist&id=1&offset=2")["entries"]).substr(0, 60),
              std::string(R"([{"album":"","artist":"Two","disc":0,"duration":0.0,"genre":""})")
                  .substr(0, 60));
    post("action=playlist-delete", "id=1");
    EXPECT_FALSE(std::filesystem::exists(folder() / "playlists" / "Été <b>.m3u"));
    EXPECT_EQ(ask({.query = "action=playlist&id=1"}).outcome(), "404 id");
}

TEST_F(Front, KeysAreShownAndSet) {
    serveDevice();
    std::filesystem::create_directories(std::filesystem::path(ZANO_PATH_CUSTOM_KEYS).parent_path());
    std::filesystem::remove(ZANO_PATH_CUSTOM_KEYS);
    post("action=key-set", "key=4&type=web+radio&value=http://x.example/y&title=%C3%89t%C3%A9");
    post("action=key-set", "key=1&type=&value=v&title=");
    EXPECT_EQ(textOf(get("action=keys")["keys"]),
              R"([{"key":1,"title":"","type":"","value":"v"},)"
              R"({"key":2,"title":"","type":"","value":""},)"
              R"({"key":3,"title":"","type":"","value":""},)"
              R"({"key":4,"title":"Été","type":"web radio","value":"http://x.example/y"}])");
    files::write(ZANO_PATH_CUSTOM_KEYS, "{");
    EXPECT_EQ(ask({.query = "action=keys"}).outcome(), "500 keys");
    EXPECT_EQ(ask({.query = "action=key-set", .form = "key=1&type=&value=&title="}).outcome(),
              "500 keys");
    EXPECT_EQ(files::read(ZANO_PATH_CUSTOM_KEYS), "{");
    std::filesystem::remove(ZANO_PATH_CUSTOM_KEYS);
}

/* A form that is only read, a file that is gone, and one that leads out of the folder. */
TEST_F(Front, PlaylistsThatCannotBeEdited) {
    serveDevice();
    const std::filesystem::path lists = folder() / "playlists";
    for (const char *title : {"read", "gone", "out"}) {
        post("action=playlist-create", std::string("title=") + title + "&songs=1");
    }
    std::filesystem::remove(lists / "gone.m3u");
    std::filesystem::remove(lists / "out.m3u");
    files::write(path("secret.m3u"), "#EXTM3U\nhttp://secret.example/\n");
    std::filesystem::create_symlink(path("secret.m3u"), lists / "out.m3u");
    for (const std::string id : {"id=2", "id=3"}) {
        EXPECT_EQ(ask({.query = "action=playlist&" + id}).outcome(), "404 file");
        EXPECT_EQ(ask({.query = "action=playlist-append", .form = id + "&songs=1"}).outcome(),
                  "404 file");
        EXPECT_EQ(files::read(path("secret.m3u")), "#EXTM3U\nhttp://secret.example/\n");
        post("action=playlist-delete", id);
    }
    EXPECT_EQ(files::read(path("secret.m3u")), "#EXTM3U\nhttp://secret.example/\n");
    files::write(lists / "read.m3u", "#EXTM3U\nhttp://x.example/y\n#EXTINF:3,T\n/z/T.mp3\n");
    const Json::Value entries = get("action=playlist&id=1")["entries"];
    EXPECT_EQ(entries[0]["url"], "http://x.example/y");
    EXPECT_EQ(entries[1]["path"], "/z/T.mp3");
    EXPECT_FALSE(entries[1].isMember("stream"));
}

TEST_F(Front, EditsAtOnceLoseNothing) {
    serveDevice();
    post("action=playlist-create", "title=all");
    process::runAtOnce(4, [this](int caller) {
        const std::string form = "id=1&songs=" + std::to_string(caller % 3 + 1);
        for (int made = 0; made < 5;) {
            const Answer answer = ask({.query = "action=playlist-append", .form = form});
            if (answer.outcome() != "200" && answer.outcome() != "409 busy") {
                return 1;
            }
            made += answer.status == 200 ? 1 : 0;
        }
        return 0;
    });
    const std::string entries = entriesOf(1);
    EXPECT_EQ(entries.size(), 20U);
    EXPECT_EQ(std::count(entries.begin(), entries.end(), 'a'), 10);
}

TEST_F(Front, ServiceThatIsOffRefusesEverything) {
    serveDevice();
    files::write(ZANO_PATH_CONF, "runvorelix=\"no\"\n");
    for (const Ask &each : {Ask{.query = "action=songs"}, Ask{.query = "action=nope"},
                            Ask{.query = "action=playlist-create", .form = "title=x"},
                            Ask{.query = "action=rights", .user = &kNobody}}) {
        const Answer answer = ask(each);
        EXPECT_EQ(answer.status, 200);
        EXPECT_EQ(answer.body, R"({"success":false})") << each.query;
        EXPECT_EQ(answer.headers.at("content-type"), "text/plain; charset=\"UTF-8\"");
    }
}

TEST_F(Front, DatabaseOrFolderThatIsGoneIsAFailure) {
    serveDevice();
    std::filesystem::remove(ZANO_PATH_MUSIC_LINK);
    EXPECT_EQ(ask({.query = "action=songs"}).outcome(), "500 music");
    std::filesystem::create_directory_symlink(folder(), ZANO_PATH_MUSIC_LINK);
    std::filesystem::remove(path("media.db"));
    for (const char *action :
         {"songs", "browse&by=artist", "random", "playlists", "playlist&id=1"}) {
        EXPECT_EQ(ask({.query = std::string("action=") + action}).outcome(), "500 database");
    }
}

TEST_F(Front, LocalServerAnswersItsOwnNameOnly) {
    serveLocal();
    const Json::Value rights = ask({.query = "action=rights", .user = nullptr}).json();
    EXPECT_EQ(rights["user"], "sam");
    const std::pair<const char *, const char *> cases[] = {
        {"127.0.0.1", "200"},
        {"localhost:8080", "200"},
        {"evil.example", "403 address"},
        {"127.0.0.1.evil.example", "403 address"},
        {"localhost.evil:80", "403 address"}};
    for (const auto &[host, outcome] : cases) {
        const Ask question{.query = "action=rights", .user = nullptr, .host = host};
        EXPECT_EQ(ask(question).outcome(), outcome) << host;
    }
    const Answer page = ask({.user = nullptr, .path = "/", .host = "localhost"});
    EXPECT_EQ(page.status, 200);
    EXPECT_EQ(page.headers.at("content-type"), "text/html; charset=utf-8");
    EXPECT_EQ(page.headers.at("content-security-policy"),
              "default-src 'self'; frame-ancestors 'none'");
    EXPECT_EQ(page.headers.at("x-content-type-options"), "nosniff");
}

/* What a server that is set up wrongly hands over. */
TEST_F(Front, ProgramWithoutItsServer) {
    const struct {
        const char *environment;
        const char *body;
        const char *status;
    } cases[] = {
        {"REQUEST_METHOD=GET QUERY_STRING=action=songs", "", "Status: 401 Unauthorized\r\n"},
        {"REMOTE_USER= REQUEST_METHOD=GET QUERY_STRING=action=songs", "",
         "Status: 401 Unauthorized\r\n"},
        {"REMOTE_USER=admin", "", "Status: 405 Method Not Allowed\r\n"},
        {"REMOTE_USER=admin REQUEST_METHOD=GET", "", "Status: 404 Not Found\r\n"},
        {"REMOTE_USER=admin REQUEST_METHOD=POST QUERY_STRING=action=playlist-delete "
         "CONTENT_LENGTH=9 CONTENT_TYPE=application/x-www-form-urlencoded",
         "id=1", "Status: 400 Bad Request\r\n"},
        {"REMOTE_USER=admin REQUEST_METHOD=POST QUERY_STRING=action=playlist-delete "
         "CONTENT_LENGTH=-1",
         "id=1", "Status: 413 Content Too Large\r\n"},
        {"REMOTE_USER=admin REQUEST_METHOD=GET QUERY_STRING=action=songs", "",
         "Content-Type: application/json\r\n"},
    };
    for (const auto &row : cases) {
        const std::string text = printed(row.environment, row.body);
        EXPECT_EQ(text.substr(0, strlen(row.status)), row.status) << row.environment;
        EXPECT_TRUE(contains(text, "{")) << row.environment;
    }
}

/* What the other parts of both libraries need costs each request its loading. */
TEST(Program, LoadsNothingForWhatItDoesNotDo) {
    const std::string libraries = printed("LD_TRACE_LOADED_OBJECTS=1");
    EXPECT_TRUE(contains(libraries, "libsqlite3"));
    for (const char *library : {"libpq", "libcurl", "libxml2"}) {
        EXPECT_FALSE(contains(libraries, library)) << libraries;
    }
}

}  // namespace
}  // namespace web_test
