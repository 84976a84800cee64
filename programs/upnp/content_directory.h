/* The requests to a media server. Each runs in a child process and ends in time, whatever the
 * server sends. */
#pragma once

#include <stdexcept>
#include <string>

#include "answer_reader.h"

namespace vorelix {

/* Where a server is asked, and what to call it in messages. */
struct ServerAddress {
    std::string name;        // "" when only its address is known
    std::string controlUrl;  // of its ContentDirectory
};

/* 'Name' at http://... as it is shown to the user. */
std::string shownServer(const ServerAddress &server);

/* A server gave no answer that is of use; what() says which and what it sent. */
class ServerFailure : public std::runtime_error {
  public:
    ServerFailure(const std::string &what, bool mayPass)
        : std::runtime_error(what), mayPass_(mayPass) {}

    /* True when the same request may have an answer a little later: the server was busy. */
    bool mayPass() const { return mayPass_; }

  private:
    bool mayPass_;
};

class ContentDirectory {
  public:
    /* Each request has `timeoutMs` and is tried up to three times while the server is busy. */
    ContentDirectory(ServerAddress server, int timeoutMs);

    /* What is in a container, from its object number `start`; the server may give less than `count`
     * objects, or more. Throws ServerFailure. */
    BrowseAnswer children(const std::string &id, int start, int count) const;

    struct Capabilities {
        std::string search;  // names of properties, with commas; "" when it cannot search
        std::string sort;
        std::string updateId;  // "" when the server does not tell
    };
    /* Throws ServerFailure. */
    Capabilities capabilities() const;

    const ServerAddress &server() const { return server_; }

  private:
    ServerAddress server_;
    int timeoutMs_;
};

}  // namespace vorelix
