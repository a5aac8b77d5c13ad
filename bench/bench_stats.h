// Small helpers of the event-loop benchmarks: a monotonic clock in
// microseconds and percentiles of recorded samples.
#ifndef LODESTACK_BENCH_BENCH_STATS_H
#define LODESTACK_BENCH_BENCH_STATS_H

#include <time.h>

#include <algorithm>
#include <cstddef>
#include <vector>

namespace lodestack_bench {

inline double nowMicros() {
  timespec t;
  clock_gettime(CLOCK_MONOTONIC, &t);
  return t.tv_sec * 1e6 + t.tv_nsec / 1e3;
}

// The q-th quantile (0..1) of `samples` (copied, then partially sorted).
inline double quantile(std::vector<double> samples, double q) {
  if (samples.empty()) return 0;
  const size_t k = std::min(samples.size() - 1, static_cast<size_t>(q * samples.size()));
  std::nth_element(samples.begin(), samples.begin() + k, samples.end());
  return samples[k];
}

}  // namespace lodestack_bench

#endif  // LODESTACK_BENCH_BENCH_STATS_H
