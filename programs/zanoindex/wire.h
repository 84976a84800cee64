/* What the indexer and its tag readers say to each other: frames of a length (32 bits, in the
 * machine's order: both ends are the same program) and that many bytes. A request is a path. */
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

#include "tags.h"

namespace zano::index {

/* The first frame of a reader: it has started and is under its limits. */
inline constexpr std::string_view kReaderGreeting = "zanoindex tag reader 1";

void appendFrame(std::string &out, std::string_view content);

std::string encodeAnswer(const ReadAnswer &answer);

/* Nothing unless all of it is what a healthy reader can say: known status, texts that are valid
 * UTF-8 and within their limit, numbers within reason. */
std::optional<ReadAnswer> decodeAnswer(std::string_view content);

/* Takes frames from a stream of bytes. */
class FrameReader {
  public:
    void add(const char *bytes, std::size_t count);

    /* The next whole frame, valid until add() is called; nothing when more bytes are needed, or
     * when what came is broken. */
    std::optional<std::string_view> next();

    /* A frame claimed to be longer than any that a healthy sender makes. */
    bool isBroken() const { return isBroken_; }

  private:
    std::string buffer_;
    std::size_t taken_ = 0;
    bool isBroken_ = false;
};

}  // namespace zano::index
