/* Reads tags with TagLib. Meant for a process of its own (reader_process.h): a damaged file can
 * make TagLib loop, crash or ask for all memory. */
#pragma once

#include <string>

#include "tags.h"

namespace zano::index {

/* A TagReader. The format is the one that the name says, or, where that does not fit, the one
 * that the content says. kNotAudio when there is neither sound nor a tag in it. */
ReadAnswer readTags(const std::string &path);

}  // namespace zano::index
