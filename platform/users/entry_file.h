/* Reads files in the format of passwd(5) and group(5) with the C library's own readers. */
#pragma once

#include <cerrno>
#include <cstddef>
#include <cstdio>
#include <memory>
#include <vector>

namespace zano::users {

/* Calls what wants a buffer for the texts of an entry, with larger ones until one suffices. */
template <typename Call>
int withBuffer(std::vector<char> &buffer, Call call) {
    constexpr std::size_t kFirstSize = 1024;
    constexpr std::size_t kLargestSize = std::size_t{1} << 20U;
    if (buffer.empty()) {
        buffer.resize(kFirstSize);
    }
    int error = call(buffer.data(), buffer.size());
    while (error == ERANGE && buffer.size() < kLargestSize) {
        buffer.resize(2 * buffer.size());
        error = call(buffer.data(), buffer.size());
    }
    return error;
}

/* The entries of a file in their order; lines that are none are passed over. `Read` is fgetpwent_r
 * or fgetgrent_r. */
template <typename Entry, auto Read>
class EntryFile {
  public:
    explicit EntryFile(const char *path)
        : file_(std::fopen(path, "re")), error_(file_ == nullptr ? errno : 0) {}

    /* The errno of a file that could not be opened or read on; 0 at the file's end. */
    int error() const { return error_; }

    /* Null behind the last one and after a failure. Valid until the next call. */
    const Entry *next() {
        if (file_ == nullptr) {
            return nullptr;
        }
        Entry *found = nullptr;
        error_ = withBuffer(buffer_, [&](char *buffer, std::size_t size) {
            return Read(file_.get(), &entry_, buffer, size, &found);
        });
        if (error_ == ENOENT) {
            error_ = 0;
        }
        return found;
    }

  private:
    struct Close {
        void operator()(std::FILE *file) const { std::fclose(file); }
    };

    std::unique_ptr<std::FILE, Close> file_;
    int error_;
    Entry entry_{};
    std::vector<char> buffer_;
};

}  // namespace zano::users
