/* Texts in buffers of fixed size: what does not fit is cut. */
#pragma once

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdio>
#include <string_view>

namespace vorelix {

/* Null or "". */
inline bool isEmpty(const char *text) {
    return text == nullptr || *text == '\0';
}

/* Writes what fits of a text, and a NUL, into a buffer of `size` bytes; nothing when the size is
 * below 1. */
inline void writeText(char *out, int size, const char *text) {
    std::snprintf(out, size > 0 ? static_cast<std::size_t>(size) : 0, "%s", text);
}

/* Size - 1 bytes and a NUL. */
template <std::size_t Size>
class BoundedText {
  public:
    BoundedText() { text_[0] = '\0'; }

    /* Each piece in turn; returns *this. */
    template <typename... Pieces>
    BoundedText &append(Pieces... pieces) {
        (appendOne(pieces), ...);
        return *this;
    }

    const char *text() const { return text_.data(); }
    bool empty() const { return length_ == 0; }

  private:
    void appendOne(std::string_view piece) {
        const std::size_t taken = std::min(piece.size(), Size - 1 - length_);
        std::copy_n(piece.begin(), taken, text_.begin() + length_);
        length_ += taken;
        text_[length_] = '\0';
    }

    std::array<char, Size> text_;
    std::size_t length_ = 0;
};

}  // namespace vorelix
