#include "summary.h"

#include <json/json.h>
#include <array>
#include <cstdio>

#include "text.h"

namespace zano::index {
namespace {

struct CountRow {
    const char *name;
    const char *text;  // for people
    std::int64_t Summary::*count;
    bool isAlwaysShown;
};

constexpr std::array kCounts = {
    CountRow{"added", "added", &Summary::added, true},
    CountRow{"updated", "updated", &Summary::updated, true},
    CountRow{"unchanged", "unchanged", &Summary::unchanged, true},
    CountRow{"removed", "removed", &Summary::removed, true},
    CountRow{"kept", "kept", &Summary::kept, false},
    CountRow{"playlistsAdded", "playlists added", &Summary::playlistsAdded, false},
    CountRow{"playlistsRemoved", "playlists removed", &Summary::playlistsRemoved, false},
};

std::string percentEncoded(const std::string &bytes) {
    std::string out;
    for (const char c : bytes) {
        if (c > 0x20 && c < 0x7F && c != '%') {
            out.push_back(c);
        } else {
            std::array<char, 4> code{};
            std::snprintf(code.data(), code.size(), "%%%02X", static_cast<unsigned char>(c));
            out.append(code.data());
        }
    }
    return out;
}

Json::Value problemsJson(const std::vector<Problem> &problems) {
    Json::Value list(Json::arrayValue);
    for (const auto &problem : problems) {
        Json::Value item;
        item["path"] = toUtf8(problem.path);
        item["reason"] = problem.reason;
        if (!isUtf8(problem.path)) {
            item["pathBytes"] = percentEncoded(problem.path);
        }
        list.append(item);
    }
    return list;
}

Json::Value noticesJson(const std::vector<mediadb::Notice> &notices) {
    Json::Value list(Json::arrayValue);
    for (const auto &notice : notices) {
        Json::Value item;
        item["operation"] = notice.operation;
        item["path"] = toUtf8(notice.path);
        item["formerPath"] = toUtf8(notice.formerPath);
        list.append(item);
    }
    return list;
}

}  // namespace

std::string summaryText(const Summary &summary) {
    std::array<char, 32> seconds{};
    std::snprintf(seconds.data(), seconds.size(), "%.1f s", summary.seconds);
    std::string text = std::to_string(summary.files) + (summary.files == 1 ? " file" : " files") +
                       " in " + seconds.data();
    const char *separator = ": ";
    for (const auto &row : kCounts) {
        if (row.isAlwaysShown || summary.*row.count > 0) {
            text += separator + std::to_string(summary.*row.count) + " " + row.text;
            separator = ", ";
        }
    }
    if (!summary.failed.empty()) {
        text += ", " + std::to_string(summary.failed.size()) + " could not be read";
    }
    return text;
}

std::string summaryJson(const Summary &summary) {
    Json::Value root;
    root["files"] = Json::Int64{summary.files};
    for (const auto &row : kCounts) {
        root[row.name] = Json::Int64{summary.*row.count};
    }
    root["failed"] = problemsJson(summary.failed);
    root["folders"] = problemsJson(summary.folders);
    root["notices"] = noticesJson(summary.notices);
    root["seconds"] = summary.seconds;
    root["stopped"] = summary.isStopped;
    Json::StreamWriterBuilder builder;
    builder["indentation"] = "";
    builder["emitUTF8"] = true;
    builder["precision"] = 6;
    return Json::writeString(builder, root);
}

}  // namespace zano::index
