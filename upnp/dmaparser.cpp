#include <libxml/parser.h>
#include <libxml/tree.h>
#include <vorelix/upnp/dmaparser.h>

#include <algorithm>
#include <cstdlib>
#include <limits>
#include <memory>
#include <new>
#include <string_view>

namespace {

constexpr int kLeastVersion = 20708;  // 2.7.8
constexpr int kDecimal = 10;

struct FreeDocument {
    void operator()(xmlDoc *document) const { xmlFreeDoc(document); }
};

/* Intended and kept: at the end of every parse, of a failed one too. */
struct ParserCleanup {
    ParserCleanup() = default;
    ~ParserCleanup() { xmlCleanupParser(); }
    ParserCleanup(const ParserCleanup &) = delete;
    ParserCleanup &operator=(const ParserCleanup &) = delete;
};

/* A view of a text of libxml2; null is the empty one. */
const char *textOf(const xmlChar *text) {
    return text != nullptr ? reinterpret_cast<const char *>(text) : "";
}

/* Of the first child alone: an element without text in front of its own children has none. Nor has
 * an entity: a long one that is used often would grow beyond all that was sent. */
const char *contentOf(const xmlNode *child) {
    const bool isText = child != nullptr && child->type != XML_ENTITY_REF_NODE;
    return isText ? textOf(child->content) : "";
}

/* As strtol gives it where a long has 32 bits. */
int numberOf(const char *text) {
    const long number = std::strtol(text, nullptr, kDecimal);
    return static_cast<int>(
        std::clamp<long>(number, std::numeric_limits<int>::min(), std::numeric_limits<int>::max()));
}

void addAttributes(ItemNode &node, const xmlNode &element) {
    for (const xmlAttr *attribute = element.properties; attribute != nullptr;
         attribute = attribute->next) {
        node.emplace(textOf(attribute->name), contentOf(attribute->children));
    }
}

}  // namespace

DMAParser::DMAParser() : containers(nullptr), items(nullptr), totalMatches(0), numberReturned(0) {
    auto list = std::make_unique<ItemList>();
    items = new ItemList;
    containers = list.release();
}

DMAParser::~DMAParser() = default;

int DMAParser::Parse(const char *buffer, int length) {
    const ParserCleanup cleanup;
    xmlCheckVersion(kLeastVersion);
    const std::unique_ptr<xmlDoc, FreeDocument> document(
        xmlReadMemory(buffer, length, "noname.xml", nullptr, 0));
    xmlNode *const root = document != nullptr ? xmlDocGetRootElement(document.get()) : nullptr;
    if (root == nullptr) {
        return -1;
    }
    numberReturned = 0;
    totalMatches = 0;
    try {
        prcXMLNode(root);
    } catch (const std::bad_alloc &) {
        return -1;
    }
    return 0;
}

int DMAParser::Parse(DMABrowse *browse) {
    return Parse(browse->response, static_cast<int>(browse->responseSize));
}

void DMAParser::prcXMLNode(xmlNode *node) {
    for (; node != nullptr; node = node->next) {
        const std::string_view name = node->type == XML_ELEMENT_NODE ? textOf(node->name) : "";
        if (name == "container") {
            prcItem(containers, node);
        } else if (name == "item") {
            prcItem(items, node);
        } else if (name == "TotalMatches" || name == "NumberReturned") {
            // Intended and kept: both counts come into one member, the later one stays.
            if (node->children != nullptr) {
                totalMatches = numberOf(contentOf(node->children));
            }
        } else if (node->type != XML_ENTITY_REF_NODE) {
            // Entities may refer to entities, ten times each: a walk through a few lines of them
            // would not end.
            prcXMLNode(node->children);
        }
    }
}

void DMAParser::prcItem(ItemList *list, xmlNode *element) {
    auto node = std::make_unique<ItemNode>();
    if (std::string_view(textOf(element->name)) == "res" && element->children != nullptr) {
        node->emplace("res", contentOf(element->children));
    }
    addAttributes(*node, *element);
    for (xmlNode *child = element->children; child != nullptr; child = child->next) {
        if (child->type != XML_ELEMENT_NODE) {
            continue;
        }
        if (std::string_view(textOf(child->name)) != "res") {
            node->emplace(textOf(child->name), contentOf(child->children));
            continue;
        }
        if (node->children == nullptr) {
            node->iniChildList();
        }
        prcItem(node->children, child);
    }
    list->push_back(node.get());
    static_cast<void>(node.release());
}
