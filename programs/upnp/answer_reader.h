/* The answer to a Browse, read with all forbearance. */
#pragma once

#include <map>
#include <string>
#include <string_view>
#include <vector>

namespace vorelix {

using Values = std::map<std::string, std::string>;

/* A folder or a song, picture or film of a server. */
struct MediaObject {
    bool isContainer = false;
    Values values;                  // as ItemNode has them; "id" and "title" may be missing
    std::vector<Values> resources;  // each with its address under "res"

    /* "" when it is not there. */
    std::string value(const std::string &key) const;
};

struct BrowseAnswer {
    enum class Kind {
        Objects,   // perhaps none
        Fault,     // the server refuses
        Unusable,  // something else than an answer to a Browse, or beyond repair
    };
    Kind kind = Kind::Unusable;
    std::vector<MediaObject> objects;  // containers first
    int total = 0;                     // as the server claims
    int lost = 0;                      // objects that are beyond repair
    bool isRepaired = false;
    int faultCode = 0;  // 0: it gave none
    std::string faultText;
};

/* Reads a body as DMAgent leaves it. Text that is no XML is repaired in a copy and read again; when
 * that does not help, each object is read by itself and those that cannot be are lost. */
BrowseAnswer readBrowseAnswer(std::string_view body);

}  // namespace vorelix
