#include <strings.h>
#include <vorelix/web/actionhandler.h>

#include <string>

namespace {

/* jsoncpp throws when a value of another shape is asked for a member. */
Json::Value &asObject(Json::Value &value) {
    if (!value.isObject()) {
        value = Json::Value(Json::objectValue);
    }
    return value;
}

}  // namespace

ActionHandler::ActionHandler() : output_(false) {}

ActionHandler::~ActionHandler() = default;

// NOLINTNEXTLINE(performance-unnecessary-value-param): the signature is given
void ActionHandler::PrintResponse(Json::Value value, const char *contentType) {
    output_.WriteHeader(contentType);
    output_.WriteBody(value);
}

void ActionHandler::SetError(Json::Value &value, const char *section, const char *key, int line) {
    Json::Value &error = asObject(asObject(value)["errno"]);
    error["section"] = section;
    error["key"] = key;
    error["line"] = line;
}

void ActionHandler::SetSuccess(Json::Value &value, bool success) {
    asObject(value)["success"] = success;
}

bool ActionHandler::CheckService() {
    Json::Value value;
    const std::string isOn = settings_.Info("runvorelix", "no");
    if (strcasecmp(isOn.c_str(), "yes") == 0) {
        return true;
    }
    SetSuccess(value, false);
    // Intended and kept: the one answer of the library itself goes as plain text.
    PrintResponse(value, "text/plain; charset=\"UTF-8\"");
    return false;
}
