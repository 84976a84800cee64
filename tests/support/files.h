/* Files of tests. */
#pragma once

#include <gtest/gtest.h>
#include <sys/resource.h>

#include <csignal>
#include <cstddef>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <initializer_list>
#include <iterator>
#include <string>
#include <vector>

namespace files {

inline void write(const std::string &path, const std::string &text) {
    std::ofstream(path, std::ios::binary) << text;
}

/* "(no file)" where there is none. */
inline std::string read(const std::string &path) {
    std::ifstream file(path, std::ios::binary);
    return file ? std::string(std::istreambuf_iterator<char>(file), {}) : "(no file)";
}

/* How many files and folders a folder holds. */
inline std::ptrdiff_t countIn(const std::string &folder) {
    return std::distance(std::filesystem::directory_iterator(folder), {});
}

/* A folder of its own, by its path without links; removed at the end. */
class Folder {
  public:
    Folder() {
        EXPECT_NE(mkdtemp(path_.data()), nullptr);
        path_ = std::filesystem::canonical(path_);
    }
    ~Folder() { std::filesystem::remove_all(path_); }
    Folder(const Folder &) = delete;
    Folder &operator=(const Folder &) = delete;
    std::string path(const std::string &name) const { return path_ + "/" + name; }

  private:
    std::string path_ = testing::TempDir() + "vorelix_XXXXXX";
};

/* Fixed paths at which nothing stands at first, but whose folders are there, nor at the end. */
class Places {
  public:
    Places(std::initializer_list<const char *> paths) : paths_(paths.begin(), paths.end()) {
        for (const std::filesystem::path &path : paths_) {
            std::filesystem::create_directories(path.parent_path());
            std::filesystem::remove_all(path);
        }
    }
    ~Places() {
        for (const std::filesystem::path &path : paths_) {
            std::filesystem::remove_all(path);
        }
    }
    Places(const Places &) = delete;
    Places &operator=(const Places &) = delete;

  private:
    std::vector<std::filesystem::path> paths_;
};

/* While it is there, no file grows beyond so many bytes, as on a disk that is full. */
class FullDisk {
  public:
    explicit FullDisk(rlim_t sizeBytes) : handler_(std::signal(SIGXFSZ, SIG_IGN)) {
        EXPECT_EQ(getrlimit(RLIMIT_FSIZE, &usual_), 0);
        const struct rlimit small { sizeBytes, usual_.rlim_max };
        EXPECT_EQ(setrlimit(RLIMIT_FSIZE, &small), 0);
    }
    ~FullDisk() {
        EXPECT_EQ(setrlimit(RLIMIT_FSIZE, &usual_), 0);
        std::signal(SIGXFSZ, handler_);
    }
    FullDisk(const FullDisk &) = delete;
    FullDisk &operator=(const FullDisk &) = delete;

  private:
    struct rlimit usual_ {};
    void (*handler_)(int);
};

}  // namespace files
