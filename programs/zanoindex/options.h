/* The command line of zanoindex. */
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

namespace zano::index {

struct ProgramOptions {
    std::vector<std::string> folders;
    std::vector<std::string> deletions;
    bool prune = false;
    bool rereadAll = false;
    bool watch = false;
    bool notices = false;
    bool quiet = false;
    bool json = false;
    std::size_t readers = 0;  // 0: as many as there are processors
    std::string database;     // "": the one that the settings name
};

/* Exit codes. */
inline constexpr int kSuccess = 0;
inline constexpr int kFailure = 1;
inline constexpr int kUsage = 2;

/* Nothing when the program is to end with exitCode: help or the version was printed on standard
 * output, or what is wrong with the arguments on standard error. */
std::optional<ProgramOptions> parseOptions(int argc, const char *const *argv, int &exitCode);

}  // namespace zano::index
