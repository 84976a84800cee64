#include "notices.h"

#include <unistd.h>
#include <array>
#include <vector>

#include "formats.h"
#include "text.h"

namespace zano::index {
namespace {

constexpr int kNoticesAtOnce = 500;

struct OperationRow {
    int operation;
    const char *text;
    bool mayRemovePath;
    bool mayRemoveFormer;
};

/* The numbers are part of the interface of KLIBZanoFileIndexAdd. */
constexpr std::array kOperations = {
    OperationRow{1, "was added", false, false},
    OperationRow{2, "was deleted", true, false},
    OperationRow{4, "was changed and moved", false, true},
    OperationRow{5, "was changed", false, false},
};
constexpr OperationRow kOther = {0, "was touched in an unknown way", false, false};

const OperationRow &rowOf(int operation) {
    for (const auto &row : kOperations) {
        if (row.operation == operation) {
            return row;
        }
    }
    return kOther;
}

bool isSong(const std::string &path) {
    return path.starts_with('/') && formatOfName(path) != Format::kNone;
}

/* A file that is not there loses its row only when the notice says that it is gone; else its
 * disk may just not be mounted. */
void addSong(std::vector<std::string> &songs, const std::string &path, bool mayRemove) {
    if (isSong(path) && (mayRemove || access(path.c_str(), F_OK) == 0)) {
        songs.push_back(path);
    }
}

}  // namespace

std::string noticeText(const mediadb::Notice &notice) {
    std::string text = isSong(notice.path) ? "song " : "playlist ";
    text += printable(notice.path) + " " + rowOf(notice.operation).text;
    if (!notice.formerPath.empty()) {
        text += " from " + printable(notice.formerPath);
    }
    return text;
}

void consumeNotices(Session &session, Indexer &indexer,
                    const std::function<void(const mediadb::Notice &)> &onNotice) {
    while (!session.stop.isMade()) {
        const auto notices = session.catalogue.notices(kNoticesAtOnce);
        if (notices.empty()) {
            return;
        }
        std::vector<std::string> songs;
        for (const auto &notice : notices) {
            const auto &row = rowOf(notice.operation);
            addSong(songs, notice.path, row.mayRemovePath);
            addSong(songs, notice.formerPath, row.mayRemoveFormer);
            onNotice(notice);
        }
        if (!songs.empty()) {
            indexer.refresh(songs);
        }
        Batch batch(session.catalogue);
        for (const auto &notice : notices) {
            session.catalogue.removeNotice(notice.id);
            session.summary.notices.push_back(notice);
        }
        batch.commit();
    }
}

}  // namespace zano::index
