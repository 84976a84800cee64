#include "playlist_input.h"

#include <json/reader.h>
#include <json/value.h>
#include <unistd.h>
#include <algorithm>
#include <cerrno>
#include <charconv>
#include <cstring>
#include <iostream>
#include <sstream>
#include <string_view>

#include "failure.h"
#include "text.h"

namespace vorelix {

namespace {

int numberOf(std::string_view text) {
    int number = 0;
    const char *end = text.data() + text.size();
    const auto [rest, error] = std::from_chars(text.data(), end, number);
    return error == std::errc() && rest == end && number > 0 ? number : 0;
}

[[noreturn]] void throwBadInput(const std::string &what) {
    throw Failure("could not take song ids from standard input: " + what +
                  "; it takes ids, or what a listing prints with --json");
}

std::vector<Wanted> wantedOfDocument(const std::string &text) {
    Json::Value document;
    std::istringstream stream(text);
    std::string errors;
    if (!Json::parseFromStream(Json::CharReaderBuilder(), stream, &document, &errors)) {
        throwBadInput("the document is damaged");
    }
    const Json::Value &rows = document[document.isMember("entries") ? "entries" : "songs"];
    if (!rows.isArray()) {
        throwBadInput("the document has no songs");
    }
    std::vector<Wanted> wanted;
    for (const Json::Value &row : rows) {
        if (!row.isObject() || !row["id"].isInt() || !row["path"].isString()) {
            throwBadInput("the document has something else than songs");
        }
        const int id = row["id"].asInt();
        wanted.push_back({id, id == 0 ? row["path"].asString() : ""});
    }
    return wanted;
}

std::vector<Wanted> wantedOfWords(std::string text) {
    std::replace(text.begin(), text.end(), ',', ' ');
    std::istringstream words(text);
    std::vector<Wanted> wanted;
    for (std::string word; words >> word;) {
        const int id = numberOf(word);
        if (id == 0) {
            throwBadInput("'" + cutToWidth(printable(word), 40) + "' is not an id");
        }
        wanted.push_back({id, ""});
    }
    return wanted;
}

std::vector<Wanted> wantedOfStandardInput() {
    constexpr size_t kMostBytes = 64U << 20;
    std::string text;
    char part[1U << 16];
    while (std::cin.read(part, sizeof part) || std::cin.gcount() > 0) {
        text.append(part, static_cast<size_t>(std::cin.gcount()));
        if (text.size() > kMostBytes) {
            throwBadInput("more than 64 MiB");
        }
    }
    const size_t start = text.find_first_not_of(" \t\r\n");
    return start != std::string::npos && text[start] == '{' ? wantedOfDocument(text)
                                                            : wantedOfWords(std::move(text));
}

bool isWebAddress(const std::string &path) {
    const size_t end = path.find("://");
    return end != std::string::npos && path.find('/') == end + 1;
}

std::string placeOf(const std::string &path) {
    std::string place = isWebAddress(path) ? path : absolutePath(path);
    if (place.size() >= sizeof(ZANO_MEDIA_INFO::path)) {
        throw Failure("could not add a path of more than " +
                      std::to_string(sizeof(ZANO_MEDIA_INFO::path) - 1) + " bytes");
    }
    if (!isWebAddress(path) && access(place.c_str(), F_OK) != 0) {
        throw Failure("could not add " + printable(place) + ": " + std::strerror(errno) +
                      "; a path is an existing file or a web address");
    }
    return place;
}

}  // namespace

std::vector<Wanted> wantedEntries(const std::vector<std::string> &ids,
                                  const std::vector<std::string> &paths) {
    std::vector<Wanted> wanted;
    for (const std::string &id : ids) {
        const std::vector<Wanted> more =
            id == "-" ? wantedOfStandardInput() : std::vector<Wanted>{{numberOf(id), ""}};
        wanted.insert(wanted.end(), more.begin(), more.end());
    }
    for (const std::string &path : paths) {
        wanted.push_back({0, placeOf(path)});
    }
    return wanted;
}

bool readRange(const std::string &text, PositionRange &range) {
    const size_t dash = std::min(text.find('-'), text.size());
    const std::string first = text.substr(0, dash);
    const std::string last = dash < text.size() ? text.substr(dash + 1) : first;
    range = {numberOf(first), numberOf(last)};
    return (range.first > 0 || first == "end") && (range.last > 0 || last == "end") &&
           (range.last == kEnd || (range.first != kEnd && range.first <= range.last));
}

std::vector<size_t> indexesOf(const std::vector<std::string> &ranges, size_t total) {
    std::vector<size_t> indexes;
    for (const std::string &text : ranges) {
        PositionRange range{};
        readRange(text, range);
        const auto first = range.first == kEnd ? total : static_cast<size_t>(range.first);
        const auto last = range.last == kEnd ? total : static_cast<size_t>(range.last);
        if (first < 1 || last > total || first > last) {
            throw Failure("there is no entry " + text + ": the playlist has " +
                          std::to_string(total) + ", so nothing was changed");
        }
        for (size_t position = first; position <= last; ++position) {
            indexes.push_back(position - 1);
        }
    }
    return indexes;
}

size_t destinationOf(const std::string &position, size_t last) {
    PositionRange range{};
    readRange(position, range);
    const auto place = range.first == kEnd ? last : static_cast<size_t>(range.first);
    if (place > last) {
        throw Failure("nothing can be put at position " + position + ": the last one is " +
                      std::to_string(last) + ", so nothing was changed");
    }
    return place - 1;
}

}  // namespace vorelix
