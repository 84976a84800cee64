#include "options.h"

#include <CLI/CLI.hpp>

namespace zano::index {
namespace {

constexpr const char *kDescription =
    "Indexes music folders into the media database: reads the tags of new and changed audio "
    "files, and removes the rows of files that are gone.";

constexpr const char *kFooter =
    "A folder that is missing, or has lost more than half of its songs, loses no row without "
    "--prune: its disk may just not be mounted. A file whose tags cannot be read is named on "
    "standard error.\n\n"
    "Exit codes: 0 done; 1 failed, a folder could not be looked at, or songs were kept for want "
    "of --prune; 2 wrong usage; 130 stopped by Ctrl-C.";

void describe(CLI::App &app, ProgramOptions &options) {
    app.set_version_flag("--version", "zanoindex " ZANOINDEX_VERSION);
    app.footer(kFooter);
    app.add_option("FOLDER", options.folders, "Folders with music (or single audio files)");
    app.add_option("-d,--delete", options.deletions, "Remove the rows of the file PATH and end")
        ->type_name("PATH")
        ->allow_extra_args(false);
    app.add_flag("--prune", options.prune, "Remove the rows of all files that are gone");
    app.add_flag("--reread", options.rereadAll, "Read all files, not only what changed");
    app.add_flag("-w,--watch", options.watch, "After the scan, follow changes until stopped");
    app.add_flag("--notices", options.notices,
                 "Print and work off the notices that other programs left");
    app.add_option("-j,--jobs", options.readers,
                   "Files to read at the same time (default: one for each processor)")
        ->type_name("N")
        ->check(CLI::Range(1, 256));
    app.add_option("--database", options.database,
                   "Use this media database, like sqlite:/path/to/file, and not the one that the "
                   "settings name")
        ->type_name("LOCATION");
    app.add_flag("-q,--quiet", options.quiet, "Print errors only");
    app.add_flag("--json", options.json, "Print the summary as one JSON object");
}

/* What is wrong with options that parse, "" when nothing is. */
std::string faultOf(const ProgramOptions &options) {
    const bool hasFolders = !options.folders.empty();
    if (!hasFolders && options.deletions.empty() && !options.notices) {
        return "no FOLDER given";
    }
    if (!options.deletions.empty() && (hasFolders || options.notices)) {
        return "--delete goes with neither FOLDER nor --notices";
    }
    if (options.watch && !hasFolders) {
        return "--watch needs a FOLDER";
    }
    for (const auto *paths : {&options.folders, &options.deletions}) {
        for (const auto &path : *paths) {
            if (path.empty()) {
                return "a path is empty";
            }
        }
    }
    return {};
}

}  // namespace

std::optional<ProgramOptions> parseOptions(int argc, const char *const *argv, int &exitCode) {
    ProgramOptions options;
    CLI::App app(kDescription, "zanoindex");
    describe(app, options);
    try {
        app.parse(argc, argv);
        const auto fault = faultOf(options);
        if (!fault.empty()) {
            throw CLI::ValidationError(fault);
        }
    } catch (const CLI::ParseError &error) {
        exitCode = app.exit(error) == 0 ? kSuccess : kUsage;
        return std::nullopt;
    }
    return options;
}

}  // namespace zano::index
