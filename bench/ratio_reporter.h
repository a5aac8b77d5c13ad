// A console reporter that also prints, after the run, the ratio of chosen
// benchmarks to their reference measured in the same process.
#ifndef LODESTACK_BENCH_RATIO_REPORTER_H
#define LODESTACK_BENCH_RATIO_REPORTER_H

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
      if (run.run_type == Run::RT_Iteration && !run.error_occurred)
        nanos_[run.benchmark_name()] = run.GetAdjustedCPUTime();
    }
    ConsoleReporter::ReportRuns(runs);
  }

  void Finalize() override {
    ConsoleReporter::Finalize();
    std::printf("\nratios measured in this run:\n");
    for (const Pair& p : pairs_) {
      auto a = nanos_.find(p.name);
      auto b = nanos_.find(p.reference);
      if (a == nanos_.end() || b == nanos_.end() || b->second <= 0) {
        std::printf("  %-40s / %-32s  (not measured)\n", p.name.c_str(), p.reference.c_str());
        continue;
      }
      const double ratio = a->second / b->second;
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
  std::vector<Pair> pairs_;
  std::map<std::string, double> nanos_;
};

}  // namespace lodestack_bench

#endif  // LODESTACK_BENCH_RATIO_REPORTER_H
