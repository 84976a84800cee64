/* The media servers of the network, by SSDP. */
#pragma once

#include <string>
#include <vector>

#include "device_description.h"

namespace vorelix {

struct FoundServer {
    std::string url;  // of its description
    DeviceDescription description;
    std::string complaint;  // why there is no description; "" when there is one
    bool isLate = false;    // it did not answer in time
};

/* Asks the network for media servers and takes the answers of `waitMs`, then reads the description
 * of each, in `timeoutMs`. `interface` is the name or address of the one to ask through; "": as the
 * system chooses. Throws Failure when the network cannot be asked. */
std::vector<FoundServer> discoverServers(const std::string &interface, int waitMs, int timeoutMs);

/* Reads the description at an address. A complaint, too, when there is something else, or nothing.
 */
FoundServer describeServer(const std::string &url, int timeoutMs);

}  // namespace vorelix
