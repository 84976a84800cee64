#include "terminal.h"

#include <sys/ioctl.h>
#include <unistd.h>
#include <charconv>
#include <cstdlib>
#include <string_view>

namespace vorelix {

namespace {

std::string_view environment(const char *name) {
    const char *value = std::getenv(name);
    return value != nullptr ? value : "";
}

/* 0 when COLUMNS is not a positive number. */
int columnsOfEnvironment() {
    const std::string_view text = environment("COLUMNS");
    int columns = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), columns);
    return error == std::errc() && end == text.data() + text.size() && columns > 0 ? columns : 0;
}

}  // namespace

Terminal terminalOfStandardOutput() {
    constexpr int kUsualWidth = 80;
    if (!isatty(STDOUT_FILENO)) {
        return {columnsOfEnvironment(), false};
    }
    winsize size{};
    Terminal terminal;
    if (ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col > 0) {
        terminal.width = size.ws_col;
    } else {
        const int columns = columnsOfEnvironment();
        terminal.width = columns > 0 ? columns : kUsualWidth;
    }
    terminal.bold = environment("NO_COLOR").empty() && environment("TERM") != "dumb";
    return terminal;
}

}  // namespace vorelix
