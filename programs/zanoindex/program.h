/* The program, but for which tag reader it uses. */
#pragma once

#include "tag_phase.h"
#include "tags.h"

namespace zano::index {

/* Tests run the program with other ones. */
struct ProgramSetup {
    TagReader reader;
    ReaderLimits limits;
    std::size_t batchSongs = TagPhase::Options().batchSongs;
};

/* Runs zanoindex with the arguments of main(); returns its exit code. Failures are told on
 * standard error. */
int runProgram(int argc, char **argv, const ProgramSetup &setup) noexcept;

}  // namespace zano::index
