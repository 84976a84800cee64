#include <zanoplatform/error.h>
#include <zanoplatform/strings.h>

#include <algorithm>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string_view>

#include "error_internal.h"

namespace {

bool append(SZLIST &list, std::string_view text) {
    if (list.count == list.capacity) {
        const int capacity = std::max(16, 2 * list.capacity);
        void *grown = std::realloc(list.items, static_cast<size_t>(capacity) * sizeof(char *));
        if (grown == nullptr) {
            return false;
        }
        list.items = static_cast<char **>(grown);
        list.capacity = capacity;
    }
    char *item = strndup(text.data(), text.size());
    if (item == nullptr) {
        return false;
    }
    list.items[list.count++] = item;
    return true;
}

bool isBefore(const char *a, const char *b) {
    return std::strcmp(a, b) < 0;
}

void sortIfKept(SZLIST &list) {
    if (list.sorted != 0) {
        std::sort(list.items, list.items + list.count, isBefore);
    }
}

void clear(SZLIST &list) {
    std::for_each(list.items, list.items + list.count, [](char *item) { std::free(item); });
    list.count = 0;
}

}  // namespace

char *KLIBCStrGet(const char *format, ...) {
    if (format == nullptr) {
        zano::setError(KLIB_ERR_BAD_PARAMETER, "no format given");
        return nullptr;
    }
    va_list arguments;
    va_start(arguments, format);
    char *text = nullptr;
    const int length = vasprintf(&text, format, arguments);
    va_end(arguments);
    if (length < 0) {
        zano::setError(KLIB_ERR_OUT_OF_MEMORY, "out of memory for a text");
        return nullptr;
    }
    zano::clearError();
    return text;
}

void KLIBCStrPut(char *text) {
    std::free(text);
}

char *KLIBCStrTrimSpace(char *text) {
    if (text == nullptr) {
        return nullptr;
    }
    constexpr const char *kSpaces = " \t\r\n";
    const std::string_view all(text);
    const size_t first = std::min(all.find_first_not_of(kSpaces), all.size());
    const size_t last = all.find_last_not_of(kSpaces);
    const size_t length = last == std::string_view::npos ? 0 : last + 1 - first;
    std::memmove(text, text + first, length);
    text[length] = '\0';
    return text;
}

PSZLIST KLIBCSzListAlloc(int capacity) {
    if (capacity < 0) {
        return nullptr;
    }
    auto *list = static_cast<PSZLIST>(std::calloc(1, sizeof(SZLIST)));
    if (list == nullptr) {
        return nullptr;
    }
    list->capacity = std::max(1, capacity);
    list->items =
        static_cast<char **>(std::calloc(static_cast<size_t>(list->capacity), sizeof(char *)));
    if (list->items == nullptr) {
        std::free(list);
        return nullptr;
    }
    return list;
}

void KLIBCSzListFree(PSZLIST list) {
    if (list == nullptr) {
        return;
    }
    clear(*list);
    std::free(list->items);
    std::free(list);
}

int KLIBCStrSep(const char *text, const char *separator, PSZLIST *list) {
    if (list == nullptr || *list == nullptr) {
        return -1;
    }
    clear(**list);
    if (text == nullptr || separator == nullptr || *separator == '\0') {
        return -1;
    }
    std::string_view rest(text);
    const size_t width = std::strlen(separator);
    while (!rest.empty() || (*list)->count > 0) {
        const size_t end = rest.find(separator);
        if (!append(**list, rest.substr(0, end))) {
            clear(**list);
            return -1;
        }
        if (end == std::string_view::npos) {
            break;
        }
        rest.remove_prefix(end + width);
    }
    sortIfKept(**list);
    return (*list)->count;
}

const char *KLIBCSzListGet(PSZLIST list, int index) {
    return list != nullptr && index >= 0 && index < list->count ? list->items[index] : nullptr;
}

int KLIBCSzListFind(PSZLIST list, const char *text) {
    if (list == nullptr || text == nullptr) {
        return -1;
    }
    char **const begin = list->items;
    char **const end = begin + list->count;
    char **found = nullptr;
    if (list->sorted != 0) {
        found = std::lower_bound(begin, end, text, isBefore);
    } else {
        found = std::find_if(begin, end,
                             [text](const char *item) { return std::strcmp(item, text) == 0; });
    }
    return found != end && std::strcmp(*found, text) == 0 ? static_cast<int>(found - begin) : -1;
}

void KLIBCSzListSortItems(PSZLIST list, int keepSorted) {
    if (list == nullptr) {
        return;
    }
    list->sorted = keepSorted != 0 ? 1 : 0;
    sortIfKept(*list);
}
