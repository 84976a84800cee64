/* Many paths in little memory: those of a scan, in byte order, each kept as what differs from
 * the one before (some 40 bytes a song with its stamp). */
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "mediadb/catalogue.h"

namespace zano::index {

struct ListedFile {
    std::string path;
    mediadb::FileStamp stamp;
    bool isKnown = false;  // the catalogue has a row of it
};

class PathList {
  public:
    void add(std::string_view path, const mediadb::FileStamp &stamp, bool isKnown);

    std::size_t size() const { return size_; }
    bool isEmpty() const { return size_ == 0; }

    /* Walks the list in the order of add(). The list must stay and not change meanwhile. */
    class Reader {
      public:
        explicit Reader(const PathList &list) : rest_(list.bytes_) {}
        /* Nothing at the end. */
        std::optional<ListedFile> next();

      private:
        std::string_view rest_;
        std::string path_;
    };

  private:
    std::string bytes_;
    std::string last_;
    std::size_t size_ = 0;
};

}  // namespace zano::index
