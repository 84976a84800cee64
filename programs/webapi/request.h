/* What the web server says of a request, by the environment and standard input of a CGI program. */
#pragma once

#include <optional>
#include <string>

#include "parameters.h"
#include "refusal.h"

namespace webapi {

struct Request {
    std::string method;
    std::string user;  // whom the server has authenticated; "": nobody
    Parameters parameters;
    std::optional<Refusal> damage;  // why parameters are missing
    // Lines of the header as they came; "" for those that did not.
    std::string host;
    std::string origin;
    std::string fetchSite;
    std::string range;
    std::string ifRange;
};

/* Reads the body of a POST too. */
Request readRequest();

}  // namespace webapi
