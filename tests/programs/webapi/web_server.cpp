#include "web_server.h"

#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <memory>
#include <regex>

#include "mediadb/catalogue.h"
#include "support/json.h"
#include "support/loopback.h"
#include "system_paths_internal.h"

namespace web_test {

namespace {

namespace fs = std::filesystem;

constexpr const char *kPasswordHash = "{SHA}EfatjsUqKYSrqv18O1FlA3hcIHI=";

std::string decodedChunks(const std::string &body) {
    std::string text;
    size_t at = 0;
    while (true) {
        const size_t line = body.find("\r\n", at);
        const size_t size = std::stoul(body.substr(at, line - at), nullptr, 16);
        if (size == 0) {
            return text;
        }
        text += body.substr(line + 2, size);
        at = line + 2 + size + 2;
    }
}

Answer parsed(const std::string &text) {
    Answer answer;
    const size_t end = text.find("\r\n\r\n");
    EXPECT_NE(end, std::string::npos) << "no answer: " << text.substr(0, 200);
    if (end == std::string::npos) {
        return answer;
    }
    answer.status = std::stoi(text.substr(text.find(' ') + 1));
    size_t at = text.find("\r\n") + 2;
    while (at < end) {
        const size_t line = text.find("\r\n", at);
        const size_t colon = text.find(": ", at);
        std::string name = text.substr(at, colon - at);
        std::transform(name.begin(), name.end(), name.begin(), ::tolower);
        answer.headers[name] = text.substr(colon + 2, line - colon - 2);
        at = line + 2;
    }
    answer.body = text.substr(end + 4);
    if (answer.headers["transfer-encoding"] == "chunked") {
        answer.body = decodedChunks(answer.body);
    }
    return answer;
}

}  // namespace

Json::Value Answer::json() const {
    return ::json::parsed(body);
}

std::string Answer::outcome() const {
    const Json::Value envelope = json();
    if (!envelope.isObject() || !envelope["success"].isBool()) {
        return "no envelope: " + body.substr(0, 200);
    }
    const Json::Value &error = envelope["errno"];
    if (envelope["success"].asBool()) {
        return error.isNull() ? std::to_string(status) : "an error and none";
    }
    const bool isError = error.isObject() && error.size() == 3 && error["section"].isString() &&
                         error["key"].isString() && error["line"].isInt() && envelope.size() == 2;
    return isError ? std::to_string(status) + " " + error["key"].asString()
                   : "no error: " + body.substr(0, 200);
}

Front::Front() : music_(files_.path("music")) {
    files::write(ZANO_PATH_CONF,
                 "mediadb=\"sqlite:" + path("media.db") + "\"\nrunvorelix=\"yes\"\n");
    files::write(ZANO_PATH_PASSWD,
                 "sam:x:1026:100::/:/bin/false\npat:x:1027:100::/:/bin/false\n"
                 "none:x:1028:100::/:/bin/false\n");
    files::write(ZANO_PATH_GROUP, "ZANO.VXT.Vorelix.Application:x:300:sam,pat\n");
    files::write(
        ZANO_PATH_AUDIO_USERS,
        R"({"1026": {"streaming": true}, "1027": {"playlist": true}, "1028": {"usb": true}})");
    files::write(ZANO_PATH_MIME_MAPPING, "\"mp3\" \"audio/mpeg\"\n");
    fs::create_directories(music_);
    fs::create_directory_symlink(music_, ZANO_PATH_MUSIC_LINK);
    for (const char *title : {"a", "b", "c"}) {
        const fs::path song = music_ / (std::string(title) + ".mp3");
        files::write(song, "0123456789012345678901234567890123456789");
        addSong(song, title);
    }
}

Front::~Front() {
    if (server_) {
        server_->stop(SIGTERM);
    }
}

void Front::addSong(const fs::path &path, const std::string &title) {
    const auto catalogue = zano::mediadb::openCatalogue("sqlite:" + this->path("media.db"));
    zano::mediadb::Song song;
    song.path = path;
    song.title = title;
    song.artist = title == "a" ? "It's %_\\ one" : "Two";
    catalogue->begin();
    catalogue->putSong(song);
    catalogue->commit();
    catalogue->finish({});
}

void Front::serveDevice() {
    std::string users;
    for (const User *user : {&kAdmin, &kStreamer, &kLister, &kNobody}) {
        users += std::string(user->name) + ":" + kPasswordHash + "\n";
    }
    files::write(path("users"), users);
    // As it is installed, but for the port, the user it runs as, its log and its passwords.
    std::string text = files::read(LIGHTTPD "/lighttpd.conf.in");
    const std::pair<const char *, std::string> changes[] = {
        {"server\\.port = 80", "server.port = env.VORELIX_PORT\nserver.bind = \"127.0.0.1\""},
        {"server\\.(user|group)name[^\n]*\n", ""},
        {"server\\.errorlog-use-syslog[^\n]*\n", ""},
        {"\"[^\"]*/vorelix\\.htpasswd\"", "\"" + path("users") + "\""},
        {"\"@VORELIX_LIBEXEC@/webapi\"", "\"" WEBAPI "\""},
        {"\"@VORELIX_SHARE@/page\"", "\"" PAGE "\""},
        {"\"@VORELIX_SHARE@/errors\"", "\"" ERRORS "\""},
        {"@VORELIX_SHARE@", LIGHTTPD},
    };
    for (const auto &[pattern, replacement] : changes) {
        text = std::regex_replace(text, std::regex(pattern), replacement);
    }
    files::write(path("lighttpd.conf"), text);
    serve(path("lighttpd.conf"), {});
}

void Front::serveLocal() {
    serve(LIGHTTPD "/local.conf", {{"VORELIX_USER", "sam"},
                                   {"VORELIX_WEBAPI", WEBAPI},
                                   {"VORELIX_PAGE", PAGE},
                                   {"VORELIX_ERRORS", ERRORS}});
}

/* Another program may take the port before the server does. */
void Front::serve(const std::string &configuration,
                  std::map<std::string, std::string> environment) {
    constexpr int kTries = 10;
    for (int tries = 0; tries < kTries; ++tries) {
        port_ = program::freePort();
        environment["VORELIX_PORT"] = std::to_string(port_);
        server_ = std::make_unique<program::Process>(
            program::Start{.path = LIGHTTPD_PROGRAM,
                           .argv = {"lighttpd", "-D", "-f", configuration},
                           .environment = environment});
        while (server_->isRunning()) {
            if (const int socket = connectToServer(); socket != -1) {
                close(socket);
                return;
            }
        }
    }
    FAIL() << "the web server does not start: " << server_->wait().err;
}

int Front::connectToServer() const {
    const int socket = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    const timeval limit{120, 0};
    setsockopt(socket, SOL_SOCKET, SO_RCVTIMEO, &limit, sizeof limit);
    sockaddr_in address = loopback::address(port_);
    if (connect(socket, loopback::general(address), sizeof address) != 0) {
        close(socket);
        return -1;
    }
    return socket;
}

Answer Front::askRaw(const std::string &request) const {
    const int socket = connectToServer();
    size_t sent = 0;
    while (sent < request.size()) {
        const ssize_t got =
            send(socket, request.data() + sent, request.size() - sent, MSG_NOSIGNAL);
        if (got <= 0) {
            break;  // it has heard enough
        }
        sent += static_cast<size_t>(got);
    }
    std::string text;
    char part[1U << 16];
    ssize_t got = 0;
    while ((got = recv(socket, part, sizeof part, 0)) > 0) {
        text.append(part, static_cast<size_t>(got));
    }
    close(socket);
    return parsed(text);
}

Answer Front::ask(const Ask &ask) const {
    const std::string method = !ask.method.empty() ? ask.method : ask.form.empty() ? "GET" : "POST";
    const std::string own = "127.0.0.1:" + std::to_string(port_);
    std::string request = method + " " + ask.path + "?" + ask.query +
                          " HTTP/1.1\r\nHost: " + (ask.host.empty() ? own : ask.host) +
                          "\r\nConnection: close\r\n" + ask.headers;
    if (ask.user != nullptr) {
        request += std::string("Authorization: ") + ask.user->credentials + "\r\n";
    }
    if (method == "POST" && ask.headers.find("Content-Type") == std::string::npos) {
        request += "Content-Type: application/x-www-form-urlencoded\r\n";
    }
    if (method != "GET" && method != "HEAD") {
        request += "Content-Length: " + std::to_string(ask.form.size()) + "\r\n";
    }
    return askRaw(request + "\r\n" + ask.form);
}

Json::Value Front::get(const std::string &query) const {
    const Answer answer = ask({.query = query});
    EXPECT_EQ(answer.outcome(), "200") << query;
    EXPECT_EQ(answer.headers.at("content-type"), "application/json");
    return answer.json();
}

Json::Value Front::post(const std::string &query, const std::string &form) const {
    const Answer answer = ask({.query = query, .form = form});
    EXPECT_EQ(answer.outcome(), "200") << query << " " << form;
    return answer.json();
}

std::string Front::entriesOf(int playlist) const {
    return ::json::titlesOf(
        get("action=playlist&limit=500&id=" + std::to_string(playlist))["entries"]);
}

}  // namespace web_test
