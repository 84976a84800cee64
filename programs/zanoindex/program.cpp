#include "program.h"

#include <cerrno>
#include <cstdio>
#include <exception>
#include <filesystem>
#include <memory>
#include <system_error>
#include <thread>

#include "folder_watch.h"
#include "indexer.h"
#include "notices.h"
#include "options.h"
#include "session.h"
#include "text.h"
#include "watching.h"

namespace zano::index {
namespace {

/* What a shell reports for a program that a signal ended. */
constexpr int kSignalBase = 128;

void printLine(const std::string &line) {
    if (std::printf("%s\n", line.c_str()) < 0 || std::fflush(stdout) != 0) {
        throw std::system_error(errno, std::generic_category(), "writing to standard output");
    }
}

void printError(const std::string &text) {
    std::fprintf(stderr, "zanoindex: %s\n", text.c_str());
}

std::string locationOf(const ProgramOptions &options) {
    return options.database.empty() ? mediadb::configuredLocation() : options.database;
}

/* Runs action, which uses the media database, and turns its failures into words and exit code. */
template <typename Action>
int useDatabase(const std::string &location, Action action) {
    try {
        return action(location);
    } catch (const mediadb::DatabaseError &error) {
        printError("the media database " + mediadb::withoutPassword(location, location) +
                   " could not be used: " + error.what() +
                   "\nWhat was written before stays. See to the cause and run again.");
        return kFailure;
    }
}

/* Removes the rows of one path, byte for byte. */
bool removeRows(mediadb::Catalogue &catalogue, const std::string &path) {
    Batch batch(catalogue);
    const bool wasSong = catalogue.removeSong(path);
    const bool wasPlaylist = catalogue.removePlaylist(path);
    batch.commit();
    return wasSong || wasPlaylist;
}

/* The path as it is given, or else as a scan of its folder would have made it. */
bool removeFile(mediadb::Catalogue &catalogue, const std::string &path) {
    const auto absolute = std::filesystem::absolute(path).lexically_normal();
    if (removeRows(catalogue, path) || removeRows(catalogue, absolute.string())) {
        return true;
    }
    const auto folder = std::filesystem::weakly_canonical(absolute.parent_path());
    return removeRows(catalogue, (folder / absolute.filename()).string());
}

/* Nothing is printed when isSilent: what the library's callers print is an answer to somebody,
 * in which a line of this program would be out of place. */
int removeFiles(const std::vector<std::string> &paths, const std::string &location, bool isSilent) {
    const auto catalogue = mediadb::openCatalogue(location);
    for (const auto &path : paths) {
        const bool wasThere = removeFile(*catalogue, path);
        if (!isSilent) {
            printLine(printable(path) + (wasThere ? ": removed" : ": there was nothing to remove"));
        }
    }
    catalogue->finish({});
    return kSuccess;
}

/* A run with folders or notices. */
class IndexRun {
  public:
    IndexRun(const ProgramOptions &options, const std::string &location, const ProgramSetup &setup)
        : options_(options),
          catalogue_(mediadb::openCatalogue(location)),
          progress_(options.quiet ? ProgressStyle::kNone : styleForStandardError()),
          session_{*catalogue_, progress_, stop_, {}},
          indexer_(session_, indexOptions(setup)) {}

    int run() {
        if (options_.notices) {
            consumeNotices(session_, indexer_, [&](const mediadb::Notice &notice) {
                if (!options_.quiet && !options_.json) {
                    printLine(noticeText(notice));
                }
            });
        }
        const auto folders = normalisedFolders(options_.folders);
        indexer_.scan(folders);
        report();
        if (stop_.isMade()) {
            progress_.message("stopped; what was read is kept, and the next run does the rest");
            return kSignalBase + stop_.signal();
        }
        if (options_.watch) {
            return watch(folders);
        }
        return session_.summary.folders.empty() ? kSuccess : kFailure;
    }

  private:
    IndexOptions indexOptions(const ProgramSetup &setup) {
        IndexOptions options;
        options.prune = options_.prune;
        options.rereadAll = options_.rereadAll;
        const std::size_t processors = std::thread::hardware_concurrency();
        options.reading.readers = options_.readers > 0 ? options_.readers : processors;
        options.reading.limits = setup.limits;
        options.reading.batchSongs = setup.batchSongs;
        if (options_.watch) {
            watch_ = std::make_unique<FolderWatch>(
                [this](const std::string &path, const std::string &reason) {
                    progress_.message(printable(path) + ": " + reason);
                });
            options.onFolder = [this](const std::string &path, int descriptor) {
                watch_->add(path, descriptor);
            };
        }
        return options;
    }

    void report() {
        progress_.clear();
        if (options_.json) {
            printLine(summaryJson(session_.summary));
        } else if (!options_.quiet) {
            printLine(summaryText(session_.summary));
        }
    }

    int watch(const std::vector<std::string> &folders) {
        progress_.clear();
        if (!options_.quiet) {
            progress_.message("watching " + std::to_string(watch_->size()) + " folders");
        }
        if (followChanges(*watch_, session_, indexer_, folders, [this] { report(); })) {
            return kSuccess;
        }
        printError("no folder is left to watch");
        return kFailure;
    }

    const ProgramOptions &options_;
    StopRequest stop_;
    std::unique_ptr<mediadb::Catalogue> catalogue_;
    Progress progress_;
    Session session_;
    std::unique_ptr<FolderWatch> watch_;
    Indexer indexer_;
};

int run(int argc, char **argv, const ProgramSetup &setup) {
    const std::vector<std::string> arguments(argv, argv + argc);
    // The library starts this program with "-d" where its name would stand.
    if (arguments.size() == 2 && arguments[0] == "-d") {
        return useDatabase(mediadb::configuredLocation(), [&](const std::string &location) {
            return removeFiles({arguments[1]}, location, true);
        });
    }
    if (arguments.size() == 2 && arguments[1] == kReaderArgument) {
        return serveTags(setup.reader, setup.limits);
    }
    int exitCode = kSuccess;
    const auto options = parseOptions(argc, argv, exitCode);
    if (!options) {
        return exitCode;
    }
    return useDatabase(locationOf(*options), [&](const std::string &location) {
        return options->deletions.empty()
                   ? IndexRun(*options, location, setup).run()
                   : removeFiles(options->deletions, location, options->quiet);
    });
}

}  // namespace

int runProgram(int argc, char **argv, const ProgramSetup &setup) noexcept {
    try {
        return run(argc, argv, setup);
    } catch (const std::exception &error) {
        printError(error.what());
    } catch (...) {
        printError("failed for an unknown reason");
    }
    return kFailure;
}

}  // namespace zano::index
