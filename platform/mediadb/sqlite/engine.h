#pragma once

#include <memory>
#include <string>

#include "../engine.h"
#include "../transfer.h"

namespace zano::mediadb::sqlite {

/* Nothing is opened until the first query. */
std::unique_ptr<Engine> makeEngine(const std::string &path);

/* As openCatalogue() (catalogue.h) for a file. */
std::unique_ptr<Catalogue> openCatalogue(const std::string &path);

/* As in transfer.h for a file. */
std::int64_t schemaVersion(const std::string &path);
std::unique_ptr<Snapshot> openSnapshot(const std::string &path);
std::unique_ptr<Replacement> openReplacement(const std::string &path);

}  // namespace zano::mediadb::sqlite
