#include "content_directory.h"

#include <json/reader.h>
#include <json/writer.h>
#include <vorelix/upnp/dmagent.h>

#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <functional>
#include <iterator>
#include <memory>
#include <sstream>
#include <thread>
#include <utility>

#include "child_process.h"
#include "device_description.h"
#include "guarded_agent.h"
#include "text.h"

namespace vorelix {

namespace {

constexpr int kTries = 3;
constexpr std::chrono::milliseconds kFirstPause{250};
constexpr int kGraceMs = 1000;       // for what is left to do when an answer is there
constexpr size_t kLongestId = 3000;  // the request has 4095 bytes for everything
constexpr size_t kShownBytes = 160;

/* The failures of a transfer, by libcurl's number. */
struct TransferFailure {
    const char *text;
    int code;
    bool mayPass;
};
constexpr TransferFailure kTransferFailures[] = {
    {"libcurl is not installed here", -1, false},
    {"it does not speak HTTP, or its address is no http:// one", 1, false},
    {"its address is malformed", 3, false},
    {"its name is not known", 6, false},
    {"it refused the connection", 7, true},
    {"it does not speak HTTP", 8, false},
    {"it closed the connection in the middle of the answer", 18, true},
    {"it closed the connection without an answer", 52, true},
    {"the connection broke", 55, true},
    {"the connection broke", 56, true},
};

/* What a child sends of an answer. */
struct Received {
    int transfer = 0;
    unsigned int bytes = 0;
    std::string start;
    Json::Value reading;
};

std::string excerpt(const std::string &start) {
    const std::string shown = printable(start.substr(0, kShownBytes));
    return "'" + shown + (start.size() > kShownBytes ? "…'" : "'");
}

std::string sentText(unsigned int bytes, const std::string &start) {
    return bytes == 0 ? "it sent nothing"
                      : "it sent " + std::to_string(bytes) + " bytes: " + excerpt(start);
}

Json::Value valuesObject(const Values &values) {
    Json::Value object(Json::objectValue);
    for (const auto &[key, value] : values) {
        object[key] = value;
    }
    return object;
}

Values valuesOf(const Json::Value &object) {
    Values values;
    for (const std::string &key : object.getMemberNames()) {
        values.emplace(key, object[key].asString());
    }
    return values;
}

Json::Value documentOf(const BrowseAnswer &answer) {
    Json::Value document(Json::objectValue);
    document["kind"] = static_cast<int>(answer.kind);
    document["total"] = answer.total;
    document["lost"] = answer.lost;
    document["repaired"] = answer.isRepaired;
    document["faultCode"] = answer.faultCode;
    document["faultText"] = validUtf8(answer.faultText);
    Json::Value &objects = document["objects"] = Json::Value(Json::arrayValue);
    for (const MediaObject &object : answer.objects) {
        Json::Value &row = objects.append(Json::Value(Json::objectValue));
        row["container"] = object.isContainer;
        row["values"] = valuesObject(object.values);
        for (const Values &resource : object.resources) {
            row["resources"].append(valuesObject(resource));
        }
    }
    return document;
}

BrowseAnswer answerOf(const Json::Value &document) {
    BrowseAnswer answer;
    answer.kind = static_cast<BrowseAnswer::Kind>(document["kind"].asInt());
    answer.total = document["total"].asInt();
    answer.lost = document["lost"].asInt();
    answer.isRepaired = document["repaired"].asBool();
    answer.faultCode = document["faultCode"].asInt();
    answer.faultText = document["faultText"].asString();
    for (const Json::Value &row : document["objects"]) {
        MediaObject &object = answer.objects.emplace_back();
        object.isContainer = row["container"].asBool();
        object.values = valuesOf(row["values"]);
        for (const Json::Value &resource : row["resources"]) {
            object.resources.push_back(valuesOf(resource));
        }
    }
    return answer;
}

/* In the child: performs the request and writes what `read` makes of the body. */
void ask(DMAgent &agent, int pipe, int timeoutMs,
         const std::function<Json::Value(const std::string &)> &read) {
    Json::Value document(Json::objectValue);
    document["transfer"] = performGuarded(agent, pipe, timeoutMs);
    const std::string body = agent.response != nullptr ? agent.response : "";
    document["bytes"] = agent.responseSize;
    document["start"] = validUtf8(body.substr(0, 2 * kShownBytes));
    document["reading"] = read(body);
    Json::StreamWriterBuilder writer;
    writer["indentation"] = "";
    writeWhole(pipe, Json::writeString(writer, document));
}

bool readDocument(const std::string &text, Received &received) {
    Json::Value document;
    std::istringstream stream(text);
    if (!Json::parseFromStream(Json::CharReaderBuilder(), stream, &document, nullptr)) {
        return false;
    }
    received.transfer = document["transfer"].asInt();
    received.bytes = document["bytes"].asUInt();
    received.start = document["start"].asString();
    received.reading = document["reading"];
    return true;
}

[[noreturn]] void fail(const ServerAddress &server, const std::string &cause, bool mayPass) {
    throw ServerFailure(shownServer(server) + ": " + cause, mayPass);
}

[[noreturn]] void failOfChild(const ServerAddress &server, const ChildAnswer &answer,
                              int timeoutMs) {
    LateAnswer late;
    readLateAnswer(answer.text, late);
    if (answer.end == ChildAnswer::End::Died) {
        fail(server, "its answer could not be read: it took all memory, or the reader crashed",
             false);
    }
    const std::string cause =
        late.isTooLarge() ? "its answer is larger than " + std::to_string(kMostMebibytes) + " MiB"
                          : "no whole answer in " + std::to_string(timeoutMs / 1000) +
                                " s (--timeout gives it more)";
    fail(server, cause + "; " + sentText(late.bytes, late.start), false);
}

/* The answer, read; a failed transfer may leave one too. */
Received receive(const ServerAddress &server, int timeoutMs,
                 const std::function<void(int pipe)> &work) {
    const ChildAnswer answer = runInChild(work, timeoutMs + kGraceMs);
    Received received;
    if (answer.end != ChildAnswer::End::Finished || !readDocument(answer.text, received)) {
        failOfChild(server, answer, timeoutMs);
    }
    if (received.transfer == 0) {
        return received;
    }
    const auto *row = std::find_if(
        std::begin(kTransferFailures), std::end(kTransferFailures),
        [&](const TransferFailure &failure) { return failure.code == received.transfer; });
    const bool isKnown = row != std::end(kTransferFailures);
    std::string cause =
        isKnown ? row->text
                : "the transfer failed (libcurl's error " + std::to_string(received.transfer) + ")";
    if (received.bytes > 0) {
        cause += "; " + sentText(received.bytes, received.start);
    }
    fail(server, cause, isKnown && row->mayPass);
}

/* Errors that say no more than "not now". */
bool isBusy(int faultCode) {
    constexpr int kActionFailed = 501;
    constexpr int kOutOfMemory = 603;
    constexpr int kCannotProcess = 720;
    return faultCode == 0 || faultCode == kActionFailed || faultCode == kOutOfMemory ||
           faultCode == kCannotProcess;
}

BrowseAnswer checked(const ServerAddress &server, const Received &received) {
    BrowseAnswer answer = answerOf(received.reading);
    if (answer.kind == BrowseAnswer::Kind::Fault) {
        const std::string code =
            answer.faultCode != 0 ? "error " + std::to_string(answer.faultCode) : "an error";
        const std::string text = printable(answer.faultText);
        fail(server, "it answered with " + code + (text.empty() ? "" : " (" + text + ")"),
             isBusy(answer.faultCode));
    }
    if (answer.kind == BrowseAnswer::Kind::Unusable) {
        fail(server,
             "what it answered is no list of objects; " + sentText(received.bytes, received.start),
             true);
    }
    return answer;
}

/* The library puts it into the request as it is. */
std::string escaped(const std::string &id) {
    std::string out;
    for (const char character : id) {
        switch (character) {
            case '&':
                out += "&amp;";
                break;
            case '<':
                out += "&lt;";
                break;
            case '>':
                out += "&gt;";
                break;
            default:
                out += character;
        }
    }
    return out;
}

template <typename Request>
auto retried(const Request &request) {
    for (int i = 1; i < kTries; ++i) {
        try {
            return request();
        } catch (const ServerFailure &failure) {
            if (!failure.mayPass()) {
                throw;
            }
        }
        std::this_thread::sleep_for(kFirstPause * i);
    }
    return request();
}

}  // namespace

std::string shownServer(const ServerAddress &server) {
    const std::string url = printable(server.controlUrl);
    return server.name.empty() ? url : "'" + printable(server.name) + "' at " + url;
}

ContentDirectory::ContentDirectory(ServerAddress server, int timeoutMs)
    : server_(std::move(server)), timeoutMs_(timeoutMs) {}

BrowseAnswer ContentDirectory::children(const std::string &id, int start, int count) const {
    const std::string sentId = escaped(id);
    if (sentId.size() > kLongestId) {
        fail(server_, "an id of " + std::to_string(id.size()) + " bytes has no room in a request",
             false);
    }
    // Made here, libcurl is loaded once and not by every child.
    DMABrowse browse(DMAGENT_BROWSE_DIRECTCHILDREN, server_.controlUrl);
    browse.objectID = sentId;
    browse.startingIndex = start;
    browse.requestedCount = count;
    const auto work = [&](int pipe) {
        ask(browse, pipe, timeoutMs_,
            [](const std::string &body) { return documentOf(readBrowseAnswer(body)); });
    };
    return retried([&] { return checked(server_, receive(server_, timeoutMs_, work)); });
}

ContentDirectory::Capabilities ContentDirectory::capabilities() const {
    const auto get = [&](DMAGENT_ACTION action, const char *element) {
        return retried([&] {
            const Received received = receive(server_, timeoutMs_, [&](int pipe) {
                DMAGet agent(action, server_.controlUrl);
                ask(agent, pipe, timeoutMs_, [&](const std::string &body) {
                    return Json::Value(textOfElement(body, element).value_or(""));
                });
            });
            std::string text = received.reading.asString();
            if (text.empty() && received.start.find(element) == received.start.npos) {
                fail(server_,
                     "it does not answer " + std::string(szSOAPAction[action]) + "; " +
                         sentText(received.bytes, received.start),
                     false);
            }
            return text;
        });
    };
    return {get(DMAGENT_ACTION_GETSEARCHCAPABILITIES, "SearchCaps"),
            get(DMAGENT_ACTION_GETSORTCAPABILITIES, "SortCaps"),
            get(DMAGENT_ACTION_GETSYSTEMUPDATEID, "Id")};
}

}  // namespace vorelix
