// Cross-thread deferred calls: a producer thread queues calls into a loop
// run by another thread. Measured side by side in one run for the poll
// back-end, the GLib back-end and, as the reference, GLib's own
// g_main_context_invoke into a GMainContext iterated by another thread:
//   - throughput: calls per second while the producer queues flat out;
//   - latency: queueing to execution of one call into an idle loop (median
//     and 99th percentile), with the producer spinning until the call ran,
//     and with the producer blocked on a condition variable meanwhile;
//   - burst: 100,000 calls queued while the loop is not reading, then the
//     time the loop needs to run them all;
//   - the wake-up primitives alone: a socket-pair record against an eventfd.
#include <glib.h>
#include <sys/eventfd.h>
#include <sys/socket.h>
#include <unistd.h>

#include <atomic>
#include <cstdint>
#include <condition_variable>
#include <cstdio>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <thread>

#include <benchmark/benchmark.h>

#include <lodestack/lodestack.h>

#include "bench_stats.h"

using lodestack_bench::nowMicros;
using lodestack_bench::quantile;
using namespace lodestack::core;

namespace {

// A loop on its own thread that runs posted calls.
class Loop {
 public:
  virtual ~Loop() = default;
  // Starts the thread; it begins running calls once `open()` is called.
  void start() {
    thread_ = std::thread([this] {
      setUp();
      {
        std::unique_lock<std::mutex> lock(mutex_);
        ready_ = true;
        changed_.notify_all();
        changed_.wait(lock, [this] { return open_; });
      }
      while (!stop_.load(std::memory_order_relaxed)) turn();
      tearDown();
    });
    std::unique_lock<std::mutex> lock(mutex_);
    changed_.wait(lock, [this] { return ready_; });
  }
  void open() {
    std::lock_guard<std::mutex> lock(mutex_);
    open_ = true;
    changed_.notify_all();
  }
  void stop() {
    post(&Loop::stopCall, this);
    thread_.join();
  }
  // Any thread.
  virtual void post(void (*call)(void*), void* param) = 0;

 protected:
  virtual void setUp() = 0;  // on the loop thread
  virtual void turn() = 0;   // one blocking turn of the loop
  virtual void tearDown() = 0;

 private:
  static void stopCall(void* self) { static_cast<Loop*>(self)->stop_ = true; }

  std::thread thread_;
  std::mutex mutex_;
  std::condition_variable changed_;
  bool ready_ = false, open_ = false;
  std::atomic<bool> stop_{false};
};

class DispatcherLoop : public Loop {
 public:
  explicit DispatcherLoop(AsyncCallDispatcher::MainLoopType type) : type_(type) {}
  void post(void (*call)(void*), void* param) override {
    target_->queueAsyncCall(call, param);
  }

 protected:
  void setUp() override {
    dispatcher_ = AsyncCallDispatcher::openDispatcher(type_);
    target_ = dispatcher_.get();
  }
  void turn() override { dispatcher_->sleep(); }
  void tearDown() override { dispatcher_.clear(); }

 private:
  AsyncCallDispatcher::MainLoopType type_;
  lodestack::gom::SharedPointer<IAsyncCallDispatcher> dispatcher_;
  IAsyncCallDispatcher* target_ = nullptr;  // what other threads use
};

// GLib's reference: the loop thread owns a GMainContext for its lifetime,
// so g_main_context_invoke from the producer always goes through an idle
// source and a wake-up, never runs on the producer.
class GlibInvokeLoop : public Loop {
 public:
  GlibInvokeLoop() : context_(g_main_context_new()) {}
  ~GlibInvokeLoop() override { g_main_context_unref(context_); }
  void post(void (*call)(void*), void* param) override {
    auto* posted = new Posted{call, param};
    g_main_context_invoke_full(context_, G_PRIORITY_DEFAULT, &Posted::run, posted,
                               &Posted::destroy);
  }

 protected:
  void setUp() override { g_main_context_acquire(context_); }
  void turn() override { g_main_context_iteration(context_, TRUE); }
  void tearDown() override { g_main_context_release(context_); }

