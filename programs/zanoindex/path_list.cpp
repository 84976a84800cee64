#include "path_list.h"

#include <algorithm>
#include <array>
#include <cstring>

namespace zano::index {
namespace {

struct Entry {
    mediadb::FileStamp stamp;
    std::uint32_t shared;  // bytes that it begins with as the one before
    std::uint32_t own;     // bytes that follow the entry
    bool isKnown;
};

}  // namespace

void PathList::add(std::string_view path, const mediadb::FileStamp &stamp, bool isKnown) {
    const auto [end, unused] = std::mismatch(path.begin(), path.end(), last_.begin(), last_.end());
    const auto shared = static_cast<std::size_t>(end - path.begin());
    const auto own = path.substr(shared);
    const Entry entry = {stamp, static_cast<std::uint32_t>(shared),
                         static_cast<std::uint32_t>(own.size()), isKnown};
    std::array<char, sizeof entry> bytes{};
    std::memcpy(bytes.data(), &entry, sizeof entry);
    bytes_.append(bytes.data(), bytes.size()).append(own);
    last_.resize(shared);
    last_.append(own);
    ++size_;
}

std::optional<ListedFile> PathList::Reader::next() {
    if (rest_.empty()) {
        return std::nullopt;
    }
    Entry entry{};
    std::memcpy(&entry, rest_.data(), sizeof entry);
    path_.resize(entry.shared);
    path_.append(rest_.substr(sizeof entry, entry.own));
    rest_.remove_prefix(sizeof entry + entry.own);
    return ListedFile{path_, entry.stamp, entry.isKnown};
}

}  // namespace zano::index
