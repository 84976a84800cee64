/* The web front of this build behind its web server, on a free port of this machine. */
#pragma once

#include <gtest/gtest.h>
#include <json/value.h>

#include <filesystem>
#include <map>
#include <memory>
#include <string>

#include "support/files.h"
#include "support/program.h"
#include "system_paths_internal.h"

namespace web_test {

/* A user, and "Basic ..." as browsers send it. Passwords are "x". */
struct User {
    const char *name;
    const char *credentials;
    unsigned rights;
};
inline constexpr User kAdmin{"admin", "Basic YWRtaW46eA==", 31};
inline constexpr User kStreamer{"sam", "Basic c2FtOng=", 2};
inline constexpr User kLister{"pat", "Basic cGF0Ong=", 4};
inline constexpr User kNobody{"none", "Basic bm9uZTp4", 0};
inline constexpr User kLiar{"admin", "Basic YWRtaW46eQ==", 0};  // another password

struct Ask {
    std::string query = "";  // behind "?"
    std::string form = "";   // not "": a POST
    const User *user = &kAdmin;
    std::string method = "";   // "": GET or POST
    std::string headers = "";  // with line ends
    std::string path = "/webapi";
    std::string host = "";  // "": the server's address and port
};

struct Answer {
    int status = 0;
    std::map<std::string, std::string> headers;  // names in small letters; of two the last
    std::string body;

    /* The body as JSON; a failure of the test when it is none. */
    Json::Value json() const;
    /* "200", or "404 id" with the key of the envelope, whose shape is checked. */
    std::string outcome() const;
};

/* Songs a, b, c of the music folder with the ids 1, 2, 3, whose files hold the digits again and
 * again, and rows of the paths that a test adds. */
class Front : public testing::Test {
  protected:
    Front();
    ~Front() override;

    /* Starts a server with a configuration of programs/webapi/lighttpd/. */
    void serveDevice();
    void serveLocal();

    void addSong(const std::filesystem::path &path, const std::string &title);

    Answer ask(const Ask &ask) const;
    /* The body of a successful answer. */
    Json::Value get(const std::string &query) const;
    Json::Value post(const std::string &query, const std::string &form) const;
    /* The titles of a playlist's entries, one after another. */
    std::string entriesOf(int playlist) const;

    std::filesystem::path folder() const { return music_; }
    std::string path(const std::string &name) const { return files_.path(name); }

  private:
    void serve(const std::string &configuration, std::map<std::string, std::string> environment);
    int connectToServer() const;
    /* What the server answers to these very bytes. */
    Answer askRaw(const std::string &request) const;

    const files::Places places_{ZANO_PATH_CONF,         ZANO_PATH_PASSWD,
                                ZANO_PATH_GROUP,        ZANO_PATH_AUDIO_USERS,
                                ZANO_PATH_MIME_MAPPING, ZANO_PATH_MUSIC_LINK};
    files::Folder files_;
    std::filesystem::path music_;
    int port_ = 0;
    std::unique_ptr<program::Process> server_;
};

}  // namespace web_test
