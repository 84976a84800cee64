#include "support/http_server.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <stdexcept>

#include "support/loopback.h"

namespace http_server {

namespace {

/* The length that the header promises; 0 when it promises none. */
size_t bodyLength(const std::string &header) {
    constexpr const char *kName = "\r\nContent-Length: ";
    const size_t place = header.find(kName);
    return place == std::string::npos ? 0 : std::strtoul(header.c_str() + place + 18, nullptr, 10);
}

}  // namespace

Reply reply(const std::string &body, const std::string &status, const std::string &lines) {
    return {"HTTP/1.1 " + status + "\r\n" + lines +
            "Content-Length: " + std::to_string(body.size()) + "\r\n\r\n" + body};
}

Server::Server(std::function<Reply(const std::string &)> script)
    : script_(std::move(script)),
      listener_(socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0)),
      stop_(eventfd(0, EFD_CLOEXEC)) {
    port_ = loopback::bindToFreePort(listener_);
    if (listen(listener_, 16) != 0) {
        throw std::runtime_error("no server on the loopback interface");
    }
    thread_ = std::thread([this] { serve(); });
}

Server::Server(const Reply &always) : Server([always](const std::string &) { return always; }) {}

Server::~Server() {
    eventfd_write(stop_, 1);
    thread_.join();
    close(listener_);
    close(stop_);
}

std::string Server::url(const std::string &path) const {
    return "http://127.0.0.1:" + std::to_string(port_) + path;
}

std::vector<std::string> Server::requests() const {
    const std::lock_guard<std::mutex> lock(mutex_);
    return requests_;
}

/* False when the server is to stop. */
bool Server::isReady(int file, short events) const {
    pollfd files[] = {{file, events, 0}, {stop_, POLLIN, 0}};
    return poll(files, 2, -1) > 0 && files[1].revents == 0;
}

std::string Server::readRequest(int connection) const {
    std::string request;
    size_t wanted = 0;
    char part[4096];
    while ((wanted == 0 || request.size() < wanted) && isReady(connection, POLLIN)) {
        const ssize_t got = recv(connection, part, sizeof part, 0);
        if (got <= 0) {
            break;
        }
        request.append(part, static_cast<size_t>(got));
        const size_t end = request.find("\r\n\r\n");
        if (wanted == 0 && end != std::string::npos) {
            wanted = end + 4 + bodyLength(request);
        }
    }
    return request;
}

void Server::answer(int connection, const Reply &reply) {
    do {
        for (size_t done = 0; done < reply.bytes.size();) {
            if (!isReady(connection, POLLOUT)) {
                return;
            }
            const ssize_t count = send(connection, reply.bytes.data() + done,
                                       reply.bytes.size() - done, MSG_NOSIGNAL | MSG_DONTWAIT);
            if (count < 0) {
                return;
            }
            done += static_cast<size_t>(count);
            sent_ += static_cast<unsigned long>(count);
        }
    } while (reply.then == Then::Repeat);
    if (reply.then == Then::Wait) {
        isReady(connection, POLLIN);
    }
}

void Server::serve() {
    while (isReady(listener_, POLLIN)) {
        const int connection = accept4(listener_, nullptr, nullptr, SOCK_CLOEXEC);
        const std::string request = readRequest(connection);
        {
            const std::lock_guard<std::mutex> lock(mutex_);
            requests_.push_back(request);
        }
        answer(connection, script_(request));
        // Or what the client still sends turns the end into a reset.
        shutdown(connection, SHUT_WR);
        close(connection);
    }
}

}  // namespace http_server
