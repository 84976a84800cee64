#include <zanoplatform/error.h>
#include <algorithm>
#include <array>
#include <cstring>

#include "error_internal.h"

namespace zano {
namespace {

/* A fixed buffer, so that running out of memory can be reported too. */
struct LastError {
    int code = KLIB_ERR_NONE;
    std::array<char, 1024> text{};
};

thread_local LastError lastError;

}  // namespace

void setError(int code, std::string_view text) noexcept {
    lastError.code = code;
    const size_t length = std::min(text.size(), lastError.text.size() - 1);
    std::memcpy(lastError.text.data(), text.data(), length);
    lastError.text[length] = '\0';
}

void clearError() noexcept {
    lastError.code = KLIB_ERR_NONE;
    lastError.text[0] = '\0';
}

}  // namespace zano

int KLIBCErrGet(void) {
    return zano::lastError.code;
}

const char *KLIBCErrTextGet(void) {
    return zano::lastError.text.data();
}
