#include <zanoplatform/unicode.h>

#include <algorithm>
#include <set>

#include "commands.h"
#include "discovery.h"
#include "failure.h"
#include "json.h"
#include "object_listing.h"
#include "paging.h"
#include "table.h"
#include "text.h"
#include "upnp_answers.h"

namespace vorelix {

namespace {

constexpr int kMsPerSecond = 1000;
constexpr size_t kMostTreeObjects = 10000;

int timeoutMs(const Request &request) {
    return request.upnp.timeoutSeconds * kMsPerSecond;
}

std::vector<FoundServer> serversOf(const Request &request) {
    return discoverServers(request.upnp.interface, request.upnp.waitSeconds * kMsPerSecond,
                           timeoutMs(request));
}

std::string nameOf(const FoundServer &server) {
    return server.description.name.empty() ? server.url : server.description.name;
}

ServerAddress addressOf(const FoundServer &server) {
    return {server.description.name, server.description.controlUrl};
}

/* The one server of this name or id. */
ServerAddress serverNamed(const std::string &name, const Request &request) {
    std::vector<FoundServer> named;
    std::string names;
    for (const FoundServer &server : serversOf(request)) {
        const bool isIt =
            KLIBCUnicodeUTF8StrCaseCmp(server.description.name.c_str(), name.c_str()) == 0 ||
            server.description.id == name;
        if (isIt && server.complaint.empty()) {
            named.push_back(server);
        }
        names += (names.empty() ? "'" : ", '") + printable(nameOf(server)) + "'";
    }
    if (named.size() == 1) {
        return addressOf(named.front());
    }
    const std::string shown = "'" + printable(name) + "'";
    if (!named.empty()) {
        throw Failure("there are " + std::to_string(named.size()) + " media servers " + shown +
                      "; name one by its id: vorelix upnp servers --json");
    }
    throw Failure("there is no media server " + shown + " in the network; " +
                  (names.empty() ? "none answered, a longer --wait or an --interface may help"
                                 : "there are " + names));
}

/* An address that has no description is taken for the one of control. */
ServerAddress serverOf(const Request &request) {
    const std::string &server = request.upnp.server;
    if (!isWebAddress(server)) {
        return serverNamed(server, request);
    }
    const FoundServer found = describeServer(server, timeoutMs(request));
    if (found.isLate) {
        throw Failure(printable(server) + ": " + found.complaint);
    }
    return found.complaint.empty() ? addressOf(found) : ServerAddress{"", server};
}

/* What the servers do not give is no failure of the program, but one of the command. */
template <typename Answer>
Outcome asked(const Answer &answer) {
    try {
        return answer();
    } catch (const ServerFailure &failure) {
        throw Failure(failure.what());
    }
}

std::string withLost(const std::string &complaint, int lost, const ServerAddress &server) {
    return complaint.empty() && lost > 0 ? shownServer(server) + ": " + lostText(lost) : complaint;
}

Outcome documentOfServers(const std::vector<FoundServer> &servers, const std::string &complaint) {
    Json::Value answer(Json::objectValue);
    answer["servers"] = Json::Value(Json::arrayValue);
    answer["failed"] = Json::Value(Json::arrayValue);
    for (const FoundServer &server : servers) {
        Json::Value row(Json::objectValue);
        row["url"] = validUtf8(server.url);
        if (server.complaint.empty()) {
            row["name"] = validUtf8(server.description.name);
            row["model"] = validUtf8(server.description.model);
            row["id"] = validUtf8(server.description.id);
            row["controlUrl"] = validUtf8(server.description.controlUrl);
        } else {
            row["complaint"] = server.complaint;
        }
        answer[server.complaint.empty() ? "servers" : "failed"].append(row);
    }
    return {documentOf(answer), complaint};
}

std::string documentOfObjects(const Request &request, const ServerAddress &server,
                              const ObjectListing &listing) {
    Json::Value answer(Json::objectValue);
    answer["server"] = serverDocument(server);
    answer["id"] = request.upnp.object;
    Json::Value &objects = answer["objects"] = Json::Value(Json::arrayValue);
    for (const MediaObject &object : listing.objects) {
        objects.append(objectDocument(object));
    }
    answer["lost"] = listing.lost;
    answer["repaired"] = listing.isRepaired;
    return documentOf(withSpan(answer, request.span, listing.total));
}

std::string summaryOf(const Request &request, const ObjectListing &listing) {
    const int shown = static_cast<int>(listing.objects.size()) + listing.lost;
    if (request.upnp.all && shown == kMostObjects) {
        return std::to_string(shown) + " objects, the most that are listed";
    }
    if (listing.total == 0 || request.upnp.all) {
        return shown == 0 ? "no objects" : std::to_string(shown) + " objects";
    }
    return pageLine("objects", request, shown, listing.total);
}

struct TreeObject {
    MediaObject object;
    int depth;
};

/* What is below a container, in the order of a walk; a container that is its own ancestor is not
 * entered again. */
class Tree {
  public:
    Tree(const ContentDirectory &directory, int depth) : directory_(directory), depth_(depth) {}

    void walk(const std::string &id, int depth) {
        seen_.insert(id);
        const ObjectListing listing =
            listObjects(directory_, id, 0, static_cast<int>(kMostTreeObjects - objects.size()));
        lost += listing.lost;
        complain(listing.complaint);
        for (const MediaObject &object : listing.objects) {
            if (objects.size() == kMostTreeObjects) {
                complain("stopped at " + std::to_string(kMostTreeObjects) + " objects");
                return;
            }
            objects.push_back({object, depth});
            const bool isNew = object.isContainer && seen_.count(object.value("id")) == 0;
            if (isNew && depth < depth_) {
                enter(object, depth + 1);
            }
        }
    }

