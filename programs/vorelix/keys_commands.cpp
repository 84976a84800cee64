/* keys get and set.
 *
 * The library sets a key by rewriting the file in place, and locks nothing. So the new contents are
 * made here as the library would write them, and put in its place by a draft. */
#include <json/reader.h>
#include <json/writer.h>
#include <vorelix/player/custom_key.h>

#include "commands.h"
#include "failure.h"
#include "file_draft.h"
#include "json.h"
#include "system_paths_internal.h"
#include "table.h"
#include "text.h"

namespace vorelix {

namespace {

constexpr int kKeyCount = 4;
constexpr mode_t kNewFileMode = 0666;
constexpr const char *kPath = ZANO_PATH_CUSTOM_KEYS;

struct CustomKey {
    int number = 0;
    std::string type;
    std::string value;
    std::string title;
};

[[noreturn]] void throwOtherShape(const char *tried) {
    throw Failure(std::string("could not ") + tried + " the custom keys: " + printable(kPath) +
                  " cannot be read, or is not such a file; correct or delete it");
}

CustomKey readKey(int number) {
    CustomKey key{number, "", "", ""};
    if (ZANOAudioCustomGet(number, key.type, key.value, key.title) != 0) {
        throwOtherShape("read");
    }
    return key;
}

std::string documentOfKeys(const std::vector<CustomKey> &keys) {
    Json::Value answer(Json::objectValue);
    Json::Value &rows = answer["keys"] = Json::Value(Json::arrayValue);
    for (const CustomKey &each : keys) {
        Json::Value &row = rows.append(Json::Value(Json::objectValue));
        row["key"] = each.number;
        row["type"] = validUtf8(each.type);
        row["value"] = validUtf8(each.value);
        row["title"] = validUtf8(each.title);
    }
    return documentOf(answer);
}

Outcome answerOf(const std::vector<CustomKey> &keys, const Request &request,
                 const Terminal &terminal) {
    if (request.json) {
        return {documentOfKeys(keys), ""};
    }
    Table table({{.header = "Key", .right = true},
                 {.header = "Type", .cut = true},
                 {.header = "Value", .cut = true},
                 {.header = "Title", .cut = true}});
    for (const CustomKey &each : keys) {
        table.addRow({std::to_string(each.number), each.type, each.value, each.title});
    }
    return {table.render(terminal), ""};
}

bool isObjectOrMissing(const Json::Value &value) {
    return value.isObject() || value.isNull();
}

/* The element of a key, which is made where there is none. */
Json::Value &elementOf(Json::Value &root, int number) {
    const auto index = static_cast<Json::ArrayIndex>(number - 1);
    if (!isObjectOrMissing(root) || !(root["items"].isNull() || root["items"].isArray()) ||
        !isObjectOrMissing(root["items"][index])) {
        throwOtherShape("set");
    }
    return root["items"][index];
}

/* Those texts that were given. */
void setTexts(const StateRequest &wanted, Json::Value &element) {
    const struct {
        const char *name;
        const std::optional<std::string> &text;
    } texts[] = {{"type", wanted.type}, {"value", wanted.keyValue}, {"title", wanted.title}};
    for (const auto &each : texts) {
        Json::Value &member = element[each.name];
        if (each.text) {
            member = *each.text;
        } else if (!member.isString()) {
            member = "";
        }
    }
}

std::string withoutComments(const Json::Value &value) {
    Json::StreamWriterBuilder builder;
    builder["commentStyle"] = "None";
    return Json::writeString(builder, value);
}

/* The file with a key set. */
std::string contentsWith(const StateRequest &wanted) {
    Json::Value root;
    if (ZANOAudioCustomLoadJson(root) != 0) {
        throwOtherShape("set");
    }
    setTexts(wanted, elementOf(root, wanted.number));
    std::string text = Json::StyledWriter().write(root);
    Json::Value again;
    if (!Json::Reader().parse(text, again) || withoutComments(again) != withoutComments(root)) {
        throw Failure("could not set the custom keys: " + printable(kPath) +
                      " holds what would be lost; correct or delete it");
    }
    return text;
}

}  // namespace

Outcome keysGetCommand(const Request &request, const Terminal &terminal) {
    const int only = request.state.number;
    std::vector<CustomKey> keys;
    for (int number = only == 0 ? 1 : only; number <= (only == 0 ? kKeyCount : only); ++number) {
        keys.push_back(readKey(number));
    }
    return answerOf(keys, request, terminal);
}

Outcome keysSetCommand(const Request &request, const Terminal &terminal) {
    const Deadline deadline = deadlineOf(request.playlist.waitSeconds);
    FileDraft draft(withoutLinks(kPath), deadline);
    draft.replace(deadline, [&] {
        draft.fill(contentsWith(request.state));
        draft.complete(modeOfNewFile(kNewFileMode));
        return true;
    });
    return answerOf({readKey(request.state.number)}, request, terminal);
}

}  // namespace vorelix
