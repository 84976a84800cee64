/* usage: compare_engines SONGS CALLS LOCATION LOCATION
 *
 * Puts so many calls of chance to two catalogues that generate_catalogue has made of the same
 * number of songs, and prints those that are answered differently. */
#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

#include "random_calls.h"
#include "root.h"

int main(int argc, char **argv) {
    if (argc != 5) {
        std::fputs("usage: compare_engines SONGS CALLS LOCATION LOCATION\n", stderr);
        return 2;
    }
    using namespace zano::bench;
    const int songs = std::atoi(argv[1]);
    const auto calls = static_cast<unsigned>(std::atoi(argv[2]));
    std::vector<std::string> first;
    prepareRoot(argv[3]);
    for (unsigned number = 0; number < calls; ++number) {
        first.push_back(answerOf(randomCall(number, songs)));
    }
    prepareRoot(argv[4]);
    int differences = 0;
    int failures = 0;
    long rows = 0;
    for (unsigned number = 0; number < calls; ++number) {
        const Call call = randomCall(number, songs);
        const std::string second = answerOf(call);
        const bool isFailure = second.find("failed: ") != std::string::npos;
        failures += isFailure ? 1 : 0;
        rows += static_cast<long>(std::count(second.begin(), second.end(), '\n')) - 1;
        if (first[number] != second) {
            ++differences;
            std::printf("differs: %s\n%.300s\n---\n%.300s\n", call.text().c_str(),
                        first[number].c_str(), second.c_str());
        }
    }
    std::printf("%u calls, %ld rows, %d failed, %d differ\n", calls, rows, failures, differences);
    return differences == 0 && failures == 0 ? 0 : 1;
}
