#include "state_options.h"

#include <CLI/CLI.hpp>
#include <limits>

#include "option_checks.h"
#include "text.h"

namespace vorelix {

namespace {

constexpr int kKeyCount = 4;

CLI::Option *addName(CLI::App &app, const char *name, Request &request,
                     const std::string &description) {
    return app.add_option(name, request.state.name, description)->type_name("")->check(notEmpty());
}

CLI::Option *addNumber(CLI::App &app, Request &request, int most, const std::string &description) {
    return app.add_option("N", request.state.number, description)
        ->type_name("")
        ->transform(wholeNumber(1, most));
}

CLI::Validator utf8() {
    return {[](std::string &text) {
                return validUtf8(text) == text ? std::string() : "it is not UTF-8";
            },
            ""};
}

}  // namespace

void addQueueFile(CLI::App &app, Request &request) {
    addName(app, "FILE", request, "The file of the queue")->required();
}

void addOptionalSetting(CLI::App &app, Request &request) {
    addName(app, "KEY", request, "A setting; all of them if not given");
}

void addSetting(CLI::App &app, Request &request) {
    addName(app, "KEY", request, "Which setting")->required();
    app.add_option("VALUE", request.state.value, "What it becomes")->required()->type_name("");
}

void addOptionalKey(CLI::App &app, Request &request) {
    addNumber(app, request, kKeyCount, "A key, from 1 to 4; all of them if not given");
}

void addKey(CLI::App &app, Request &request) {
    addNumber(app, request, kKeyCount, "Which key, from 1 to 4")->required();
    StateRequest &state = request.state;
    auto *texts = app.add_option_group("Texts", "Those that are not given stay");
    const auto add = [texts](const char *name, auto &text, const char *description) {
        texts->add_option(name, text, description)->type_name("TEXT")->check(utf8());
    };
    add("--type", state.type, "Its type");
    add("--value", state.keyValue, "Its value");
    add("--title", state.title, "Its title");
    texts->require_option(1, 3);
}

void addTrackNumber(CLI::App &app, Request &request) {
    addNumber(app, request, std::numeric_limits<int>::max(), "Which track, from 1")->required();
}

void addIPodPlaylist(CLI::App &app, Request &request) {
    addName(app, "PLAYLIST", request, "Its title or path")->required();
}

}  // namespace vorelix
