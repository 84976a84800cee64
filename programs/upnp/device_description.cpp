#include "device_description.h"

#include <libxml/parser.h>
#include <libxml/tree.h>
#include <libxml/uri.h>

#include <memory>
#include <utility>

#include "answer_repair.h"

namespace vorelix {

namespace {

constexpr std::string_view kService = "urn:schemas-upnp-org:service:ContentDirectory:";

struct FreeDocument {
    void operator()(xmlDoc *document) const { xmlFreeDoc(document); }
};
using Document = std::unique_ptr<xmlDoc, FreeDocument>;

struct FreeText {
    void operator()(xmlChar *text) const { xmlFree(text); }
};
using Text = std::unique_ptr<xmlChar, FreeText>;

Document parse(std::string_view text, int options) {
    return Document(xmlReadMemory(
        text.data(), static_cast<int>(text.size()), "", nullptr,
        options | XML_PARSE_NONET | XML_PARSE_NOERROR | XML_PARSE_NOWARNING | XML_PARSE_NOCDATA));
}

/* MiniDLNA, for one, sends the name of a device as its owner wrote it, with a bare "&" in it. */
Document parse(std::string_view text) {
    Document document = parse(text, 0);
    return document != nullptr ? std::move(document) : parse(repaired(text), XML_PARSE_RECOVER);
}

const xmlChar *asXml(const std::string &text) {
    return reinterpret_cast<const xmlChar *>(text.c_str());
}

bool isNamed(const xmlNode &node, std::string_view name) {
    return node.type == XML_ELEMENT_NODE && reinterpret_cast<const char *>(node.name) == name;
}

/* Without blanks around it. */
std::string contentOf(const xmlNode &node) {
    std::string text;
    for (const xmlNode *child = node.children; child != nullptr; child = child->next) {
        if (child->type == XML_TEXT_NODE && child->content != nullptr) {
            text += reinterpret_cast<const char *>(child->content);
        }
    }
    constexpr const char *kBlanks = " \t\r\n";
    const std::size_t first = text.find_first_not_of(kBlanks);
    return first == std::string::npos
               ? std::string()
               : text.substr(first, text.find_last_not_of(kBlanks) + 1 - first);
}

/* The first of this name at or below the node and its siblings; null when there is none. */
const xmlNode *find(const xmlNode *node, std::string_view name) {
    for (; node != nullptr; node = node->next) {
        if (isNamed(*node, name)) {
            return node;
        }
        const xmlNode *const below =
            node->type == XML_ELEMENT_NODE ? find(node->children, name) : nullptr;
        if (below != nullptr) {
            return below;
        }
    }
    return nullptr;
}

std::string childText(const xmlNode &parent, std::string_view name) {
    for (const xmlNode *child = parent.children; child != nullptr; child = child->next) {
        if (isNamed(*child, name)) {
            return contentOf(*child);
        }
    }
    return {};
}

/* The ContentDirectory at or below the node and its siblings. */
const xmlNode *findService(const xmlNode *node) {
    for (; node != nullptr; node = node->next) {
        if (isNamed(*node, "service") && childText(*node, "serviceType").starts_with(kService)) {
            return node;
        }
        const xmlNode *const below =
            node->type == XML_ELEMENT_NODE ? findService(node->children) : nullptr;
        if (below != nullptr) {
            return below;
        }
    }
    return nullptr;
}

/* The innermost device around the service: a media server may be a part of another device. */
const xmlNode *deviceOf(const xmlNode *service) {
    while (service != nullptr && !isNamed(*service, "device")) {
        service = service->parent;
    }
    return service;
}

std::string modelOf(const xmlNode &device) {
    const std::string model = childText(device, "modelName");
    const std::string maker = childText(device, "manufacturer");
    const bool isNew = !maker.empty() && model.find(maker) == std::string::npos;
    return isNew ? maker + (model.empty() ? "" : " ") + model : model;
}

std::string resolved(const std::string &address, const std::string &base) {
    const Text whole(xmlBuildURI(asXml(address), asXml(base)));
    return whole != nullptr ? reinterpret_cast<const char *>(whole.get()) : "";
}

}  // namespace

bool isWebAddress(std::string_view text) {
    return text.starts_with("http://") || text.starts_with("https://");
}

std::optional<DeviceDescription> readDeviceDescription(std::string_view text,
                                                       const std::string &url) {
    const Document document = parse(text);
    const xmlNode *const root =
        document != nullptr ? xmlDocGetRootElement(document.get()) : nullptr;
    const xmlNode *const service = root != nullptr ? findService(root) : nullptr;
    const xmlNode *const device = deviceOf(service);
    const std::string control = service != nullptr ? childText(*service, "controlURL") : "";
    if (device == nullptr || control.empty()) {
        return std::nullopt;
    }
    const std::string base = childText(*root, "URLBase");
    const std::string whole = resolved(control, base.empty() ? url : resolved(base, url));
    if (!isWebAddress(whole)) {  // libcurl would open files, too
        return std::nullopt;
    }
    return DeviceDescription{childText(*device, "friendlyName"), modelOf(*device),
                             childText(*device, "UDN"), whole};
}

std::optional<std::string> textOfElement(std::string_view xml, std::string_view name) {
    const Document document = parse(xml);
    const xmlNode *const root =
        document != nullptr ? xmlDocGetRootElement(document.get()) : nullptr;
    const xmlNode *const node = find(root, name);
    return node != nullptr ? std::optional(contentOf(*node)) : std::nullopt;
}

}  // namespace vorelix
