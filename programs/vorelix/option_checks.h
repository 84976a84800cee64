/* Checks of what options are given. */
#pragma once

#include <CLI/CLI.hpp>

namespace vorelix {

/* The whole text in decimal; CLI11 by itself takes 010 for 8. */
CLI::Validator wholeNumber(int least, int most);

CLI::Validator notEmpty();

}  // namespace vorelix
