#include "commands.h"
#include "json.h"

namespace vorelix {

Outcome countCommand(const Request &request, const Terminal &) {
    const int total = countSongs(request.filter);
    if (request.json) {
        Json::Value answer(Json::objectValue);
        answer["total"] = total;
        return {documentOf(answer), ""};
    }
    return {std::to_string(total) + "\n", ""};
}

}  // namespace vorelix
