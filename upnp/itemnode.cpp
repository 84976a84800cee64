#include <vorelix/upnp/dmaparser.h>

#include <algorithm>
#include <iostream>
#include <new>

ItemList::ItemList() = default;

ItemList::~ItemList() = default;

void ItemList::PrintContent() {
    int number = 0;
    for (ItemNode *const node : *this) {
        std::cout << '[' << number++ << "]:" << std::endl;
        node->PrintContent();
    }
}

ItemNode::ItemNode() = default;

ItemNode::~ItemNode() {
    delete children;
}

void ItemNode::iniChildList() {
    children = new ItemList;
}

// NOLINTNEXTLINE(performance-unnecessary-value-param): the signature is given
std::string ItemNode::getValueByKey(std::string key) {
    const auto found = find(key);
    if (found != end()) {
        return found->second;
    }
    if (children != nullptr) {
        for (ItemNode *const child : *children) {
            std::string value = child->getValueByKey(key);
            if (!value.empty()) {
                return value;
            }
        }
    }
    return {};
}

void ItemNode::PrintContent() {
    int number = 0;
    for (const auto &[key, value] : *this) {
        std::cout << number++ << ": " << key << '=' << value << "  " << std::endl;
    }
    if (children != nullptr) {
        std::cout << "-- child item --" << std::endl;
        children->PrintContent();
    }
    std::cout << std::endl;
}
