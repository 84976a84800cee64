#include <zanoplatform/sql_escape.h>

#include <cstdarg>
#include <cstdlib>
#include <cstring>
#include <string_view>

namespace {

constexpr std::string_view kMarker = "@ZANO:NEVAR";

/* Copies text with every `special` doubled and a NUL; out must have room. */
int copyDoubled(char *out, std::string_view text, char special) {
    char *end = out;
    for (const char c : text) {
        *end++ = c;
        if (c == special) {
            *end++ = c;
        }
    }
    *end = '\0';
    return static_cast<int>(end - out);
}

/* Walks the template once for each pass: the first measures, the second writes. */
struct TemplateFiller {
    char *out;  // null: measure only
    size_t length = 0;

    void add(std::string_view text) {
        if (out != nullptr) {
            std::memcpy(out + length, text.data(), text.size());
        }
        length += text.size();
    }

    bool fill(std::string_view pattern, va_list arguments) {
        while (!pattern.empty()) {
            if (pattern.substr(0, kMarker.size()) == kMarker) {
                const char *argument = va_arg(arguments, const char *);
                if (argument == nullptr) {
                    return false;
                }
                add(argument);
                pattern.remove_prefix(kMarker.size());
            } else {
                add(pattern.substr(0, 1));
                pattern.remove_prefix(pattern.substr(0, 2) == "%%" ? 2 : 1);
            }
        }
        return true;
    }
};

}  // namespace

int ZANODBEscapeString(char *out, const char *text, int length) {
    if (out == nullptr || text == nullptr || length < 0) {
        return -1;
    }
    return copyDoubled(out, {text, static_cast<size_t>(length)}, '\'');
}

int ZANODBEscapeBackslash(char *out, int size, const char *text) {
    if (out == nullptr || text == nullptr || size <= 0) {
        return -1;
    }
    const std::string_view source(text);
    size_t needed = source.size() + 1;
    for (const char c : source) {
        needed += c == '\\' ? 1 : 0;
    }
    if (needed > static_cast<size_t>(size)) {
        out[0] = '\0';
        return -1;
    }
    return copyDoubled(out, source, '\\');
}

char *ZANODBEscapeStringEX3(int one, const char *pattern, ...) {
    if (one != 1 || pattern == nullptr) {
        return nullptr;
    }
    va_list arguments;
    va_list again;
    va_start(arguments, pattern);
    va_copy(again, arguments);
    TemplateFiller measure{nullptr};
    char *text = nullptr;
    if (measure.fill(pattern, arguments)) {
        text = static_cast<char *>(std::malloc(measure.length + 1));
    }
    if (text != nullptr) {
        TemplateFiller writer{text};
        writer.fill(pattern, again);
        text[writer.length] = '\0';
    }
    va_end(again);
    va_end(arguments);
    return text;
}
