#include <utf8proc.h>
#include <zanoplatform/unicode.h>

#include <array>
#include <cstddef>
#include <string_view>

namespace {

/* The characters of a text, case folded. */
class FoldedText {
  public:
    explicit FoldedText(const char *text) : rest_(text) {}

    /* -1 at the end. */
    utf8proc_int32_t next() {
        if (given_ == count_) {
            if (rest_.empty()) {
                return -1;
            }
            fold();
        }
        return folded_.at(given_++);
    }

  private:
    void fold() {
        utf8proc_int32_t character = 0;
        const auto length =
            utf8proc_iterate(reinterpret_cast<const utf8proc_uint8_t *>(rest_.data()),
                             static_cast<utf8proc_ssize_t>(rest_.size()), &character);
        given_ = 0;
        if (length <= 0) {
            // Behind all characters, each byte a number of its own.
            constexpr utf8proc_int32_t kBeyondUnicode = 0x110000;
            folded_[0] = kBeyondUnicode + static_cast<unsigned char>(rest_.front());
            count_ = 1;
            rest_.remove_prefix(1);
            return;
        }
        // No decomposition: that would make the same name of one with and one without accents.
        int boundary = 0;
        const auto count = utf8proc_decompose_char(character, folded_.data(),
                                                   static_cast<utf8proc_ssize_t>(folded_.size()),
                                                   UTF8PROC_CASEFOLD, &boundary);
        count_ = static_cast<std::size_t>(count);
        rest_.remove_prefix(static_cast<std::size_t>(length));
    }

    std::string_view rest_;
    // Three characters are the most that one is folded to.
    std::array<utf8proc_int32_t, 4> folded_{};
    std::size_t given_ = 0;
    std::size_t count_ = 0;
};

}  // namespace

int KLIBCUnicodeUTF8StrCaseCmp(const char *one, const char *other) {
    if (one == nullptr || other == nullptr) {
        return (one != nullptr ? 1 : 0) - (other != nullptr ? 1 : 0);
    }
    FoldedText left(one);
    FoldedText right(other);
    for (;;) {
        const auto a = left.next();
        const auto b = right.next();
        if (a != b) {
            return a < b ? -1 : 1;
        }
        if (a == -1) {
            return 0;
        }
    }
}
