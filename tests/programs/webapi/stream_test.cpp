#include <fcntl.h>
#include <sys/stat.h>

#include "web_server.h"

namespace web_test {
namespace {

constexpr const char *kBytes = "0123456789012345678901234567890123456789";

class Streams : public Front {
  protected:
    Streams() { serveDevice(); }

    std::string streamOf(const std::string &title) const {
        const Json::Value songs = get("action=songs&limit=500")["songs"];
        for (const Json::Value &song : songs) {
            if (song["title"] == title) {
                return "action=stream&song=" + song["stream"].asString();
            }
        }
        ADD_FAILURE() << "no song " << title;
        return "";
    }
};

TEST_F(Streams, AreWholeOrTheRangeThatIsWanted) {
    const std::string song = streamOf("a");
    const Answer whole = ask({.query = song, .user = &kStreamer});
    EXPECT_EQ(whole.status, 200);
    EXPECT_EQ(whole.body, kBytes);
    EXPECT_EQ(whole.headers.at("content-type"), "audio/mpeg");
    EXPECT_EQ(whole.headers.at("content-length"), "40");
    EXPECT_EQ(whole.headers.at("accept-ranges"), "bytes");
    const Answer head = ask({.query = song, .method = "HEAD", .headers = "Range: bytes=0-1\r\n"});
    EXPECT_EQ(head.status, 200);
    EXPECT_EQ(head.headers.at("content-length"), "40");
    EXPECT_EQ(head.headers.at("etag"), whole.headers.at("etag"));
    EXPECT_EQ(head.body, "");
    // A date tells nothing of a file that was just written.
    const std::string soon = "Range: bytes=5-7\r\nIf-Range: " + whole.headers.at("last-modified");
    const struct timespec old[] = {{1000000000, 0}, {1000000000, 0}};
    ASSERT_EQ(utimensat(AT_FDCWD, (folder() / "b.mp3").c_str(), old, 0), 0);
    const std::string songOfOld = streamOf("b");
    const std::string tag = ask({.query = songOfOld}).headers.at("etag");
    const struct {
        std::string query;
        std::string headers;
        int status;
        const char *range;
        std::string body;
    } cases[] = {
        {song, "Range: bytes=5-7", 206, "bytes 5-7/40", "567"},
        {song, "Range: bytes=-2", 206, "bytes 38-39/40", "89"},
        {song, "Range: bytes=x", 200, "", kBytes},
        {song, soon, 200, "", kBytes},
        {song, "Range: bytes=5-7\r\nIf-Range: " + whole.headers.at("etag"), 206, "bytes 5-7/40",
         "567"},
        {song, "Range: bytes=5-7\r\nIf-Range: W/" + whole.headers.at("etag"), 200, "", kBytes},
        {song, "Range: bytes=5-7\r\nIf-Range: \"other\"", 200, "", kBytes},
        {songOfOld, "Range: bytes=5-7\r\nIf-Range: Sun, 09 Sep 2001 01:46:40 GMT", 206,
         "bytes 5-7/40", "567"},
        {songOfOld, "Range: bytes=5-7\r\nIf-Range: Sun, 09 Sep 2001 01:46:41 GMT", 200, "", kBytes},
        {songOfOld, "Range: bytes=5-7\r\nIf-Range: " + tag, 206, "bytes 5-7/40", "567"},
    };
    for (const auto &row : cases) {
        Answer answer = ask({.query = row.query, .headers = row.headers + "\r\n"});
        EXPECT_EQ(answer.status, row.status) << row.headers;
        EXPECT_EQ(answer.headers["content-range"], row.range) << row.headers;
        EXPECT_EQ(answer.body, row.body) << row.headers;
    }
    const Answer beyond = ask({.query = song, .headers = "Range: bytes=40-\r\n"});
    EXPECT_EQ(beyond.outcome(), "416 range");
    EXPECT_EQ(beyond.headers.at("content-range"), "bytes */40");
}

TEST_F(Streams, LargeOnesComeWhole) {
    std::string bytes;
    while (bytes.size() < 3U << 20) {
        bytes += std::to_string(bytes.size()) + " ";
    }
    files::write(folder() / "large.mp3", bytes);
    addSong(folder() / "large.mp3", "large");
    EXPECT_TRUE(ask({.query = streamOf("large")}).body == bytes);
    EXPECT_TRUE(ask({.query = streamOf("large"), .headers = "Range: bytes=65535-\r\n"}).body ==
                bytes.substr(65535));
}

TEST_F(Streams, NeverLeaveTheMusicFolder) {
    namespace fs = std::filesystem;
    const fs::path music = folder();
    files::write(path("secret.mp3"), "secret");
    fs::create_directories(path("secrets"));
    files::write(path("secrets/in.mp3"), "secret");
    fs::create_symlink(path("secret.mp3"), music / "out.mp3");
    fs::create_symlink(music / "a.mp3", music / "in.mp3");
    fs::create_symlink("nowhere.mp3", music / "dangling.mp3");
    fs::create_symlink("loop.mp3", music / "loop.mp3");
    fs::create_directory_symlink(path("secrets"), music / "linked");
    fs::create_directory(music / "folder.mp3");
    ASSERT_EQ(mkfifo((music / "pipe.mp3").c_str(), 0600), 0);
    files::write(music / "empty.mp3", "");
    const struct {
        const char *title;
        std::string path;
        const char *outcome;
    } cases[] = {
        {"link in", "in.mp3", kBytes},
        {"link out", "out.mp3", "404 file"},
        {"link to nowhere", "dangling.mp3", "404 file"},
        {"link to itself", "loop.mp3", "404 file"},
        {"folder out", "linked/in.mp3", "404 file"},
        {"steps out", "../secret.mp3", "404 file"},
        {"steps in", "../music/a.mp3", kBytes},
        {"folder", "folder.mp3", "404 file"},
        {"pipe", "pipe.mp3", "404 file"},
        {"gone", "gone.mp3", "404 file"},
        {"the folder", ".", "404 file"},
        {"empty", "empty.mp3", ""},
    };
    for (const auto &row : cases) {
        addSong(music.string() + "/" + row.path, row.title);
    }
    for (const auto &row : cases) {
        const Answer answer = ask({.query = streamOf(row.title)});
        EXPECT_EQ(answer.status == 200 ? answer.body : answer.outcome(), row.outcome) << row.title;
    }
    EXPECT_EQ(ask({.query = streamOf("empty"), .headers = "Range: bytes=0-\r\n"}).outcome(),
              "416 range");
    const std::string gone = streamOf("a");
    fs::remove(music / "a.mp3");
    EXPECT_EQ(ask({.query = gone}).outcome(), "404 file");
    EXPECT_EQ(ask({.query = gone + "0"}).outcome(), "400 song") << "another way to write the id";
}

/* A file that calls itself a page is not one on this site. */
TEST_F(Streams, RunNoScript) {
    files::write(folder() / "page.html", "<script>1</script>");
    addSong(folder() / "page.html", "page");
    const Answer answer = ask({.query = streamOf("page")});
    EXPECT_EQ(answer.headers.at("x-content-type-options"), "nosniff");
    EXPECT_EQ(answer.headers.at("content-type"), "application/octet-stream");
}

}  // namespace
}  // namespace web_test
