#include "session.h"

#include "text.h"

namespace zano::index {

void Session::fileFailed(const std::string &path, const std::string &reason) {
    progress.message("cannot read " + printable(path) + ": " + reason);
    summary.failed.push_back({path, reason});
}

void Session::folderFailed(const std::string &path, const std::string &reason) {
    progress.message(printable(path) + ": " + reason);
    summary.folders.push_back({path, reason});
}

}  // namespace zano::index
