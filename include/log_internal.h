/* The failures of the flat functions in the system log.
 *
 * Each message is a constant: its format begins with the prefix that names the unit and the
 * line, "%s:%d " or "%s (%d) " (also "%s(%d): " and "%s %d "). The line is a fixed number of the
 * message that operators search for; it does not follow the source. The few messages that are
 * known without unit and line are made of their format alone. "%m" is the text of errno at the
 * time of the call. A format whose placeholders do not fit the arguments does not compile.
 *
 *     constexpr LogMessage<int> kNoNode{"musiclib.cpp", "%s (%d) Failed to alloc %d", 176};
 *     kNoNode(7344);
 */
#pragma once

#include <syslog.h>

#include <array>
#include <cstddef>
#include <string_view>
#include <type_traits>

namespace vorelix {

template <typename... Args>
class LogMessage {
  public:
    consteval LogMessage(const char *unit, const char *format, int line)
        : unit_(unit), format_(format), line_(line) {
        if (!takes<const char *, int, Args...>(format)) {
            throw "the placeholders are not those of unit, line and arguments";
        }
    }
    consteval explicit LogMessage(const char *format) : format_(format) {
        if (!takes<Args...>(format)) {
            throw "the placeholders are not those of the arguments";
        }
    }

    void operator()(Args... args) const {
#pragma GCC diagnostic push
// Checked by the constructor.
#pragma GCC diagnostic ignored "-Wformat-nonliteral"
#pragma GCC diagnostic ignored "-Wformat-security"
        if (unit_ != nullptr) {
            syslog(LOG_ERR, format_, unit_, line_, args...);
        } else {
            syslog(LOG_ERR, format_, args...);
        }
#pragma GCC diagnostic pop
    }

  private:
    /* How an argument may be shown: a letter behind so many l. */
    struct Conversion {
        std::string_view letters;
        std::size_t longs = 0;
    };
    template <typename Arg>
    static consteval Conversion conversionOf() {
        if constexpr (std::is_same_v<Arg, int>) {
            return {"dX"};
        } else if constexpr (std::is_same_v<Arg, long long>) {
            return {"d", 2};
        } else {
            static_assert(std::is_same_v<Arg, const char *>, "texts and numbers can be logged");
            return {"s"};
        }
    }

    template <typename... Shown>
    static consteval bool takes(std::string_view format) {
        constexpr std::array<Conversion, sizeof...(Shown)> kExpected{conversionOf<Shown>()...};
        std::size_t taken = 0;
        for (std::size_t at = format.find('%'); at != std::string_view::npos;
             at = format.find('%', at + 1)) {
            const std::size_t length = format.find_first_not_of("0123456789", at + 1);
            at = format.find_first_not_of('l', length);
            if (at == std::string_view::npos) {
                return false;
            }
            if (format[at] == 'm') {
                continue;
            }
            if (taken == kExpected.size() || kExpected.at(taken).longs != at - length ||
                kExpected.at(taken).letters.find(format[at]) == std::string_view::npos) {
                return false;
            }
            ++taken;
        }
        return taken == kExpected.size();
    }

    const char *unit_ = nullptr;
    const char *format_;
    int line_ = 0;
};

/* A text as the log shows it: what is missing reads "(null)". */
inline const char *shown(const char *text) {
    return text != nullptr ? text : "(null)";
}

}  // namespace vorelix
