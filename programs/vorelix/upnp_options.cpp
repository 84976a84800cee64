#include "upnp_options.h"

#include <CLI/CLI.hpp>

#include "option_checks.h"

namespace vorelix {

namespace {

constexpr int kMostSeconds = 3600;
constexpr int kMostDepth = 100;

void addNumber(CLI::App &app, const char *name, int &number, const char *type, int most,
               const std::string &description) {
    app.add_option(name, number, description + "; " + std::to_string(number) + " if not given")
        ->type_name(type)
        ->transform(wholeNumber(1, most));
}

void addObject(CLI::App &app, UpnpRequest &request) {
    app.add_option("ID", request.object, "Id of a container; 0, the root, if not given")
        ->type_name("");
}

}  // namespace

void addNetwork(CLI::App &app, Request &request) {
    UpnpRequest &upnp = request.upnp;
    addNumber(app, "--wait", upnp.waitSeconds, "SECONDS", kMostSeconds,
              "How long to wait for servers to show up");
    addNumber(app, "--timeout", upnp.timeoutSeconds, "SECONDS", kMostSeconds,
              "How long to wait for one answer");
    app.add_option("--interface", upnp.interface,
                   "Name or address of the network interface to look for servers on")
        ->type_name("NAME");
}

void addMediaServer(CLI::App &app, Request &request) {
    app.add_option("SERVER", request.upnp.server,
                   "Its name or id, or the http:// address of its description or control")
        ->required()
        ->type_name("");
    addNetwork(app, request);
}

void addMediaContainer(CLI::App &app, Request &request) {
    addMediaServer(app, request);
    addObject(app, request.upnp);
    app.add_flag("--all", request.upnp.all, "All pages");
}

void addMediaTree(CLI::App &app, Request &request) {
    addMediaServer(app, request);
    addObject(app, request.upnp);
    addNumber(app, "--depth", request.upnp.depth, "N", kMostDepth, "How many levels");
}

}  // namespace vorelix
