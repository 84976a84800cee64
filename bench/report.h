/* Prints the times of each question side by side, with their ratio, as a table in Markdown. */
#pragma once

#include <benchmark/benchmark.h>

#include <functional>
#include <map>
#include <string>
#include <vector>

namespace zano::bench {

/* Benchmarks are named "question/library" and "question/raw", "question/raw 2" and so on; with
 * several raw ones the fastest counts. The least times of all repetitions are compared. */
class RatioReporter : public benchmark::BenchmarkReporter {
  public:
    bool ReportContext(const Context &context) override;
    void ReportRuns(const std::vector<Run> &runs) override;
    void Finalize() override;

  private:
    struct Times {
        std::vector<double> library;
        std::map<std::string, std::vector<double>> raw;
    };
    std::vector<std::string> questions_;
    std::map<std::string, Times> times_;
};

/* The main function of a program "NAME CATALOGUE [Google Benchmark's options]": add(catalogue)
 * registers the benchmarks, which then run and are reported. The exit status. */
int runComparison(int argc, char **argv, const char *name,
                  const std::function<void(const std::string &location)> &add);

}  // namespace zano::bench
