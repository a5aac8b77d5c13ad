// Lateness of a 10 ms periodic schedule against its ideal instants (start +
// k x 10 ms), measured for 5 s in one run:
//   - ITimer on the poll dispatcher and on the GLib dispatcher;
//   - an absolute clock_nanosleep loop (the reference);
//   - g_timeout_add(10, ...) in a GMainLoop (relative rescheduling, a lower
//     bar).
// All four run at the same time on their own threads, so they share the
// machine's load. Reported: median and 99th percentile of the lateness, and the drift (the
// lateness of the last expiry after 5 s).
#include <glib.h>
#include <time.h>

#include <cstdio>
#include <map>
#include <string>
#include <thread>
#include <vector>

#include <benchmark/benchmark.h>

#include <lodestack/lodestack.h>

#include "bench_stats.h"

using lodestack_bench::nowMicros;
using lodestack_bench::quantile;
using namespace lodestack::core;

namespace {

constexpr double kPeriodUs = 10000;
constexpr int kExpiries = 500;  // 5 s

// Lateness of expiry k (1-based) seen at `at`.
struct Schedule {
  double start = 0;
  std::vector<double> lateness;
  void record(double at) {
    const double ideal = start + kPeriodUs * (lateness.size() + 1);
    lateness.push_back(at - ideal);
  }
  bool done() const { return lateness.size() >= static_cast<size_t>(kExpiries); }
};

std::map<std::string, double> gFigures;

void report(benchmark::State& state, const char* name, const Schedule& schedule) {
  const double median = quantile(schedule.lateness, 0.5);
  const double p99 = quantile(schedule.lateness, 0.99);
  const double drift = schedule.lateness.empty() ? 0 : schedule.lateness.back();
  const std::string prefix = std::string(name).substr(0, std::string(name).find(' ')) +
                             (std::string(name).find("poll") != std::string::npos   ? "_poll"
                              : std::string(name).find("GLib") != std::string::npos ? "_glib"
                                                                                    : "");
  state.counters[prefix + "_median_us"] = median;
  state.counters[prefix + "_p99_us"] = p99;
  state.counters[prefix + "_drift_us"] = drift;
  gFigures[std::string(name) + " median us"] = median;
  gFigures[std::string(name) + " p99 us"] = p99;
  gFigures[std::string(name) + " drift after 5 s us"] = drift;
}

struct Recorder : ITimerObserver {
  Schedule* schedule = nullptr;
  void timeout(ITimer* timer) override {
    schedule->record(nowMicros());
    if (schedule->done()) timer->stop();
  }
};

// A 10 ms ITimer on the calling thread's dispatcher of the given kind.
void runITimer(AsyncCallDispatcher::MainLoopType type, Schedule& schedule) {
  AsyncCallDispatcher::setMainLoopType(type);
  lodestack::gom::SharedPointer<IAsyncCallDispatcher> dispatcher =
      AsyncCallDispatcher::openDispatcher(AsyncCallDispatcher::MainLoopDefault);
  Recorder recorder;
  recorder.schedule = &schedule;
  lodestack::gom::SharedPointer<ITimer> timer(ITimer::create(&recorder));
  schedule.start = nowMicros();
  if (!timer || timer->start(10, 0) != 0) return;
  while (!schedule.done()) dispatcher->sleep();
}

void runClockNanosleep(Schedule& schedule) {
  timespec next;
  clock_gettime(CLOCK_MONOTONIC, &next);
  schedule.start = next.tv_sec * 1e6 + next.tv_nsec / 1e3;
  while (!schedule.done()) {
    next.tv_nsec += static_cast<long>(kPeriodUs * 1000);
    if (next.tv_nsec >= 1000000000L) {
      next.tv_nsec -= 1000000000L;
      ++next.tv_sec;
    }
    clock_nanosleep(CLOCK_MONOTONIC, TIMER_ABSTIME, &next, nullptr);
    schedule.record(nowMicros());
  }
}

// g_timeout_add's source on a context of its own (the default context
// belongs to the GLib dispatcher's thread here).
void runGTimeout(Schedule& schedule) {
  GMainContext* context = g_main_context_new();
  g_main_context_push_thread_default(context);
  GSource* source = g_timeout_source_new(10);
  g_source_set_callback(
      source,
      [](gpointer data) -> gboolean {
        auto* s = static_cast<Schedule*>(data);
        s->record(nowMicros());
        return s->done() ? G_SOURCE_REMOVE : G_SOURCE_CONTINUE;
      },
      &schedule, nullptr);
  schedule.start = nowMicros();
  g_source_attach(source, context);
  g_source_unref(source);
  while (!schedule.done()) g_main_context_iteration(context, TRUE);
  g_main_context_pop_thread_default(context);
  g_main_context_unref(context);
}

const char* const kNames[] = {"ITimer (poll back-end)", "ITimer (GLib back-end)",
                              "clock_nanosleep loop", "g_timeout_add"};

// All four schedules run at once, each on its own thread, so they see the
// same machine load.
void BM_TimersSideBySide(benchmark::State& state) {
  Schedule schedules[4];
  for (auto _ : state) {
    std::thread threads[] = {
        std::thread([&] { runITimer(AsyncCallDispatcher::MainLoopPoll, schedules[0]); }),
        std::thread([&] { runITimer(AsyncCallDispatcher::MainLoopGlib, schedules[1]); }),
        std::thread([&] { runClockNanosleep(schedules[2]); }),
        std::thread([&] { runGTimeout(schedules[3]); })};
    for (std::thread& thread : threads) thread.join();
  }
  for (int i = 0; i < 4; ++i) report(state, kNames[i], schedules[i]);
}
BENCHMARK(BM_TimersSideBySide)->Iterations(1)->Unit(benchmark::kMillisecond);

void printSummary() {
  std::printf("\nfigures measured in this run:\n");
  for (const auto& figure : gFigures)
    std::printf("  %-45s %10.1f\n", figure.first.c_str(), figure.second);
  const double reference = gFigures["clock_nanosleep loop median us"];
  std::printf("\nmedian lateness against the clock_nanosleep loop in this run:\n");
  for (const char* name : {"ITimer (poll back-end)", "ITimer (GLib back-end)"}) {
    const double ratio = gFigures[std::string(name) + " median us"] / reference;
    std::printf("  %-24s %.2fx (target <= 2: %s)\n", name, ratio, ratio <= 2 ? "met" : "MISSED");
  }
  std::printf("  %-24s %.2fx (a lower bar only)\n", "g_timeout_add",
              gFigures["g_timeout_add median us"] / reference);
}

}  // namespace

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 1;
  benchmark::RunSpecifiedBenchmarks();
  benchmark::Shutdown();
  printSummary();
  return 0;
}
