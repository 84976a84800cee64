#include <libxml/entities.h>
#include <libxml/parser.h>
#include <libxml/tree.h>
#include <vorelix/upnp/dmaparser.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <memory>
#include <new>
#include <string_view>
#include <utility>
#include <vector>

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

bool isNamed(const xmlNode &node, std::string_view name) {
    return textOf(node.name) == name;
}

/* What may still be taken through entities: a few lines of them, each of which names another ten
 * times, would grow beyond memory and time. Looking for the end of a text is bounded too. */
class Allowance {
  public:
    explicit Allowance(std::size_t bytes) : left_(bytes), looks_(kLooks * bytes) {}

    bool spend(std::size_t bytes) {
        const bool isEnough = bytes <= left_;
        left_ -= isEnough ? bytes : 0;
        return isEnough;
    }

    bool spendLengthOf(const char *text) {
        const std::size_t size =
            strnlen(text, static_cast<std::size_t>(std::min<std::uint64_t>(left_ + 1, looks_)));
        const bool isSeen = size < looks_;
        looks_ -= size;
        return isSeen && spend(size);
    }

    /* The text itself, or "" when it is too long. */
    const char *spendOn(const char *text) { return spendLengthOf(text) ? text : ""; }

  private:
    static constexpr std::uint64_t kLooks = 16;

    std::size_t left_;
    std::uint64_t looks_;
};

/* As strtol gives it where a long has 32 bits. */
int numberOf(const char *text) {
    const long number = std::strtol(text, nullptr, kDecimal);
    return static_cast<int>(
        std::clamp<long>(number, std::numeric_limits<int>::min(), std::numeric_limits<int>::max()));
}

/* Reads a text as xmlReadMemory does, but for what would grow beyond it: namespaces that a document
 * type gives to elements, which libxml2 copies for each, and parameter entities. */
class DocumentReader {
  public:
    DocumentReader(const char *buffer, int length)
        : buffer_(buffer),
          length_(length),
          allowance_(kBytesInUtf8 * static_cast<std::size_t>(std::max(length, 0))) {}

    std::unique_ptr<xmlDoc, FreeDocument> read() {
        const std::unique_ptr<xmlParserCtxt, FreeContext> context(length_ > 0 ? xmlNewParserCtxt()
                                                                              : nullptr);
        if (context == nullptr) {
            return nullptr;
        }
        context->_private = this;
        startElement_ = std::exchange(context->sax->startElementNs, start);
        parameterEntity_ = std::exchange(context->sax->getParameterEntity, parameterEntity);
        return std::unique_ptr<xmlDoc, FreeDocument>(
            xmlCtxtReadMemory(context.get(), buffer_, length_, "noname.xml", nullptr, 0));
    }

  private:
    struct FreeContext {
        void operator()(xmlParserCtxt *context) const { xmlFreeParserCtxt(context); }
    };

    static constexpr std::size_t kBytesInUtf8 = 3;  // at most, of each byte of a text
    static constexpr std::size_t kShortestReference = std::string_view("%p;").size();
    static constexpr std::size_t kShortestNamespace = std::string_view("xmlns=''").size();

    static DocumentReader &of(void *context) {
        return *static_cast<DocumentReader *>(static_cast<xmlParserCtxt *>(context)->_private);
    }

    static void start(void *context, const xmlChar *name, const xmlChar *prefix, const xmlChar *uri,
                      int namespaceCount, const xmlChar **namespaces, int attributeCount,
                      int defaultedCount, const xmlChar **attributes) {
        DocumentReader &reader = of(context);
        bool isEnough =
            reader.allowance_.spend(kShortestNamespace * static_cast<std::size_t>(namespaceCount));
        for (int i = 0; isEnough && i < 2 * namespaceCount; ++i) {
            isEnough = reader.allowance_.spendLengthOf(textOf(namespaces[i]));
        }
        reader.startElement_(context, name, prefix, uri, isEnough ? namespaceCount : 0, namespaces,
                             attributeCount, defaultedCount, attributes);
    }

    static xmlEntity *parameterEntity(void *context, const xmlChar *name) {
        DocumentReader &reader = of(context);
        xmlEntity *const entity = reader.parameterEntity_(context, name);
        const auto length = static_cast<std::size_t>(entity != nullptr ? entity->length : 0);
        return reader.allowance_.spend(kShortestReference + length) ? entity : nullptr;
    }

    const char *buffer_;
    int length_;
    Allowance allowance_;
    startElementNsSAX2Func startElement_ = nullptr;
    getParameterEntitySAXFunc parameterEntity_ = nullptr;
};

/* A node that is not on a list yet, with the resources on its own list. */
struct DeleteTree {
    void operator()(ItemNode *node) const {
        if (node->children != nullptr) {
            std::for_each(node->children->begin(), node->children->end(), *this);
        }
        delete node;
    }
};

/* Fills the lists of a parser from a tree. A reference to an entity is a node whose children are
 * the declaration and, as its siblings, those that follow it in the document; below each of them
 * stands what the entity holds. */
