#include <vorelix/misc/misc.h>

#include <cstddef>
#include <cstring>
#include <string_view>

namespace {

constexpr const char *kBlanks = " \n\r\t";

}  // namespace

void trimTrailingNewline(char *s) {
    if (s == nullptr) {
        return;
    }
    std::size_t length = std::strlen(s);
    while (length > 0 && (s[length - 1] == '\n' || s[length - 1] == '\r')) {
        s[--length] = '\0';
    }
}

void strstrip(char *s) {
    if (s == nullptr) {
        return;
    }
    const char *start = s + std::strspn(s, kBlanks);
    std::memmove(s, start, std::strlen(start) + 1);
    // The length up to the last byte that stays; find_last_not_of gives npos, -1, for none.
    s[std::string_view(s).find_last_not_of(kBlanks) + 1] = '\0';
}
