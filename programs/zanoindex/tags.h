/* What reading the tags of one file gives. */
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

#include "mediadb/catalogue.h"

namespace zano::index {

/* Texts are storable (text.h). */
using mediadb::Tags;

enum class ReadStatus : std::uint8_t {
    kRead,
    kNotAudio,
    kUnreadable,  // the system refused; the detail says why
    // what the tag reader itself does not survive
    kOutOfMemory,
    kCrashed,
    kOutOfTime,
    kNoAnswer,  // the disk did not give the file's content in time
    kKilled,    // from outside: the machine is out of memory, most likely
};

struct ReadAnswer {
    ReadStatus status = ReadStatus::kRead;
    std::string detail;  // storable text, may be empty
    Tags tags;           // of kRead only
};

/* Reads a file's tags. What the file does to the reader (endless loops, crashes) is the caller's
 * to bear; std::bad_alloc and other exceptions may leave it. */
using TagReader = ReadAnswer (*)(const std::string &path);

/* Why a file was not read, for people: "not an audio file". */
std::string reasonText(const ReadAnswer &answer);

/* true when the file itself stops the reader, now and whenever it is tried again; false for what
 * can be over at the next run. */
bool isFaultOfFile(ReadStatus status);

}  // namespace zano::index
