/* What every step of a run needs: where songs go, who is told, who may stop it. */
#pragma once

#include <string>

#include "mediadb/catalogue.h"
#include "progress.h"
#include "stop.h"
#include "summary.h"

namespace zano::index {

struct Session {
    mediadb::Catalogue &catalogue;
    Progress &progress;
    const StopRequest &stop;
    Summary summary;

    /* Counts and names a file that was not read, or a folder that was not looked at. */
    void fileFailed(const std::string &path, const std::string &reason);
    void folderFailed(const std::string &path, const std::string &reason);
};

/* A batch that is undone unless committed. */
class Batch {
  public:
    explicit Batch(mediadb::Catalogue &catalogue) : catalogue_(catalogue) { catalogue_.begin(); }
    Batch(const Batch &) = delete;
    Batch &operator=(const Batch &) = delete;
    ~Batch() {
        if (isOpen_) {
            catalogue_.rollback();
        }
    }
    void commit() {
        catalogue_.commit();
        isOpen_ = false;
    }

  private:
    mediadb::Catalogue &catalogue_;
    bool isOpen_ = true;
};

}  // namespace zano::index
