// A console reporter that also prints, after the run, the ratio of chosen
// benchmarks to their reference measured in the same process.
#ifndef LODESTACK_BENCH_RATIO_REPORTER_H
#define LODESTACK_BENCH_RATIO_REPORTER_H

#include <algorithm>
#include <cstdio>
#include <map>
#include <string>
#include <utility>
#include <vector>

#include <benchmark/benchmark.h>

namespace lodestack_bench {

class RatioReporter : public benchmark::ConsoleReporter {
 public:
  // Prints "name / reference" for each pair once the run is over.
  void compare(std::string name, std::string reference, double target) {
    pairs_.push_back({std::move(name), std::move(reference), target});
  }

  void ReportRuns(const std::vector<Run>& runs) override {
    for (const Run& run : runs) {
      if (run.error_occurred) continue;
      // Under --benchmark_repetitions a benchmark reports one run per
      // repetition and then its aggregates; the median stands for it, and
      // the repetitions' own median when only those reach the reporter.
      const std::string name = run.run_name.str();
      if (run.run_type == Run::RT_Iteration)
        samples_[name].push_back(run.GetAdjustedCPUTime());
      else if (run.aggregate_name == "median")
        medians_[name] = run.GetAdjustedCPUTime();
    }
    ConsoleReporter::ReportRuns(runs);
  }

  void Finalize() override {
    ConsoleReporter::Finalize();
    std::printf("\nratios measured in this run:\n");
    for (const Pair& p : pairs_) {
      const double a = nanos(p.name);
      const double b = nanos(p.reference);
      if (a <= 0 || b <= 0) {
        std::printf("  %-40s / %-32s  (not measured)\n", p.name.c_str(), p.reference.c_str());
        continue;
      }
      const double ratio = a / b;
      std::printf("  %-40s / %-32s = %6.2f  (target <= %.1f: %s)\n", p.name.c_str(),
                  p.reference.c_str(), ratio, p.target, ratio <= p.target ? "met" : "MISSED");
    }
  }

 private:
  struct Pair {
    std::string name;
    std::string reference;
    double target;
  };
  // CPU nanoseconds per iteration of `name`; 0 when it did not run.
  double nanos(const std::string& name) const {
    auto median = medians_.find(name);
    if (median != medians_.end()) return median->second;
    auto samples = samples_.find(name);
    if (samples == samples_.end() || samples->second.empty()) return 0;
    std::vector<double> sorted = samples->second;
    std::sort(sorted.begin(), sorted.end());
    return sorted[sorted.size() / 2];
  }

  std::vector<Pair> pairs_;
  std::map<std::string, std::vector<double>> samples_;
  std::map<std::string, double> medians_;
};

}  // namespace lodestack_bench

#endif  // LODESTACK_BENCH_RATIO_REPORTER_H
