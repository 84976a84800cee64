/* usage: generate_catalogue LOCATION COUNT   (sqlite:/path/to/new.db 1000000) */
#include <chrono>
#include <cstdio>
#include <cstdlib>

#include "generator.h"

int main(int argc, char **argv) {
    const long count = argc == 3 ? std::strtol(argv[2], nullptr, 10) : 0;
    if (count <= 0) {
        std::fputs("usage: generate_catalogue LOCATION COUNT\n", stderr);
        return 2;
    }
    try {
        const auto start = std::chrono::steady_clock::now();
        const auto seconds = [start] {
            return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
        };
        auto catalogue = zano::mediadb::openCatalogue(argv[1]);
        zano::bench::fill(*catalogue, count, [&](std::int64_t done) {
            if (done % 100000 == 0 || done == count) {
                std::printf("%ld songs, %.1f s\n", static_cast<long>(done), seconds());
            }
        });
        std::printf("with indexes: %.1f s\n", seconds());
        return 0;
    } catch (const std::exception &error) {
        std::fprintf(stderr, "generate_catalogue: %s\n", error.what());
        return 1;
    }
}
