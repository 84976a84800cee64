#pragma once

#include <memory>
#include <string>

#include "../engine.h"
#include "../transfer.h"

namespace zano::mediadb::postgresql {

/* `place` is what stands behind "postgresql:" in the location. Nothing is connected until the
 * first query. */
std::unique_ptr<Engine> makeEngine(const std::string &place);

/* As openCatalogue() (catalogue.h) for a database, which must be there: only its tables are made.
 */
std::unique_ptr<Catalogue> openCatalogue(const std::string &place);

/* As in transfer.h for a database, which must be there. */
std::int64_t schemaVersion(const std::string &place);
std::unique_ptr<Snapshot> openSnapshot(const std::string &place);
std::unique_ptr<Replacement> openReplacement(const std::string &place);

}  // namespace zano::mediadb::postgresql
