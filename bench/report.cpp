#include "report.h"

#include <algorithm>
#include <cstdio>
#include <exception>
#include <limits>

namespace zano::bench {
namespace {

/* Whatever else the machine does only ever adds to a time. */
double leastOf(const std::vector<double> &times) {
    return *std::min_element(times.begin(), times.end());
}

}  // namespace

bool RatioReporter::ReportContext(const Context &) {
    return true;
}

void RatioReporter::ReportRuns(const std::vector<Run> &runs) {
    for (const Run &run : runs) {
        if (run.error_occurred) {
            std::fprintf(stderr, "%s: %s\n", run.benchmark_name().c_str(),
                         run.error_message.c_str());
            continue;
        }
        if (run.run_type != Run::RT_Iteration) {
            continue;
        }
        const std::string &name = run.run_name.function_name;
        const size_t slash = name.rfind('/');
        const std::string question = name.substr(0, slash);
        const std::string way = name.substr(slash + 1);
        if (times_.find(question) == times_.end()) {
            questions_.push_back(question);
        }
        const double microseconds =
            run.real_accumulated_time / static_cast<double>(run.iterations) * 1e6;
        if (way == "library") {
            times_[question].library.push_back(microseconds);
        } else {
            times_[question].raw[way].push_back(microseconds);
        }
    }
}

void RatioReporter::Finalize() {
    std::printf("| question | library, µs | by hand, µs | ratio |\n|---|---:|---:|---:|\n");
    for (const std::string &question : questions_) {
        const Times &times = times_[question];
        double best = std::numeric_limits<double>::infinity();
        for (const auto &[way, values] : times.raw) {
            best = std::min(best, leastOf(values));
        }
        if (times.library.empty() || times.raw.empty()) {
            continue;
        }
        const double library = leastOf(times.library);
        std::printf("| %s | %.1f | %.1f | %.2f |\n", question.c_str(), library, best,
                    library / best);
    }
}

int runComparison(int argc, char **argv, const char *name,
                  const std::function<void(const std::string &location)> &add) {
    if (argc < 2 || argv[1][0] == '-') {
        std::fprintf(stderr, "usage: %s LOCATION [options of Google Benchmark]\n", name);
        return 2;
    }
    try {
        add(argv[1]);
        argv[1] = argv[0];
        int count = argc - 1;
        benchmark::Initialize(&count, argv + 1);
        RatioReporter reporter;
        benchmark::RunSpecifiedBenchmarks(&reporter);
        return 0;
    } catch (const std::exception &error) {
        std::fprintf(stderr, "%s: %s\n", name, error.what());
        return 1;
    }
}

}  // namespace zano::bench
