#include "folder_names.h"

#include <sys/stat.h>

#include <algorithm>
#include <filesystem>

#include "text.h"

namespace zano::playlists {

bool isOnDisk(const std::string &path) {
    struct stat file {};
    return stat(path.c_str(), &file) == 0;
}

std::optional<std::string> FolderNames::find(std::string_view path) {
    std::string found;
    while (!path.empty()) {
        const std::size_t end = std::min(path.find('/', 1), path.size());
        const std::string_view name = path.substr(0, end);
        path.remove_prefix(end);
        if (isOnDisk(found + std::string(name))) {
            found.append(name);
            continue;
        }
        const auto composed = normalised(name.substr(1), Form::Composed);
        if (!composed || isAscii(name)) {
            return std::nullopt;
        }
        const Names &names = namesIn(found.empty() ? "/" : found);
        const auto onDisk = names.find(*composed);
        if (onDisk == names.end()) {
            return std::nullopt;
        }
        found.append("/").append(onDisk->second);
    }
    return found;
}

const FolderNames::Names &FolderNames::namesIn(const std::string &folder) {
    const auto [place, isNew] = folders_.try_emplace(folder);
    std::error_code failed;  // a folder that cannot be listed has no names to offer
    if (!isNew) {
        return place->second;
    }
    for (std::filesystem::directory_iterator at(folder, failed), end; !failed && at != end;
         at.increment(failed)) {
        std::string name = at->path().filename().string();
        if (auto composed = isAscii(name) ? std::nullopt : normalised(name, Form::Composed)) {
            place->second.emplace(std::move(*composed), std::move(name));
        }
    }
    return place->second;
}

}  // namespace zano::playlists