 private:
  struct Posted {
    void (*call)(void*);
    void* param;
    static gboolean run(gpointer self) {
      auto* p = static_cast<Posted*>(self);
      p->call(p->param);
      return G_SOURCE_REMOVE;
    }
    static void destroy(gpointer self) { delete static_cast<Posted*>(self); }
  };
  GMainContext* context_;
};

enum Kind { kPoll, kGlib, kGlibInvoke };
const char* const kKindNames[] = {"poll back-end", "GLib back-end", "g_main_context_invoke"};

std::unique_ptr<Loop> makeLoop(Kind kind) {
  switch (kind) {
    case kPoll:
      return std::unique_ptr<Loop>(new DispatcherLoop(AsyncCallDispatcher::MainLoopPoll));
    case kGlib:
      return std::unique_ptr<Loop>(new DispatcherLoop(AsyncCallDispatcher::MainLoopGlib));
    default:
      return std::unique_ptr<Loop>(new GlibInvokeLoop);
  }
}

std::atomic<long> gRan{0};
void countCall(void*) { gRan.fetch_add(1, std::memory_order_release); }

void waitForCalls(long count) {
  while (gRan.load(std::memory_order_acquire) < count) std::this_thread::yield();
}

// Figures kept for the summary printed after the run.
std::map<std::string, double> gFigures;
std::string key(Kind kind, const char* what) { return std::string(kKindNames[kind]) + " " + what; }

void BM_Throughput(benchmark::State& state) {
  const Kind kind = static_cast<Kind>(state.range(0));
  constexpr long kCalls = 200000;
  std::vector<double> rates;
  for (auto _ : state) {
    for (int round = 0; round < 3; ++round) {
      std::unique_ptr<Loop> loop = makeLoop(kind);
      loop->start();
      loop->open();
      gRan = 0;
      const double start = nowMicros();
      for (long i = 0; i < kCalls; ++i) loop->post(&countCall, nullptr);
      waitForCalls(kCalls);
      const double seconds = (nowMicros() - start) / 1e6;
      rates.push_back(kCalls / seconds);
      loop->stop();
      state.SetIterationTime(seconds);
    }
  }
  const double median = quantile(rates, 0.5);
  state.counters["calls_per_s"] = median;
  gFigures[key(kind, "calls/s")] = median;
}

// One call's timestamps; the producer either spins until the call ran or
// blocks on a condition variable that the call signals after stamping.
struct LatencySample {
  double queued = 0;
  double ran = 0;
  std::mutex mutex;
  std::condition_variable ranSignal;
  std::atomic<bool> done{false};
};
void latencyCall(void* param) {
  auto* sample = static_cast<LatencySample*>(param);
  sample->ran = nowMicros();
  std::lock_guard<std::mutex> lock(sample->mutex);
  sample->done.store(true, std::memory_order_release);
  sample->ranSignal.notify_one();
}

void BM_Latency(benchmark::State& state) {
  const Kind kind = static_cast<Kind>(state.range(0));
  const bool blocking = state.range(1) != 0;
  constexpr int kSamples = 3000;
  std::vector<double> latencies;
  for (auto _ : state) {
    std::unique_ptr<Loop> loop = makeLoop(kind);
    loop->start();
    loop->open();
    const double start = nowMicros();
    for (int i = 0; i < kSamples; ++i) {
      // Let the loop go back to sleep: each call wakes an idle loop.
      std::this_thread::sleep_for(std::chrono::microseconds(100));
      LatencySample sample;
      sample.queued = nowMicros();
      loop->post(&latencyCall, &sample);
      if (blocking) {
        std::unique_lock<std::mutex> lock(sample.mutex);
        sample.ranSignal.wait(lock, [&] { return sample.done.load(); });
      } else {
        while (!sample.done.load(std::memory_order_acquire)) std::this_thread::yield();
        std::lock_guard<std::mutex> lock(sample.mutex);  // the call is done with it
      }
      latencies.push_back(sample.ran - sample.queued);
    }
    state.SetIterationTime((nowMicros() - start) / 1e6);
    loop->stop();
  }
  const char* how = blocking ? "latency (producer blocks)" : "latency (producer spins)";
  state.counters["median_us"] = quantile(latencies, 0.5);
  state.counters["p99_us"] = quantile(latencies, 0.99);
  gFigures[key(kind, how) + " median us"] = quantile(latencies, 0.5);
  gFigures[key(kind, how) + " p99 us"] = quantile(latencies, 0.99);
}

void BM_Burst100k(benchmark::State& state) {
  const Kind kind = static_cast<Kind>(state.range(0));
  constexpr long kCalls = 100000;
  double drainMs = 0, queueMs = 0;
  for (auto _ : state) {
    std::unique_ptr<Loop> loop = makeLoop(kind);
    loop->start();  // ready, but not reading
    gRan = 0;
    const double queued = nowMicros();
    for (long i = 0; i < kCalls; ++i) loop->post(&countCall, nullptr);
    const double opened = nowMicros();
    loop->open();
    waitForCalls(kCalls);
    const double drained = nowMicros();
    queueMs = (opened - queued) / 1e3;
    drainMs = (drained - opened) / 1e3;
    state.SetIterationTime(drainMs / 1e3);
    loop->stop();
  }
  state.counters["queue_ms"] = queueMs;
  state.counters["drain_ms"] = drainMs;
  gFigures[key(kind, "100k burst queue ms")] = queueMs;
  gFigures[key(kind, "100k burst drain ms")] = drainMs;
}

// The wake-up primitives alone, one thread, no waiting: a 4-byte record
// through a SOCK_SEQPACKET pair (what each queued call costs the
// dispatchers) against an eventfd write and read (what GLib's wake-up costs).
void BM_SeqpacketRecord(benchmark::State& state) {
  int fds[2];
  if (socketpair(AF_UNIX, SOCK_SEQPACKET, 0, fds) != 0) return state.SkipWithError("socketpair");
  unsigned int id = 1;
  for (auto _ : state) {
    send(fds[1], &id, sizeof id, MSG_DONTWAIT | MSG_EOR);
    recv(fds[0], &id, sizeof id, MSG_DONTWAIT);
  }
  close(fds[0]);
  close(fds[1]);
}
BENCHMARK(BM_SeqpacketRecord);

void BM_EventfdWakeup(benchmark::State& state) {
  const int fd = eventfd(0, EFD_NONBLOCK);
  uint64_t value = 1;
  for (auto _ : state) {
    (void)!write(fd, &value, sizeof value);
    (void)!read(fd, &value, sizeof value);
  }
  close(fd);
}
BENCHMARK(BM_EventfdWakeup);

void kinds(benchmark::internal::Benchmark* b) {
  b->Arg(kPoll)->Arg(kGlib)->Arg(kGlibInvoke)->Iterations(1)->UseManualTime()->Unit(
      benchmark::kMillisecond);
}
BENCHMARK(BM_Throughput)->Apply(kinds);
void latencyKinds(benchmark::internal::Benchmark* b) {
  for (int blocking : {0, 1})
    for (int kind : {kPoll, kGlib, kGlibInvoke}) b->Args({kind, blocking});
  b->Iterations(1)->UseManualTime()->Unit(benchmark::kMillisecond);
}
BENCHMARK(BM_Latency)->Apply(latencyKinds);
BENCHMARK(BM_Burst100k)->Apply(kinds);

void printSummary() {
  std::printf("\nfigures measured in this run:\n");
  for (const auto& figure : gFigures)
    std::printf("  %-58s %12.1f\n", figure.first.c_str(), figure.second);
  auto ratio = [](Kind kind, const std::string& what) {
    return gFigures[key(kind, "") + what] / gFigures[key(kGlibInvoke, "") + what];
  };
  std::printf("\nratios against g_main_context_invoke in this run:\n");
  for (Kind kind : {kPoll, kGlib}) {
    const double rate = ratio(kind, "calls/s");
    const double spins = ratio(kind, "latency (producer spins) median us");
    const double blocks = ratio(kind, "latency (producer blocks) median us");
    std::printf("  %-14s throughput %.2fx (target >= 0.8: %s)\n", kKindNames[kind], rate,
                rate >= 0.8 ? "met" : "MISSED");
    std::printf("  %-14s median latency, producer spins %.2fx, producer blocks %.2fx "
                "(target <= 1.2: %s, %s)\n",
                kKindNames[kind], spins, blocks, spins <= 1.2 ? "met" : "MISSED",
                blocks <= 1.2 ? "met" : "MISSED");
  }
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