    std::vector<TreeObject> objects;
    int lost = 0;
    std::string complaint;

  private:
    /* One container that fails does not cost the others. */
    void enter(const MediaObject &container, int depth) {
        try {
            walk(container.value("id"), depth);
        } catch (const ServerFailure &failure) {
            complain("'" + printable(shownTitle(container)) + "': " + failure.what());
        }
    }

    void complain(const std::string &text) {
        if (complaint.empty()) {
            complaint = text;
        }
    }

    const ContentDirectory &directory_;
    int depth_;
    std::set<std::string> seen_;
};

std::string documentOfTree(const Request &request, const ServerAddress &server, const Tree &tree) {
    Json::Value answer(Json::objectValue);
    answer["server"] = serverDocument(server);
    answer["id"] = request.upnp.object;
    Json::Value &objects = answer["objects"] = Json::Value(Json::arrayValue);
    for (const auto &[object, depth] : tree.objects) {
        objects.append(objectDocument(object))["depth"] = depth;
    }
    answer["lost"] = tree.lost;
    return documentOf(answer);
}

std::string linesOfTree(const Tree &tree) {
    std::string text;
    for (const auto &[object, depth] : tree.objects) {
        constexpr size_t kIndent = 2;
        text += std::string(kIndent * static_cast<size_t>(depth - 1), ' ') +
                printable(shownTitle(object)) + (object.isContainer ? "/" : "") + "\n";
    }
    return text.empty() ? "no objects\n" : text;
}

/* Names with commas between them, each by itself. */
std::vector<std::string> namesOf(const std::string &list) {
    std::vector<std::string> names;
    for (size_t start = 0; start < list.size();) {
        const size_t end = std::min(list.find(',', start), list.size());
        names.push_back(list.substr(start, end - start));
        start = end + 1;
    }
    return names;
}

Json::Value arrayOf(const std::vector<std::string> &names) {
    Json::Value array(Json::arrayValue);
    for (const std::string &name : names) {
        array.append(validUtf8(name));
    }
    return array;
}

std::string lineOf(const std::vector<std::string> &names) {
    std::string line;
    for (const std::string &name : names) {
        line += (line.empty() ? "" : ", ") + printable(name);
    }
    return line.empty() ? "-" : line;
}

}  // namespace

Outcome upnpServersCommand(const Request &request, const Terminal &terminal) {
    const std::vector<FoundServer> servers = serversOf(request);
    Table table({{.header = "Name", .cut = true},
                 {.header = "Model", .cut = true, .rank = 1},
                 {.header = "Control"}});
    std::string complaint;
    for (const FoundServer &server : servers) {
        if (server.complaint.empty()) {
            table.addRow(
                {server.description.name, server.description.model, server.description.controlUrl});
        } else {
            complaint +=
                (complaint.empty() ? "" : "; ") + printable(server.url) + ": " + server.complaint;
        }
    }
    if (request.json) {
        return documentOfServers(servers, complaint);
    }
    if (servers.empty()) {
        return {"no media servers answered; a longer --wait or an --interface may help\n", ""};
    }
    return {table.render(terminal), complaint};
}

Outcome upnpBrowseCommand(const Request &request, const Terminal &terminal) {
    Request asking = request;
    if (asking.upnp.all) {
        asking.span = {0, kMostObjects};
    }
    return asked([&]() -> Outcome {
        const ContentDirectory directory(serverOf(asking), timeoutMs(asking));
        const ObjectListing listing =
            listObjects(directory, asking.upnp.object, asking.span.offset, asking.span.limit);
        const std::string complaint = withLost(listing.complaint, listing.lost, directory.server());
        if (asking.json) {
            return {documentOfObjects(asking, directory.server(), listing), complaint};
        }
        const std::string table =
            listing.objects.empty() ? "" : objectTable(listing.objects, terminal) + "\n";
        return {table + summaryOf(asking, listing) + "\n", complaint};
    });
}

Outcome upnpCapsCommand(const Request &request, const Terminal &) {
    return asked([&]() -> Outcome {
        const ContentDirectory directory(serverOf(request), timeoutMs(request));
        const ContentDirectory::Capabilities capabilities = directory.capabilities();
        const std::vector<std::string> search = namesOf(capabilities.search);
        const std::vector<std::string> sort = namesOf(capabilities.sort);
        if (request.json) {
            Json::Value answer(Json::objectValue);
            answer["server"] = serverDocument(directory.server());
            answer["search"] = arrayOf(search);
            answer["sort"] = arrayOf(sort);
            answer["updateId"] = validUtf8(capabilities.updateId);
            return {documentOf(answer), ""};
        }
        return {"Search by  " + lineOf(search) + "\nSort by    " + lineOf(sort) + "\nUpdate ID  " +
                    lineOf(namesOf(capabilities.updateId)) + "\n",
                ""};
    });
}

Outcome upnpTreeCommand(const Request &request, const Terminal &) {
    return asked([&]() -> Outcome {
        const ContentDirectory directory(serverOf(request), timeoutMs(request));
        Tree tree(directory, request.upnp.depth);
        tree.walk(request.upnp.object, 1);
        const std::string complaint = withLost(tree.complaint, tree.lost, directory.server());
        return {
            request.json ? documentOfTree(request, directory.server(), tree) : linesOfTree(tree),
            complaint};
    });
}

}  // namespace vorelix
