/* Sets what KLIBCErrGet() and KLIBCErrTextGet() answer in this thread. */
#pragma once

#include <string_view>

namespace zano {

void setError(int code, std::string_view text) noexcept;
void clearError() noexcept;

}  // namespace zano
