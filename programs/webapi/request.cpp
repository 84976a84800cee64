#include "request.h"

#include <strings.h>
#include <cstdio>
#include <cstdlib>

namespace webapi {

namespace {

constexpr int kMostBodyBytes = 1 << 20;

std::string environment(const char *name) {
    const char *value = std::getenv(name);
    return value != nullptr ? value : "";
}

/* Without what follows the type, a charset say: the form is UTF-8. */
bool isForm(const std::string &contentType) {
    constexpr std::string_view kForm = "application/x-www-form-urlencoded";
    const std::string type = contentType.substr(0, contentType.find_first_of("; "));
    return type.size() == kForm.size() && strcasecmp(type.c_str(), kForm.data()) == 0;
}

std::string readBody() {
    const std::string length = environment("CONTENT_LENGTH");
    int bytes = 0;
    if (!length.empty() && !readNumber(length, {0, kMostBodyBytes}, bytes)) {
        throw Refusal(kTooLarge, "body");
    }
    if (bytes > 0 && !isForm(environment("CONTENT_TYPE"))) {
        throw Refusal(kBadRequest, "body");
    }
    std::string body(static_cast<std::size_t>(bytes), '\0');
    if (std::fread(body.data(), 1, body.size(), stdin) != body.size()) {
        throw Refusal(kBadRequest, "body");
    }
    return body;
}

void readParameters(Request &request) {
    try {
        request.parameters.add(environment("QUERY_STRING"));
        if (request.method == "POST") {
            request.parameters.add(readBody());
        }
    } catch (const Refusal &refusal) {
        request.damage = refusal;
    }
}

}  // namespace

Request readRequest() {
    Request request;
    request.method = environment("REQUEST_METHOD");
    request.user = environment("REMOTE_USER");
    request.host = environment("HTTP_HOST");
    request.origin = environment("HTTP_ORIGIN");
    request.fetchSite = environment("HTTP_SEC_FETCH_SITE");
    request.range = environment("HTTP_RANGE");
    request.ifRange = environment("HTTP_IF_RANGE");
    readParameters(request);
    return request;
}

}  // namespace webapi
