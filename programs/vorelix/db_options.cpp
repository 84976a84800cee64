#include "db_options.h"

#include <CLI/CLI.hpp>

#include "option_checks.h"

namespace vorelix {

namespace {

constexpr const char *kLocations = "sqlite:/path/to/file or postgresql://USER@HOST/DATABASE";

CLI::Option *addLocation(CLI::App &app, const char *name, std::string &location,
                         const std::string &description) {
    return app.add_option(name, location, description)->type_name("")->check(notEmpty());
}

}  // namespace

void addDatabase(CLI::App &app, Request &request) {
    addLocation(app, "LOCATION", request.database.location,
                std::string(kLocations) + "; that of the setting mediadb if not given");
}

void addDatabases(CLI::App &app, Request &request) {
    addLocation(app, "FROM", request.database.from, std::string("What to copy: ") + kLocations)
        ->required();
    addLocation(app, "TO", request.database.to, "Where to; a missing file of SQLite is made")
        ->required();
    app.add_flag("--force", request.database.force, "Replace what TO holds");
}

}  // namespace vorelix
