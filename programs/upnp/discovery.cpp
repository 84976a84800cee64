#include "discovery.h"

#include <json/reader.h>
#include <json/writer.h>
#include <miniupnpc/miniupnpc.h>
#include <miniupnpc/miniwget.h>
#include <miniupnpc/upnperrors.h>

#include <algorithm>
#include <cstdlib>
#include <memory>
#include <set>
#include <sstream>

#include "child_process.h"
#include "failure.h"
#include "text.h"

namespace vorelix {

namespace {

/* Two questions that the same servers answer, for the network may lose one. Each has half of the
 * time; answers to the first still count in the second half. */
constexpr const char *kQuestions[] = {"urn:schemas-upnp-org:device:MediaServer:1",
                                      "urn:schemas-upnp-org:service:ContentDirectory:1", nullptr};
constexpr int kTimeToLive = 2;
constexpr int kGraceMs = 2000;
constexpr std::size_t kMostServers = 256;

struct FreeDevices {
    void operator()(UPNPDev *devices) const { freeUPNPDevlist(devices); }
};
using Devices = std::unique_ptr<UPNPDev, FreeDevices>;

struct FreeText {
    void operator()(void *text) const { std::free(text); }
};

std::string asText(const Json::Value &document) {
    Json::StreamWriterBuilder writer;
    writer["indentation"] = "";
    return Json::writeString(writer, document);
}

Json::Value asDocument(const std::string &text) {
    Json::Value document;
    std::istringstream stream(text);
    Json::parseFromStream(Json::CharReaderBuilder(), stream, &document, nullptr);
    return document;
}

/* In the child: {"error": code, "urls": [...]}. */
void search(int pipe, const std::string &interface, int waitMs) {
    int error = 0;
    const Devices devices(
        upnpDiscoverDevices(kQuestions, waitMs / 2, interface.empty() ? nullptr : interface.c_str(),
                            nullptr, UPNP_LOCAL_PORT_ANY, 0, kTimeToLive, &error, 1));
    Json::Value document(Json::objectValue);
    document["error"] = error;
    std::set<std::string> urls;
    for (const UPNPDev *device = devices.get(); device != nullptr && urls.size() < kMostServers;
         device = device->pNext) {
        urls.insert(device->descURL);
    }
    for (const std::string &url : urls) {
        document["urls"].append(url);
    }
    writeWhole(pipe, asText(document));
}

/* In the child: the parts of a description, or "status", the one of HTTP, -1 without an answer. */
void fetch(int pipe, const std::string &url) {
    int size = 0;
    int status = -1;
    const std::unique_ptr<void, FreeText> body(miniwget(url.c_str(), &size, 0, &status));
    Json::Value document(Json::objectValue);
    document["status"] = status;
    if (body != nullptr && size > 0) {
        const std::string_view text(static_cast<const char *>(body.get()),
                                    static_cast<std::size_t>(size));
        if (const auto description = readDeviceDescription(text, url)) {
            document["name"] = description->name;
            document["model"] = description->model;
            document["id"] = description->id;
            document["controlUrl"] = description->controlUrl;
        }
    }
    writeWhole(pipe, asText(document));
}

std::string complaintAbout(bool isLate, const Json::Value &document, int timeoutMs) {
    constexpr int kFine = 200;
    if (isLate) {
        return "no whole answer in " + std::to_string(timeoutMs / 1000) + " s";
    }
    const int status = document.isObject() ? document["status"].asInt() : -1;
    if (status <= 0) {
        return "no answer";
    }
    return status == kFine ? "no description of a media server"
                           : "HTTP status " + std::to_string(status);
}

}  // namespace

FoundServer describeServer(const std::string &url, int timeoutMs) {
    const ChildAnswer answer = runInChild([&](int pipe) { fetch(pipe, url); }, timeoutMs);
    const Json::Value document = asDocument(answer.text);
    FoundServer found{url, {}, "", answer.end == ChildAnswer::End::TooLate};
    if (document.isObject() && document.isMember("controlUrl")) {
        found.description = {document["name"].asString(), document["model"].asString(),
                             document["id"].asString(), document["controlUrl"].asString()};
    } else {
        found.complaint = complaintAbout(found.isLate, document, timeoutMs);
    }
    return found;
}

std::vector<FoundServer> discoverServers(const std::string &interface, int waitMs, int timeoutMs) {
    const ChildAnswer answer =
        runInChild([&](int pipe) { search(pipe, interface, waitMs); }, waitMs + kGraceMs);
    const Json::Value document = asDocument(answer.text);
    if (!document.isObject() || document["error"].asInt() == UPNPDISCOVER_SOCKET_ERROR) {
        throw Failure("could not ask the network for media servers" +
                      (interface.empty() ? std::string() : " through " + printable(interface)) +
                      "; name a network interface of this machine with --interface, or give the "
                      "address of a server");
    }
    std::vector<FoundServer> servers;
    for (const Json::Value &url : document["urls"]) {
        if (isWebAddress(url.asString())) {
            servers.push_back(describeServer(url.asString(), timeoutMs));
        }
    }
    std::sort(servers.begin(), servers.end(), [](const FoundServer &a, const FoundServer &b) {
        return a.description.name < b.description.name;
    });
    return servers;
}

}  // namespace vorelix
