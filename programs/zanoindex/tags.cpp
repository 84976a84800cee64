#include "tags.h"

#include <array>
#include <cstddef>

namespace zano::index {
namespace {

struct StatusRow {
    ReadStatus status;
    std::string_view text;
    bool faultOfFile;
};

constexpr std::array kStatusRows = {
    StatusRow{ReadStatus::kRead, "it was read", false},
    StatusRow{ReadStatus::kNotAudio, "not an audio file", false},
    StatusRow{ReadStatus::kUnreadable, "", false},
    StatusRow{ReadStatus::kOutOfMemory, "the tag reader ran out of memory", true},
    StatusRow{ReadStatus::kCrashed, "the tag reader crashed", true},
    StatusRow{ReadStatus::kOutOfTime, "the tag reader ran out of time", true},
    StatusRow{ReadStatus::kNoAnswer, "the disk did not answer in time", false},
    StatusRow{ReadStatus::kKilled, "the tag reader was killed", false},
};

constexpr bool isInOrder() {
    for (std::size_t i = 0; i < kStatusRows.size(); ++i) {
        if (static_cast<std::size_t>(kStatusRows[i].status) != i) {
            return false;
        }
    }
    return true;
}
static_assert(isInOrder());

const StatusRow &rowOf(ReadStatus status) {
    return kStatusRows.at(static_cast<std::size_t>(status));
}

}  // namespace

std::string reasonText(const ReadAnswer &answer) {
    const std::string text(rowOf(answer.status).text);
    if (text.empty() || answer.detail.empty()) {
        return text + answer.detail;
    }
    return text + " (" + answer.detail + ")";
}

bool isFaultOfFile(ReadStatus status) {
    return rowOf(status).faultOfFile;
}

}  // namespace zano::index
