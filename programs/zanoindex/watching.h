/* Keeps the catalogue up to date while folders change. */
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "folder_watch.h"
#include "indexer.h"
#include "session.h"

namespace zano::index {

/* Indexes what the watch reports, a little after it has become quiet, until a stop request; the
 * indexer adds new folders to the watch. onChange is called after each time, with the counts in
 * session.summary. false when no folder is left to watch. */
bool followChanges(FolderWatch &watch, Session &session, Indexer &indexer,
                   const std::vector<std::string> &folders, const std::function<void()> &onChange);

}  // namespace zano::index
