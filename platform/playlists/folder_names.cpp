#include "folder_names.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <filesystem>

#include "text.h"

namespace zano::playlists {

bool isOnDisk(const std::string &path) {
    struct stat file {};
    return stat(path.c_str(), &file) == 0;
}

FileLookup::~FileLookup() {
    if (descriptor_ != -1) {
        close(descriptor_);
    }
}

/* A single file of a folder costs less by its whole path. */
void FileLookup::enter(std::string_view folder) {
    if (descriptor_ != -1) {
        close(descriptor_);
        descriptor_ = -1;
    }
    if (folder == folder_) {
        descriptor_ = open(folder_.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC);
        isGone_ = descriptor_ == -1 && (errno == ENOENT || errno == ENOTDIR);
    } else {
        folder_ = folder;
        isGone_ = false;
    }
}

bool FileLookup::isThere(const std::string &path) {
    const std::size_t end = path.rfind('/') + 1;
    const std::string_view folder = std::string_view(path).substr(0, end);
    if (folder != folder_ || (descriptor_ == -1 && !isGone_)) {
        enter(folder);
    }
    struct stat file {};
    if (isGone_) {
        return false;
    }
    return descriptor_ == -1 || end == path.size()
               ? isOnDisk(path)
               : fstatat(descriptor_, path.c_str() + end, &file, 0) == 0;
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
