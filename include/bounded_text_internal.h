/* A text in a buffer of fixed size: Size - 1 bytes and a NUL. What does not fit is cut. */
#pragma once

#include <algorithm>
#include <array>
#include <cstddef>
#include <string_view>

namespace vorelix {

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
