/* Files of the tests below. */
#pragma once

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>

namespace users_test {

namespace fs = std::filesystem;

inline void writeFile(const std::string &path, const std::string &text) {
    std::ofstream(path, std::ios::binary) << text;
}

inline std::string readFile(const std::string &path) {
    std::ifstream file(path, std::ios::binary);
    return file ? std::string(std::istreambuf_iterator<char>(file), {}) : "(no file)";
}

/* A folder of its own, removed at the end. */
class Folder {
  public:
    Folder() { EXPECT_NE(mkdtemp(path_.data()), nullptr); }
    ~Folder() { fs::remove_all(path_); }
    Folder(const Folder &) = delete;
    Folder &operator=(const Folder &) = delete;
    std::string path(const std::string &name) const { return path_ + "/" + name; }

  private:
    std::string path_ = testing::TempDir() + "users_XXXXXX";
};

}  // namespace users_test
