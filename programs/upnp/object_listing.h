/* Many objects of a server, a page after the other. */
#pragma once

#include <string>
#include <vector>

#include "content_directory.h"

namespace vorelix {

constexpr int kMostObjects = 100000;

struct ObjectListing {
    std::vector<MediaObject> objects;
    int total = 0;  // as they were counted when there are no more, else as the server claims
    int lost = 0;
    bool isRepaired = false;
    std::string complaint;  // why it is not all that was asked for; "" when it is
};

/* `limit` objects of a container from number `offset`, as far as there are so many. Servers give
 * less than is asked for and claim totals that never come true, so it goes on behind what came,
 * until a page is empty or has no object that is new, or after 2000 pages. A page that fails
 * behind the first is a complaint; the first one throws ServerFailure. */
ObjectListing listObjects(const ContentDirectory &directory, const std::string &id, int offset,
                          int limit);

}  // namespace vorelix
