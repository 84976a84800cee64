/* Agents of the tests below. */
#pragma once

#include <vorelix/upnp/dmagent.h>

#include <cstdlib>
#include <memory>
#include <string>

namespace upnp_test {

/* Gives up the response, which is the caller's, as a text; "(null)" when there is none. */
inline std::string takeResponse(DMAgent &agent) {
    const std::unique_ptr<char, decltype(&std::free)> response(agent.response, &std::free);
    agent.response = nullptr;
    return response != nullptr ? response.get() : "(null)";
}

}  // namespace upnp_test
