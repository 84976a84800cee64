#include "paging.h"

#include <algorithm>
#include <string_view>

#include "text.h"

namespace vorelix {

namespace {

/* The words without an option and its value, up to "--". */
std::vector<std::string> without(const std::string &option, const std::vector<std::string> &words) {
    std::vector<std::string> kept;
    auto word = words.begin();
    for (; word != words.end() && *word != "--"; ++word) {
        if (*word == option) {
            ++word;
        } else if (!word->starts_with(option + "=")) {
            kept.push_back(*word);
        }
    }
    kept.insert(kept.end(), word, words.end());
    return kept;
}

std::string nextCommand(const Request &request, int nextOffset) {
    const std::string option = request.byPage ? "--page" : "--offset";
    const int number = request.byPage ? nextOffset / request.span.limit + 1 : nextOffset;
    std::vector<std::string> words = without(option, request.words);
    const auto optionsEnd = std::find(words.begin(), words.end(), "--");
    words.insert(optionsEnd, {option, std::to_string(number)});
    std::string line;
    for (const std::string &word : words) {
        line.append(line.empty() ? "" : " ").append(shellQuoted(word));
    }
    return printable(line);
}

}  // namespace

std::string pageLine(const std::string &noun, const Request &request, int shown, int total) {
    const auto [offset, limit] = request.span;
    const int pages = (total - 1) / limit + 1;
    if (shown == 0) {
        return "no " + noun + " here: there are " + std::to_string(total) + " in all" +
               (request.byPage ? ", on pages 1 to " + std::to_string(pages) : "");
    }
    std::string line = noun + " " + std::to_string(offset + 1) + "-" +
                       std::to_string(offset + shown) + " of " + std::to_string(total);
    std::string more;
    if (request.byPage && pages > 1) {
        more = "page " + std::to_string(offset / limit + 1) + " of " + std::to_string(pages);
    }
    if (total - offset > shown) {
        more += (more.empty() ? "next: " : "; next: ") + nextCommand(request, offset + shown);
    }
    return more.empty() ? line : line + " (" + more + ")";
}

}  // namespace vorelix
