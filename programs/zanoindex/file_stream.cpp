#include "file_stream.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <taglib/tbytevector.h>
#include <algorithm>
#include <cerrno>
#include <cstring>

namespace zano::index {

FileStream::FileStream(const std::string &path)
    : path_(path), file_(open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOCTTY | O_NONBLOCK)) {
    struct stat status = {};
    if (!file_ || fstat(file_.get(), &status) != 0) {
        error_ = errno;
        file_ = Descriptor();
    } else if (!S_ISREG(status.st_mode)) {
        error_ = S_ISDIR(status.st_mode) ? EISDIR : EINVAL;
        file_ = Descriptor();
    }
    length_ = status.st_size;
}

TagLib::ByteVector FileStream::readBlock(unsigned long length) {
    if (position_ >= length_ || length == 0) {
        return {};
    }
    // A damaged file may ask for gigabytes; there are no more bytes than it has.
    const auto wanted = std::min(length, static_cast<unsigned long>(length_ - position_));
    TagLib::ByteVector result(static_cast<unsigned int>(wanted), '\0');
    const auto got = readAt(position_, result.data(), wanted);
    result.resize(static_cast<unsigned int>(got));
    position_ += static_cast<long>(got);
    return result;
}

void FileStream::seek(long offset, Position origin) {
    const long base = origin == Beginning ? 0 : origin == Current ? position_ : length_;
    position_ = std::max(0L, base + offset);
}

std::size_t FileStream::readAt(long offset, char *out, std::size_t size) {
    std::size_t done = 0;
    while (done < size) {
        const long at = offset + static_cast<long>(done);
        const long start = at - at % static_cast<long>(kBlockBytes);
        const auto &block = blockAt(start);
        const auto skipped = static_cast<std::size_t>(at - start);
        if (skipped >= block.size) {
            break;
        }
        const auto count = std::min(size - done, block.size - skipped);
        std::memcpy(out + done, block.bytes.data() + skipped, count);
        done += count;
    }
    return done;
}

const FileStream::Block &FileStream::blockAt(long start) {
    Block *oldest = blocks_.data();
    for (auto &block : blocks_) {
        if (block.start == start) {
            block.lastUse = ++uses_;
            return block;
        }
        if (block.lastUse < oldest->lastUse) {
            oldest = &block;
        }
    }
    const auto count = pread(file_.get(), oldest->bytes.data(), kBlockBytes, start);
    if (count < 0) {
        error_ = errno;
    }
    oldest->start = start;
    oldest->size = count < 0 ? 0 : static_cast<std::size_t>(count);
    oldest->lastUse = ++uses_;
    return *oldest;
}

}  // namespace zano::index
