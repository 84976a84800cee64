#include "answer_reader.h"

#include <vorelix/upnp/dmaparser.h>

#include <algorithm>
#include <charconv>
#include <iterator>

#include "answer_repair.h"

namespace vorelix {

namespace {

/* A parser that releases what it made. */
class Parser : public DMAParser {
  public:
    ~Parser() override {
        release(containers);
        release(items);
    }
    Parser() = default;
    Parser(const Parser &) = delete;
    Parser &operator=(const Parser &) = delete;

    bool parse(std::string_view text) {
        return Parse(text.data(), static_cast<int>(text.size())) == 0;
    }

  private:
    static void release(ItemList *list) {
        for (ItemNode *const node : *list) {
            ItemList *const children = node->children;
            node->children = nullptr;
            delete node;
            if (children != nullptr) {
                release(children);
            }
        }
        delete list;
    }
};

/* Where a prefix was never declared libxml2 leaves it in the name. */
Values valuesOf(const ItemNode &node) {
    Values values;
    for (const auto &[key, value] : node) {
        values.emplace(key.substr(key.rfind(':') + 1), value);
    }
    return values;
}

void addResources(const ItemNode &node, std::vector<Values> &resources) {
    if (node.children == nullptr) {
        return;
    }
    for (const ItemNode *const child : *node.children) {
        resources.push_back(valuesOf(*child));
        addResources(*child, resources);
    }
}

void addObjects(const Parser &parser, std::vector<MediaObject> &objects) {
    for (const ItemList *const list : {parser.containers, parser.items}) {
        for (const ItemNode *const node : *list) {
            MediaObject &object = objects.emplace_back();
            object.isContainer = list == parser.containers;
            object.values = valuesOf(*node);
            addResources(*node, object.resources);
        }
    }
}

/* Behind a start tag that ends so, up to the next "<"; "" when there is none. */
std::string_view elementText(std::string_view body, std::string_view tag) {
    const std::size_t start = body.find(tag);
    if (start == body.npos) {
        return {};
    }
    body.remove_prefix(start + tag.size());
    return body.substr(0, body.find('<'));
}

bool isFault(std::string_view body, BrowseAnswer &answer) {
    if (body.find("Fault>") == body.npos && body.find("errorCode>") == body.npos) {
        return false;
    }
    const std::string_view code = elementText(body, "errorCode>");
    std::from_chars(code.data(), code.data() + code.size(), answer.faultCode);
    answer.faultText = elementText(body, "errorDescription>");
    answer.kind = BrowseAnswer::Kind::Fault;
    return true;
}

bool isBrowseAnswer(std::string_view body) {
    constexpr std::string_view kSigns[] = {"BrowseResponse", "<DIDL-Lite", "NumberReturned>"};
    return std::any_of(std::begin(kSigns), std::end(kSigns),
                       [&](std::string_view sign) { return body.find(sign) != body.npos; });
}

/* Parsed as it is; false when it is no XML, or has no object but hides some. */
bool parsed(std::string_view body, BrowseAnswer &answer) {
    Parser parser;
    if (!parser.parse(body)) {
        return false;
    }
    addObjects(parser, answer.objects);
    answer.total = parser.totalMatches;
    return !answer.objects.empty() ||
           (body.find("&lt;DIDL-Lite") == body.npos && body.find("<![CDATA[") == body.npos);
}

void parseObjects(std::string_view body, BrowseAnswer &answer) {
    for (const std::string &text : objectTexts(body)) {
        Parser parser;
        if (parser.parse(text)) {
            addObjects(parser, answer.objects);
        } else {
            ++answer.lost;
        }
    }
    std::stable_partition(answer.objects.begin(), answer.objects.end(),
                          [](const MediaObject &object) { return object.isContainer; });
    const std::string_view total = elementText(body, "TotalMatches>");
    std::from_chars(total.data(), total.data() + total.size(), answer.total);
}

}  // namespace

std::string MediaObject::value(const std::string &key) const {
    const auto found = values.find(key);
    return found != values.end() ? found->second : std::string();
}

BrowseAnswer readBrowseAnswer(std::string_view body) {
    BrowseAnswer answer;
    bool isRead = parsed(body, answer);
    if (!isRead) {
        answer.isRepaired = true;
        const std::string copy = repaired(body);
        isRead = parsed(copy, answer);
        if (!isRead) {
            parseObjects(copy, answer);
            isRead = !answer.objects.empty();
        }
    }
    if (isRead && (!answer.objects.empty() || (!isFault(body, answer) && isBrowseAnswer(body)))) {
        answer.kind = BrowseAnswer::Kind::Objects;
    } else if (!isRead) {
        isFault(body, answer);
    }
    return answer;
}

}  // namespace vorelix
