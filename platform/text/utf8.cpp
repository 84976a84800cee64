#include "utf8.h"

#include <utf8proc.h>

#include <array>
#include <cstdlib>
#include <memory>
#include <new>

namespace zano {
namespace {

constexpr char32_t kReplacement = U'\uFFFD';

struct FreeText {
    void operator()(utf8proc_uint8_t *text) const { std::free(text); }
};

}  // namespace

bool isUtf8(std::string_view text) {
    const auto *at = reinterpret_cast<const utf8proc_uint8_t *>(text.data());
    auto left = static_cast<utf8proc_ssize_t>(text.size());
    while (left > 0) {
        utf8proc_int32_t character = 0;
        const auto length = *at < 0x80 ? 1 : utf8proc_iterate(at, left, &character);
        if (length < 0) {
            return false;
        }
        at += length;
        left -= length;
    }
    return true;
}

std::string characterText(char32_t character) {
    const bool isValid =
        character != 0 && utf8proc_codepoint_valid(static_cast<utf8proc_int32_t>(character));
    std::array<utf8proc_uint8_t, 4> bytes{};
    const auto length = utf8proc_encode_char(
        static_cast<utf8proc_int32_t>(isValid ? character : kReplacement), bytes.data());
    return {reinterpret_cast<const char *>(bytes.data()), static_cast<std::size_t>(length)};
}

std::optional<std::string> normalised(std::string_view text, Form form) {
    const auto options = static_cast<utf8proc_option_t>(
        UTF8PROC_STABLE | (form == Form::Composed ? UTF8PROC_COMPOSE : UTF8PROC_DECOMPOSE));
    utf8proc_uint8_t *result = nullptr;
    const auto length = utf8proc_map(reinterpret_cast<const utf8proc_uint8_t *>(text.data()),
                                     static_cast<utf8proc_ssize_t>(text.size()), &result, options);
    const std::unique_ptr<utf8proc_uint8_t, FreeText> owned(result);
    if (length == UTF8PROC_ERROR_NOMEM) {
        throw std::bad_alloc();
    }
    if (length < 0) {
        return std::nullopt;
    }
    return std::string(reinterpret_cast<const char *>(result), static_cast<std::size_t>(length));
}

}  // namespace zano
