#include "upnp_answers.h"

#include <charconv>
#include <string_view>

#include "json.h"
#include "numbers.h"
#include "table.h"
#include "text.h"

namespace vorelix {

namespace {

constexpr int kSixty = 60;

std::string kindOf(const MediaObject &object) {
    constexpr struct {
        std::string_view prefix;
        const char *kind;
    } kKinds[] = {{"object.item.audioItem", "audio"},
                  {"object.item.videoItem", "video"},
                  {"object.item.imageItem", "image"}};
    if (object.isContainer) {
        return "folder";
    }
    for (const auto &row : kKinds) {
        if (object.value("class").starts_with(row.prefix)) {
            return row.kind;
        }
    }
    return "item";
}

std::string artistOf(const MediaObject &object) {
    const std::string artist = object.value("artist");
    return artist.empty() ? object.value("creator") : artist;
}

std::string durationOf(const MediaObject &object) {
    for (const Values &resource : object.resources) {
        const auto found = resource.find("duration");
        if (found != resource.end()) {
            return found->second;
        }
    }
    return object.value("duration");
}

Json::Value documentOfValues(const Values &values) {
    Json::Value document(Json::objectValue);
    for (const auto &[key, value] : values) {
        document[validUtf8(key)] = validUtf8(value);
    }
    return document;
}

}  // namespace

std::string shownTitle(const MediaObject &object) {
    const std::string title = object.value("title");
    return title.empty() ? object.value("id") : title;
}

std::string mediaTimeText(const std::string &duration) {
    double seconds = 0;
    const char *place = duration.data();
    const char *const end = place + duration.size();
    while (true) {
        double part = 0;
        const auto [rest, error] = std::from_chars(place, end, part);
        if (error != std::errc()) {
            return {};
        }
        seconds = seconds * kSixty + part;
        if (rest == end || *rest != ':') {
            return rest == end && seconds < 1e9 ? durationText(seconds) : "";
        }
        place = rest + 1;
    }
}

std::string objectTable(const std::vector<MediaObject> &objects, const Terminal &terminal) {
    Table table({{.header = "ID"},
                 {.header = "Kind", .rank = 4},
                 {.header = "Title", .cut = true},
                 {.header = "Artist", .cut = true, .rank = 1},
                 {.header = "Album", .cut = true, .rank = 2},
                 {.header = "Time", .right = true, .rank = 3}});
    for (const MediaObject &object : objects) {
        table.addRow({object.value("id"), kindOf(object), shownTitle(object), artistOf(object),
                      object.value("album"), mediaTimeText(durationOf(object))});
    }
    return table.render(terminal);
}

Json::Value objectDocument(const MediaObject &object) {
    Json::Value document(Json::objectValue);
    document["kind"] = object.isContainer ? "container" : "item";
    document["id"] = validUtf8(object.value("id"));
    document["title"] = validUtf8(object.value("title"));
    document["values"] = documentOfValues(object.values);
    Json::Value &resources = document["resources"] = Json::Value(Json::arrayValue);
    for (const Values &resource : object.resources) {
        resources.append(documentOfValues(resource));
    }
    return document;
}

Json::Value serverDocument(const ServerAddress &server) {
    Json::Value document(Json::objectValue);
    document["name"] = validUtf8(server.name);
    document["controlUrl"] = validUtf8(server.controlUrl);
    return document;
}

std::string lostText(int lost) {
    return lost == 0 ? ""
                     : std::to_string(lost) + (lost == 1 ? " object of it" : " objects of it") +
                           " could not be read";
}

}  // namespace vorelix
