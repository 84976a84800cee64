/* Answers one request of the web interface, as a web server hands it to a CGI program. */
#include <cstdint>
#include <cstdio>
#include <exception>

#include "actions.h"

int main() {
    try {
        const webapi::Request request = webapi::readRequest();
        const std::string name = request.parameters.text("action", SIZE_MAX);
        const webapi::ActionKind &kind = webapi::actionNamed(name);
        kind.make(kind, request)->Process();
        return 0;
    } catch (const std::exception &) {  // out of memory, before anything was written
        std::fputs(
            "Status: 500 Internal Server Error\r\nContent-Type: application/json\r\n\r\n"
            "{\"success\":false}",
            stdout);
        return 1;
    }
}
