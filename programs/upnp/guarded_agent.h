/* A request that ends, for a child process of its own. */
#pragma once

#include <vorelix/upnp/dmagent.h>

#include <string>

namespace vorelix {

constexpr int kMostMebibytes = 64;  // of an answer

/* What is left to say of a request whose time was over, or whose answer had no end. */
struct LateAnswer {
    unsigned int bytes = 0;  // received until then
    std::string start;       // the first of them
    bool isTooLarge() const { return bytes > static_cast<unsigned int>(kMostMebibytes) << 20U; }
};

/* Performs the request and gives its result. The decoder of the library never comes back from an
 * "&" that begins none of its six entities, as a numeric one does; such an "&" is left in the
 * response as it is. When the time is over, or the answer is too large, the process writes a late
 * answer to the pipe and ends. */
int performGuarded(DMAgent &agent, int pipe, int timeoutMs);

/* False when the text is something else. */
bool readLateAnswer(const std::string &text, LateAnswer &answer);

}  // namespace vorelix
