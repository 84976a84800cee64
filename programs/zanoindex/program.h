/* The program, but for which tag reader it uses. */
#pragma once

#include "reader_process.h"
#include "tags.h"

namespace zano::index {

struct ProgramSetup {
    TagReader reader;
    ReaderLimits limits;
};

/* Runs zanoindex with the arguments of main(); returns its exit code. Failures are told on
 * standard error. */
int runProgram(int argc, char **argv, const ProgramSetup &setup) noexcept;

}  // namespace zano::index
