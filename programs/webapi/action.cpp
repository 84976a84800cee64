#include "action.h"

#include <strings.h>
#include <vorelix/users/audiousers.h>
#include <algorithm>
#include <cstdio>
#include <iterator>

#include "failure.h"
#include "rights.h"

namespace webapi {

namespace {

constexpr const char *kJson = "application/json";

struct Reason {
    int status;
    const char *phrase;
};

constexpr Reason kReasons[] = {
    {kPartialContent, "Partial Content"},
    {kBadRequest, "Bad Request"},
    {kNoUser, "Unauthorized"},
    {kForbidden, "Forbidden"},
    {kNotFound, "Not Found"},
    {kWrongMethod, "Method Not Allowed"},
    {kConflict, "Conflict"},
    {kTooLarge, "Content Too Large"},
    {kNoSuchRange, "Range Not Satisfiable"},
    {kFailed, "Internal Server Error"},
};

struct FailedAs {
    vorelix::FailureKind kind;
    Status status;
    const char *key;
};

constexpr FailedAs kFailures[] = {
    {vorelix::FailureKind::kDatabase, kFailed, "database"},
    {vorelix::FailureKind::kNoSong, kNotFound, "songs"},
    {vorelix::FailureKind::kNoFile, kNotFound, "file"},
    {vorelix::FailureKind::kTaken, kConflict, "title"},
    {vorelix::FailureKind::kBusy, kConflict, "busy"},
    {vorelix::FailureKind::kOther, kFailed, "file"},
};

struct Method {
    const char *name;
    unsigned bit;
};

constexpr Method kMethods[] = {{"GET", kGet}, {"HEAD", kHead}, {"POST", kPost}};

bool isAllowed(const std::string &method, unsigned methods) {
    return std::any_of(std::begin(kMethods), std::end(kMethods), [&](const Method &row) {
        return (row.bit & methods) != 0 && method == row.name;
    });
}

std::string allowHeader(unsigned methods) {
    std::string line;
    for (const Method &row : kMethods) {
        if ((row.bit & methods) != 0) {
            line.append(line.empty() ? "Allow: " : ", ").append(row.name);
        }
    }
    return line + "\r\n";
}

/* A page of another site makes browsers send what it likes, with this site's password. They say
 * where it comes from; who does not say so is no browser. */
bool isFromThisSite(const Request &request) {
    if (!request.fetchSite.empty()) {
        return request.fetchSite == "same-origin";
    }
    if (request.origin.empty()) {
        return true;
    }
    const std::size_t scheme = request.origin.find("://");
    return scheme != std::string::npos &&
           strcasecmp(request.origin.c_str() + scheme + 3, request.host.c_str()) == 0;
}

const char *nameOf(unsigned right) {
    return std::find_if(std::begin(vorelix::kRights), std::end(vorelix::kRights),
                        [right](const vorelix::Right &row) { return row.bit == right; })
        ->name;
}

/* For the error log of the server. */
void report(const char *what) {
    std::fprintf(stderr, "webapi: %s\n", what);
}

Refusal refusalOf(const vorelix::Failure &failure) {
    const auto *row =
        std::find_if(std::begin(kFailures), std::end(kFailures),
                     [&](const FailedAs &each) { return each.kind == failure.kind(); });
    report(failure.what());
    return {row->status, row->key};
}

}  // namespace

void writeStatus(int status, const std::string &headers) {
    const auto *reason = std::find_if(std::begin(kReasons), std::end(kReasons),
                                      [status](const Reason &row) { return row.status == status; });
    if (reason != std::end(kReasons)) {
        std::printf("Status: %d %s\r\n", status, reason->phrase);
    }
    std::fputs(headers.c_str(), stdout);
}

void Action::Process() {
    if (!CheckService()) {
        return;
    }
    try {
        require();
        respond();
    } catch (const Refusal &refusal) {
        refuse(refusal);
    } catch (const vorelix::Failure &failure) {
        refuse(refusalOf(failure));
    } catch (const std::exception &error) {
        report(error.what());
        refuse({kFailed, "program"});
    }
}

void Action::require() const {
    if (request_.user.empty()) {
        throw Refusal(kNoUser, "user", "WWW-Authenticate: Basic realm=\"Vorelix\"\r\n");
    }
    if (!isAllowed(request_.method, kind_.methods)) {
        throw Refusal(kWrongMethod, "method", allowHeader(kind_.methods));
    }
    if (request_.method == "POST" && !isFromThisSite(request_)) {
        throw Refusal(kForbidden, "origin");
    }
    if (kind_.right != 0 && (AudioUsers::GetUserPermission(request_.user) & kind_.right) == 0) {
        throw Refusal(kForbidden, nameOf(kind_.right));
    }
    if (request_.damage) {
        throw Refusal(*request_.damage);
    }
}

void Action::refuse(const Refusal &refusal) {
    Json::Value envelope;
    SetSuccess(envelope, false);
    SetError(envelope, kind_.name, refusal.key(), refusal.line());
    writeStatus(refusal.status(), refusal.headers());
    PrintResponse(envelope, kJson);
}

void JsonAction::respond() {
    Json::Value envelope = answer();
    SetSuccess(envelope, true);
    PrintResponse(envelope, kJson);
}

}  // namespace webapi
