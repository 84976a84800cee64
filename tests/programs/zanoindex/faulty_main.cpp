/* zanoindex with a tag reader that fails on files of certain names, small limits, and small
 * batches; other files are read as ever. */
#include <fcntl.h>
#include <unistd.h>
#include <array>
#include <csignal>
#include <cstdlib>
#include <memory>
#include <stdexcept>
#include <string_view>
#include <vector>

#include "program.h"
#include "tag_reader.h"

namespace {

using zano::index::ReadAnswer;

void crash() {
    // not a null pointer, which the sanitizers would report at length
    std::raise(SIGSEGV);
}

[[noreturn]] void loopForEver() {
    volatile unsigned turns = 0;
    for (;;) {
        turns = turns + 1;
    }
}

/* As a reader that waits for a disk. */
void stall() {
    for (;;) {
        pause();
    }
}

void takeAllMemory() {
    std::vector<std::unique_ptr<char[]>> blocks;
    for (;;) {
        blocks.push_back(std::make_unique_for_overwrite<char[]>(std::size_t{1} << 20U));
    }
}

void takeMuchAtOnce() {
    const std::vector<char> block(std::size_t{4} << 30U, '\1');
    std::abort();
}

void throwError() {
    throw std::length_error("a size from a damaged file");
}

void leave() {
    _exit(3);
}

void babble() {
    constexpr std::string_view kNonsense("\x08\0\0\0nonsense", 12);
    [[maybe_unused]] const auto count = write(STDIN_FILENO, kNonsense.data(), kNonsense.size());
}

struct Fault {
    std::string_view name;
    void (*happen)();
};

constexpr std::array kFaults = {
    Fault{"crash", crash},          Fault{"hang", loopForEver},    Fault{"stall", stall},
    Fault{"greedy", takeAllMemory}, Fault{"huge", takeMuchAtOnce}, Fault{"throw", throwError},
    Fault{"leave", leave},          Fault{"babble", babble},
};

ReadAnswer readOrFail(const std::string &path) {
    const auto name = std::string_view(path).substr(path.rfind('/') + 1);
    for (const auto &fault : kFaults) {
        if (name.starts_with(fault.name)) {
            close(open(path.c_str(), O_RDONLY | O_CLOEXEC));  // seen by who watches the folder
            fault.happen();
        }
    }
    return zano::index::readTags(path);
}

}  // namespace

int main(int argc, char **argv) {
    zano::index::ReaderLimits limits;
    limits.memoryBytes = std::size_t{256} << 20U;
    limits.time = std::chrono::seconds(3);
    return zano::index::runProgram(argc, argv, {readOrFail, limits, 10});
}
