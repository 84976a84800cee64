#include "commands.h"

namespace vorelix {

const std::vector<Command> &allCommands() {
    static const std::vector<Command> commands = {
        {"list", "List songs", kSort | kDescending | kPaging, listCommand},
        {"search", "Find songs by a part of their tags",
         kKeyword | kIn | kSort | kDescending | kPaging, listCommand},
        {"browse", "List the artists, albums or genres",
         kColumn | kSearchOption | kDescending | kPaging, browseCommand},
        {"show", "Show all that is known of songs", kIds, showCommand},
        {"count", "Count the songs, or those with a text in their tags", kOptionalKeyword | kIn,
         countCommand},
        {"random", "List some songs by chance", kNumber, randomCommand},
    };
    return commands;
}

}  // namespace vorelix
