/* A folder of files, put in the place of the one before as a whole. */
#pragma once

#include <string>

#include "lists.h"

namespace zano::ipod {

/* Makes the files in a new folder beside `folder` (an absolute path without a / at its end), waits
 * for the disk and exchanges the two: readers see the old files or the new ones, never some of
 * both, and so does a machine that loses its power. Of programs that do so at once each waits for
 * the one before it. Makes the folder that `folder` is in. Throws std::runtime_error, with `folder`
 * as it was. */
void replaceFolder(const std::string &folder, const Files &files);

}  // namespace zano::ipod
