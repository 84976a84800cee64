#include "mime_data.h"

#include <algorithm>
#include <charconv>
#include <sstream>
#include <string_view>
#include <tuple>

namespace zano::mime {
namespace {

bool isPlain(std::string_view extension) {
    return !extension.empty() &&
           std::all_of(extension.begin(), extension.end(), [](unsigned char c) {
               return c > ' ' && std::string_view("\"*?[].:").find(static_cast<char>(c)) ==
                                     std::string_view::npos;
           });
}

bool isType(std::string_view name) {
    return name.find('/') != std::string_view::npos && name.find('"') == std::string_view::npos;
}

bool isBetter(const Type &one, const Type &other) {
    return std::tuple(-one.weight, one.name.size(), one.name) <
           std::tuple(-other.weight, other.name.size(), other.name);
}

void add(std::string_view text, const Type &type, Extensions &extensions) {
    if (!isPlain(text) || !isType(type.name)) {
        return;
    }
    Extension &extension =
        extensions.try_emplace(std::string(text), Extension{type, false}).first->second;
    if (isBetter(type, extension.type)) {
        extension.type = type;
    }
    extension.isAudio = extension.isAudio || type.name.starts_with("audio/");
}

/* Takes the text up to a colon, or all of it, from the front. */
std::string_view takeField(std::string_view &line) {
    const std::string_view field = line.substr(0, line.find(':'));
    line.remove_prefix(std::min(line.size(), field.size() + 1));
    return field;
}

void addGlob(std::string_view line, Extensions &extensions) {
    const std::string_view number = takeField(line);
    const std::string_view name = takeField(line);
    const std::string_view glob = takeField(line);
    int weight = 0;
    const char *const end = number.data() + number.size();
    const auto [rest, error] = std::from_chars(number.data(), end, weight);
    if (error == std::errc() && rest == end && glob.starts_with("*.")) {
        add(glob.substr(2), {weight, std::string(name)}, extensions);
    }
}

void addList(const std::string &line, Extensions &extensions) {
    std::istringstream words(line);
    Type type{0, {}};
    words >> type.name;
    for (std::string extension; words >> extension;) {
        add(extension, type, extensions);
    }
}

}  // namespace

void addExtensions(std::istream &file, Extensions &extensions) {
    for (std::string line; std::getline(file, line);) {
        if (line.starts_with('#')) {
            continue;
        }
        if (line.find(':') != std::string::npos) {
            addGlob(line, extensions);
        } else {
            addList(line, extensions);
        }
    }
}

}  // namespace zano::mime
