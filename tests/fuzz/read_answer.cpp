#include <vorelix/upnp/dmaparser.h>

#include <algorithm>
#include <cstring>
#include <iterator>
#include <string>
#include <string_view>

#include "readers.h"

namespace vorelix::fuzz {
namespace {

constexpr std::string_view kEntities[] = {"&apos;", "&quot;", "&nbsp;", "&lt;", "&gt;", "&amp;"};

std::string withoutOtherEntities(std::string text) {
    for (std::size_t place = text.find('&'); place != std::string::npos;
         place = text.find('&', place + 1)) {
        const std::string_view rest = std::string_view(text).substr(place);
        if (std::none_of(std::begin(kEntities), std::end(kEntities),
                         [&](std::string_view entity) { return rest.starts_with(entity); })) {
            text[place] = '+';
        }
    }
    return text;
}

/* Asks the nodes of a list, and releases it with all that is below; how many bytes the texts in it
 * have. */
std::size_t consume(ItemList *list) {
    std::size_t size = 0;
    for (ItemNode *const node : *list) {
        for (const auto &[key, value] : *node) {
            require(node->getValueByKey(key) == value);
            size += key.size() + value.size();
        }
        node->getValueByKey("nowhere");
        if (node->children != nullptr) {
            size += consume(node->children);
            node->children = nullptr;
        }
        delete node;
    }
    delete list;
    return size;
}

/* What a reader keeps of an answer is no more than was sent, and as much again through entities,
 * but for Latin-1 that becomes UTF-8. */
void parse(DMABrowse &browse) {
    DMAParser parser;
    parser.numberReturned = 0;
    const int result = parser.Parse(&browse);
    require(result == 0 || result == -1);
    require(result == 0 || (parser.containers->empty() && parser.items->empty()));
    require(parser.numberReturned == 0);
    const std::size_t kept = consume(parser.containers) + consume(parser.items);
    const std::size_t inUtf8 = std::strstr(browse.response, "encoding") == nullptr ? 1 : 3;
    require(kept <= 2 * inUtf8 * browse.responseSize);
}

}  // namespace

void readAsAnswer(const std::uint8_t *bytes, std::size_t size) {
    const std::string sent(reinterpret_cast<const char *>(bytes), size);
    std::string text = withoutOtherEntities(sent);
    DMABrowse browse(DMAGENT_BROWSE_DIRECTCHILDREN, "");
    browse.response = text.data();
    browse.responseSize = static_cast<unsigned int>(size);
    browse.DecodeRDataHTML();
    require(std::strlen(browse.response) <= text.size());
    parse(browse);
    text = sent;
    browse.response = text.data();
    parse(browse);
}

}  // namespace vorelix::fuzz
