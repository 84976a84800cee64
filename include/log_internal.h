/* The failures of the flat functions in the system log.
 *
 * Each message is a constant: its format begins with the prefix that names the unit and the
 * line, "%s:%d " or "%s (%d) " (also "%s(%d): " and "%s %d "). The line is a fixed number of the
 * message that operators search for; it does not follow the source. "%m" is the text of errno
 * at the time of the call. A format whose placeholders do not fit the arguments does not
 * compile.
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
        if (!takesArguments(format)) {
            throw "the placeholders are not those of unit, line and arguments";
        }
    }

    void operator()(Args... args) const {
#pragma GCC diagnostic push
// Checked by the constructor.
#pragma GCC diagnostic ignored "-Wformat-nonliteral"
        syslog(LOG_ERR, format_, unit_, line_, args...);
#pragma GCC diagnostic pop
    }

  private:
    template <typename Arg>
    static consteval std::string_view conversionsOf();

    static consteval bool takesArguments(std::string_view format) {
        constexpr std::array<std::string_view, sizeof...(Args) + 2> kExpected{
            conversionsOf<const char *>(), conversionsOf<int>(), conversionsOf<Args>()...};
        std::size_t taken = 0;
        for (std::size_t at = format.find('%'); at != std::string_view::npos;
             at = format.find('%', at + 1)) {
            at = format.find_first_not_of("0123456789", at + 1);
            if (at == std::string_view::npos) {
                return false;
            }
            if (format[at] == 'm') {
                continue;
            }
            if (taken == kExpected.size() ||
                kExpected.at(taken++).find(format[at]) == std::string_view::npos) {
                return false;
            }
        }
        return taken == kExpected.size();
    }

    const char *unit_;
    const char *format_;
    int line_;
};

template <typename... Args>
template <typename Arg>
consteval std::string_view LogMessage<Args...>::conversionsOf() {
    if constexpr (std::is_same_v<Arg, int>) {
        return "dX";
    } else {
        static_assert(std::is_same_v<Arg, const char *>, "texts and ints can be logged");
        return "s";
    }
}

/* A text as the log shows it: what is missing reads "(null)". */
inline const char *shown(const char *text) {
    return text != nullptr ? text : "(null)";
}

}  // namespace vorelix
