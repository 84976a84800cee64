/* A file as TagLib reads it: read-only, with whole blocks kept, since tags are read in small
 * pieces back and forth around the file's ends. */
#pragma once

#include <taglib/tiostream.h>
#include <array>
#include <cstdint>
#include <string>

#include "descriptor.h"

namespace zano::index {

class FileStream : public TagLib::IOStream {
  public:
    /* Opens a file for reading. isOpen() tells; error() is then an errno value. What is not a
     * regular file is not opened. The path must stay. */
    explicit FileStream(const std::string &path);

    /* The errno value of the last failure of the disk or the system, 0 when there was none. */
    int error() const { return error_; }

    TagLib::FileName name() const override { return path_.c_str(); }
    TagLib::ByteVector readBlock(unsigned long length) override;
    bool readOnly() const override { return true; }
    bool isOpen() const override { return static_cast<bool>(file_); }
    void seek(long offset, Position origin) override;
    long tell() const override { return position_; }
    long length() override { return length_; }

    // Nothing is ever written.
    void writeBlock(const TagLib::ByteVector &) override {}
    void insert(const TagLib::ByteVector &, unsigned long, unsigned long) override {}
    void removeBlock(unsigned long, unsigned long) override {}
    void truncate(long) override {}

  private:
    static constexpr std::size_t kBlockBytes = 8192;
    struct Block {
        long start = -1;
        std::size_t size = 0;
        std::uint64_t lastUse = 0;
        std::array<char, kBlockBytes> bytes;
    };

    const Block &blockAt(long start);
    std::size_t readAt(long offset, char *out, std::size_t size);

    const std::string &path_;
    Descriptor file_;
    int error_ = 0;
    long length_ = 0;
    long position_ = 0;
    std::uint64_t uses_ = 0;
    std::array<Block, 4> blocks_;
};

}  // namespace zano::index
