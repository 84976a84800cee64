/* The lists of the library's parser. */
#pragma once

#include <vorelix/upnp/dmaparser.h>

namespace item_lists {

/* Releases a list with all that is below, as its callers have to. */
inline void release(ItemList *list) {
    for (ItemNode *const node : *list) {
        if (node->children != nullptr) {
            release(node->children);
            node->children = nullptr;
        }
        delete node;
    }
    delete list;
}

}  // namespace item_lists
