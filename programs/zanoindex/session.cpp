#include "session.h"

#include "text.h"

namespace zano::index {

void Session::fileFailed(const std::string &path, const std::string &reason) {
    progress.message("cannot read " + printable(path) + ": " + reason);
    summary.failed.push_back({path, reason});
}

void Session::folderFailed(const std::string &path, const std::string &reason) {
    const std::string shown = path.empty() ? "/" : path;  // the root of all
    progress.message(printable(shown) + ": " + reason);
    summary.folders.push_back({shown, reason});
}

}  // namespace zano::index