class Walk {
  public:
    Walk(DMAParser &parser, std::size_t allowance)
        : parser_(parser), steps_(allowance), bytes_(allowance) {}

    /* Of a node, its following siblings and all that is below them. On a stack of its own, for
     * entities may lead round in a circle until the allowance is spent. */
    void siblings(xmlNode *first) {
        std::vector<Place> places{{first, false}};
        while (!places.empty()) {
            const Place place = places.back();
            places.pop_back();
            if (place.node == nullptr || (place.inEntity && !steps_.spend(1))) {
                continue;
            }
            places.push_back({place.node->next, place.inEntity});
            if (!take(place)) {
                const bool isReference = place.node->type == XML_ENTITY_REF_NODE;
                places.push_back({place.node->children, place.inEntity || isReference});
            }
        }
    }

    void item(ItemList &list, const xmlNode &element, bool inEntity) {
        if (inEntity && !bytes_.spend(kShortestItem)) {
            return;
        }
        std::unique_ptr<ItemNode, DeleteTree> node(new ItemNode);
        if (isNamed(element, "res") && element.children != nullptr) {
            add(*node, "res", element.children, inEntity);
        }
        if (element.type == XML_ELEMENT_NODE) {
            for (const xmlAttr *attribute = element.properties; attribute != nullptr;
                 attribute = attribute->next) {
                add(*node, textOf(attribute->name), attribute->children, inEntity);
            }
        }
        // The children of a reference are declarations: no element is among them.
        if (element.type != XML_ENTITY_REF_NODE) {
            addChildren(*node, element.children, inEntity);
        }
        list.push_back(node.get());
        static_cast<void>(node.release());
    }

  private:
    struct Place {
        xmlNode *node;
        bool inEntity;
    };

    static constexpr std::size_t kShortestItem = std::string_view("<item/>").size();

    /* Intended and kept: a node is known by its name, of whatever type it is. false: it is none of
     * those that are taken whole. */
    bool take(const Place &place) {
        const xmlNode &node = *place.node;
        const std::string_view name = textOf(node.name);
        if (name == "container") {
            item(*parser_.containers, node, place.inEntity);
        } else if (name == "item") {
            item(*parser_.items, node, place.inEntity);
        } else if (name == "TotalMatches" || name == "NumberReturned") {
            // Intended and kept: both counts come into one member, the later one stays.
            if (node.children != nullptr) {
                parser_.totalMatches = numberOf(contentOf(node.children, place.inEntity));
            }
        } else {
            return false;
        }
        return true;
    }

    void addChildren(ItemNode &node, const xmlNode *first, bool inEntity) {
        for (const xmlNode *child = first; child != nullptr; child = child->next) {
            if (child->type != XML_ELEMENT_NODE) {
                continue;
            }
            if (inEntity && !steps_.spend(1)) {
                return;
            }
            if (!isNamed(*child, "res")) {
                add(node, textOf(child->name), child->children, inEntity);
                continue;
            }
            if (node.children == nullptr) {
                node.iniChildList();
            }
            item(*node.children, *child, inEntity);
        }
    }

    void add(ItemNode &node, const char *name, const xmlNode *child, bool inEntity) {
        if (!inEntity || bytes_.spend(std::strlen(name))) {
            node.try_emplace(name, contentOf(child, inEntity));
        }
    }

    /* Of the first child alone: an element without text in front of its own children has none. */
    const char *contentOf(const xmlNode *child, bool inEntity) {
        if (child == nullptr) {
            return "";
        }
        if (child->type == XML_ENTITY_DECL) {
            return bytes_.spendOn(textOf(reinterpret_cast<const xmlEntity *>(child)->content));
        }
        const char *const content = textOf(child->content);
        const bool isReference = child->type == XML_ENTITY_REF_NODE;
        return inEntity || isReference ? bytes_.spendOn(content) : content;
    }

    DMAParser &parser_;
    Allowance steps_, bytes_;
};

/* For a tree of which nobody says how long its text was. */
constexpr std::size_t kUsualAllowance = 1 << 20;

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
    const auto document = DocumentReader(buffer, length).read();
    xmlNode *const root = document != nullptr ? xmlDocGetRootElement(document.get()) : nullptr;
    if (root == nullptr) {
        return -1;
    }
    numberReturned = 0;
    totalMatches = 0;
    try {
        Walk(*this, static_cast<std::size_t>(length)).siblings(root);
    } catch (const std::bad_alloc &) {
        return -1;
    }
    return 0;
}

int DMAParser::Parse(DMABrowse *browse) {
    return Parse(browse->response, static_cast<int>(browse->responseSize));
}

void DMAParser::prcXMLNode(xmlNode *node) {
    Walk(*this, kUsualAllowance).siblings(node);
}

void DMAParser::prcItem(ItemList *list, xmlNode *element) {
    Walk(*this, kUsualAllowance).item(*list, *element, false);
}
