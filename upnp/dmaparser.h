/* The answer to a Browse as lists of maps.
 *
 *     DMAParser parser;
 *     parser.Parse(&browse);
 *     for (ItemNode *item : *parser.items) {
 *         std::cout << item->getValueByKey("title") << ' ' << item->getValueByKey("res") << '\n';
 *     }
 *
 * Everything that a parser made belongs to the caller, for nothing is released by itself: for each
 * node of parser.containers and parser.items, delete the nodes of its `children` (a resource may
 * have some too) and then the node, which takes its list along; at last delete the two lists.
 *
 * Every Parse ends with libxml2's global cleanup, so nothing else in the process may use libxml2
 * meanwhile, another thread included. Nothing is logged. When memory runs out Parse fails; all else
 * that makes nodes or texts throws std::bad_alloc. C++ only. */
#ifndef VORELIX_UPNP_DMAPARSER_H
#define VORELIX_UPNP_DMAPARSER_H

#ifndef __cplusplus
#error "C++ only"
#endif

#include <vorelix/export.h>
#include <vorelix/upnp/dmagent.h>

#include <list>
#include <map>
#include <string>

class ItemNode;
struct _xmlNode;  // NOLINT(bugprone-reserved-identifier): libxml2's name of a node

/* Nodes in the order of the document. Releases its cells and not the nodes. */
class VORELIX_API ItemList : public std::list<ItemNode *> {
  public:
    ItemList();
    virtual ~ItemList();
    ItemList(const ItemList &) = delete;
    ItemList &operator=(const ItemList &) = delete;

    /* Writes every node to standard output, each below its number: "[0]:". For debugging. */
    void PrintContent();
};

/* A container, an item or a resource. The keys are names without their namespace prefix: first the
 * element's attributes ("id", "parentID", "childCount"), then its child elements but `res`
 * ("title", "creator", "class"), whose own attributes are left out. The first value of a key
 * stays. The value is what stands first in the element, its text as a rule, or what an entity
 * declared by the document holds; "" when that is nothing or an element. A resource has its address
 * under "res" and its attributes ("protocolInfo", "size", "duration"). */
class VORELIX_API ItemNode : public std::map<std::string, std::string> {
  public:
    ItemNode();

    /* Releases `children`, and not the nodes in it. */
    virtual ~ItemNode();

    ItemNode(const ItemNode &) = delete;
    ItemNode &operator=(const ItemNode &) = delete;

    /* Makes an empty `children`; a list that was there is not released. */
    void iniChildList();

    /* The value of a key in this node, if it has the key; else the first value that is not empty in
     * its children, in their order and by the same rule; else "". */
    std::string getValueByKey(std::string key);

    /* Writes the keys and values to standard output, and then the children. For debugging. */
    void PrintContent();

    ItemList *children = nullptr;  // its resources; null when it has none
};

class VORELIX_API DMAParser {
  public:
    DMAParser();

    /* Releases nothing. */
    virtual ~DMAParser();

    DMAParser(const DMAParser &) = delete;
    DMAParser &operator=(const DMAParser &) = delete;

    /* Reads `length` bytes of XML in which no markup of the DIDL-Lite document is escaped any more,
     * as DMAgent leaves an answer, and adds what they hold to the lists. 0; -1 when they are no XML
     * document, which libxml2 explains on standard error, or when memory runs out: the lists have
     * then what was added so far. Nodes are known by their names, processing instructions and
     * declarations too. Entities that a document declares are looked into as long as they add no
     * more than `length` bytes, and what would go beyond is empty; nothing is fetched and no file
     * is read. A null buffer gives -1. */
    int Parse(const char *buffer, int length);

    /* Reads the response of a request that was performed, which may not be null. */
    int Parse(DMABrowse *browse);

    /* Steps of Parse: add what is found in a node of libxml2, its following siblings and below
     * them; add a node made from one element to a list. Entities add up to a megabyte here. */
    void prcXMLNode(_xmlNode *node);
    void prcItem(ItemList *list, _xmlNode *element);

    ItemList *containers;
    ItemList *items;

    /* TotalMatches or NumberReturned, whichever comes last in the answer; 0 when neither does. A
     * server that follows the standard sends TotalMatches last. */
    int totalMatches;
    int numberReturned;  // always 0
};

#endif
