#include "object_listing.h"

#include <algorithm>
#include <cstdint>
#include <limits>
#include <set>

namespace vorelix {

namespace {

constexpr int kPageSize = 500;
constexpr int kMostPages = 2000;

/* Adds the objects whose ids were not seen before this page; how many these are. */
int addNew(std::vector<MediaObject> &page, std::set<std::string> &seen, ObjectListing &listing) {
    std::set<std::string> ids;
    int count = 0;
    for (MediaObject &object : page) {
        const std::string id = object.value("id");
        ids.insert(id);
        if (seen.find(id) == seen.end()) {
            listing.objects.push_back(std::move(object));
            ++count;
        }
    }
    seen.merge(ids);
    return count;
}

int clamped(std::int64_t number) {
    return static_cast<int>(std::min<std::int64_t>(number, std::numeric_limits<int>::max()));
}

}  // namespace

ObjectListing listObjects(const ContentDirectory &directory, const std::string &id, int offset,
                          int limit) {
    ObjectListing listing;
    std::set<std::string> seen;
    std::int64_t next = offset;
    bool isEnd = false;  // nothing comes behind
    for (int pages = 0; static_cast<int>(listing.objects.size()) < limit; ++pages) {
        if (pages == kMostPages) {
            listing.complaint = shownServer(directory.server()) +
                                ": it gives less than is asked for; stopped after " +
                                std::to_string(kMostPages) + " pages";
            break;
        }
        const int wanted = std::min(limit - static_cast<int>(listing.objects.size()), kPageSize);
        BrowseAnswer page;
        try {
            page = directory.children(id, clamped(next), wanted);
        } catch (const ServerFailure &failure) {
            if (next == offset) {
                throw;
            }
            listing.complaint = failure.what();
            break;
        }
        next += static_cast<std::int64_t>(page.objects.size()) + page.lost;
        listing.isRepaired = listing.isRepaired || page.isRepaired;
        listing.total = std::max(listing.total, page.total);
        isEnd = addNew(page.objects, seen, listing) == 0;
        if (isEnd) {
            break;
        }
        listing.lost += page.lost;
    }
    listing.objects.resize(std::min(listing.objects.size(), static_cast<size_t>(limit)));
    const int known = clamped(std::int64_t{offset} +
                              static_cast<std::int64_t>(listing.objects.size()) + listing.lost);
    if (!listing.objects.empty() || offset == 0) {
        listing.total = isEnd ? known : std::max(listing.total, known);
    }
    return listing;
}

}  // namespace vorelix
