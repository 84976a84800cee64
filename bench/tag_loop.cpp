/* usage: tag_loop PROCESSES < list of paths, one a line
 *
 * What zanoindex is measured against: processes that do nothing but read the tags and lengths of
 * files with TagLib. Prints files a second.
 */
#include <fileref.h>
#include <sys/wait.h>
#include <tag.h>
#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <iostream>
#include <string>
#include <vector>

namespace {

std::size_t readEvery(const std::vector<std::string> &paths, std::size_t first, std::size_t step) {
    std::size_t bytes = 0;
    for (std::size_t i = first; i < paths.size(); i += step) {
        const TagLib::FileRef file(paths[i].c_str());
        if (!file.isNull() && file.tag() != nullptr && file.audioProperties() != nullptr) {
            bytes += file.tag()->title().size() + file.tag()->artist().size();
            bytes += static_cast<std::size_t>(file.audioProperties()->lengthInMilliseconds());
        }
    }
    return bytes;
}

}  // namespace

int main(int argc, char **argv) {
    const long processes = argc == 2 ? std::strtol(argv[1], nullptr, 10) : 0;
    if (processes <= 0) {
        std::fputs("usage: tag_loop PROCESSES < list of paths\n", stderr);
        return 2;
    }
    std::vector<std::string> paths;
    for (std::string line; std::getline(std::cin, line);) {
        paths.push_back(line);
    }
    const auto start = std::chrono::steady_clock::now();
    for (long i = 0; i < processes; ++i) {
        if (fork() == 0) {
            const std::size_t bytes =
                readEvery(paths, static_cast<std::size_t>(i), static_cast<std::size_t>(processes));
            _exit(bytes > 0 ? 0 : 1);
        }
    }
    bool isRead = true;
    for (long i = 0; i < processes; ++i) {
        int status = 0;
        wait(&status);
        isRead = isRead && WIFEXITED(status) && WEXITSTATUS(status) == 0;
    }
    const double seconds =
        std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
    std::printf("%.0f\n", static_cast<double>(paths.size()) / seconds);
    return isRead ? 0 : 1;
}
