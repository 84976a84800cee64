#pragma once

#include <memory>
#include <string>

#include "../engine.h"

namespace zano::mediadb::sqlite {

/* Nothing is opened until the first query. */
std::unique_ptr<Engine> makeEngine(const std::string &path);

/* As openCatalogue() (catalogue.h) for a file. */
std::unique_ptr<Catalogue> openCatalogue(const std::string &path);

}  // namespace zano::mediadb::sqlite
