/* The description of a UPnP device, and small answers: XML from strangers, read without entities
 * and without the network. For a child process, as the library cleans libxml2 up behind itself. */
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace vorelix {

struct DeviceDescription {
    std::string name;        // what its owner calls it
    std::string model;       // with the maker's name, when that is given and not in it
    std::string id;          // its UDN, "uuid:..."
    std::string controlUrl;  // of its ContentDirectory, as a whole address
};

/* Nothing when the text is no description of a device that has a ContentDirectory. Addresses in it
 * are relative to its URLBase, or else to `url`, where it came from. */
std::optional<DeviceDescription> readDeviceDescription(std::string_view text,
                                                       const std::string &url);

/* Begins with http:// or https://. */
bool isWebAddress(std::string_view text);

/* The text of the first element of this name; nothing when there is none or the text is no XML. */
std::optional<std::string> textOfElement(std::string_view xml, std::string_view name);

}  // namespace vorelix
