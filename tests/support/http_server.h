/* An HTTP server that does what a test tells it to, for one connection at a time.
 *
 * It listens on a free port of the loopback interface, in a thread of its own, until it is
 * destroyed: that ends whatever it is doing. */
#pragma once

#include <atomic>
#include <functional>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

namespace http_server {

enum class Then {
    Close,  // the connection
    Wait,   // until the client closes it
    Repeat  // the bytes, until the client closes it
};

struct Reply {
    std::string bytes;
    Then then = Then::Close;
};

/* A body with a status line, header lines of its own ("X: y\r\n") and its length. */
Reply reply(const std::string &body, const std::string &status = "200 OK",
            const std::string &lines = "");

class Server {
  public:
    /* The reply to each request, which is given whole. */
    explicit Server(std::function<Reply(const std::string &request)> script);
    explicit Server(const Reply &always);
    ~Server();
    Server(const Server &) = delete;
    Server &operator=(const Server &) = delete;

    /* "http://127.0.0.1:PORT" and a path. */
    std::string url(const std::string &path = "/control") const;

    /* The requests so far, byte for byte. */
    std::vector<std::string> requests() const;

    /* Bytes that were written so far. */
    unsigned long sent() const { return sent_; }

  private:
    void serve();
    bool isReady(int file, short events) const;
    std::string readRequest(int connection) const;
    void answer(int connection, const Reply &reply);

    std::function<Reply(const std::string &)> script_;
    int listener_;
    int stop_;
    int port_ = 0;
    std::atomic<unsigned long> sent_ = 0;
    mutable std::mutex mutex_;
    std::vector<std::string> requests_;
    std::thread thread_;
};

}  // namespace http_server
