// The measurement path on one thread: from requestMeasurements to the
// observer's measurementsReady through provider, request engine and
// validator, with the representative container, for a platform that answers
// inside its start call and for one that answers from a posted call. In the
// same run, on the same dispatcher: one bare dispatcher round trip (queue a
// call, run it) and the validation of the container alone, which together
// are the least a result can cost; and pushMeasurement throughput beside the
// dispatcher's own calls per second. Both dispatcher kinds. Last, the whole
// platform path: the factory's adaptation over the host platform replaying
// the built-in street with every answer given inside the start call.
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <sstream>
#include <map>
#include <string>
#include <vector>

#include <benchmark/benchmark.h>

#include <lodestack/lodestack.h>

#include "bench_stats.h"
#include "sample_container.h"

using lodestack_bench::nowMicros;
using lodestack_bench::quantile;
using namespace lodestack;
using namespace lodestack::core;
using lodestack::gom::GenericObject;
using lodestack::gom::SharedPointer;
using radioadaptation::IRadioAdaptationObserver;
using radioadaptation::RadioAdaptationCommon;

namespace {

std::map<std::string, double> gFigures;

enum Kind { kPoll, kGlib };
const char* const kKindNames[] = {"poll", "glib"};

AsyncCallDispatcher::MainLoopType loopType(Kind kind) {
  return kind == kPoll ? AsyncCallDispatcher::MainLoopPoll : AsyncCallDispatcher::MainLoopGlib;
}

// Opens the thread's dispatcher of `kind` for one benchmark.
struct LoopScope {
  explicit LoopScope(Kind kind) {
    AsyncCallDispatcher::setMainLoopType(loopType(kind));
    dispatcher = AsyncCallDispatcher::openDispatcher(AsyncCallDispatcher::MainLoopDefault);
  }
  ~LoopScope() {
    dispatcher.clear();
    AsyncCallDispatcher::setMainLoopType(AsyncCallDispatcher::MainLoopDefault);
  }
  SharedPointer<IAsyncCallDispatcher> dispatcher;
};

// A platform that answers every cellular request with the same container,
// inside its start call or from a call it posts.
class BenchPlatform : public RadioAdaptationCommon {
 public:
  explicit BenchPlatform(bool posted) : posted_(posted), result_(lodestack_bench::buildContainer()->wrappedObject()) {
    init();
  }
  ~BenchPlatform() override { cancelAllRequests(); }
  const SharedPointer<GenericObject>& result() const { return result_; }

 protected:
  Status doRequest(MeasurementType type) override {
    if (!posted_) {
      handleRequestComplete(type, result_, Ok, true);
      return Ok;
    }
    AsyncCallDispatcher::openDispatcher(AsyncCallDispatcher::MainLoopDefault)
        ->queueAsyncCall(&BenchPlatform::answer, this);
    return Ok;
  }
  Status doCancelRequest(MeasurementType) override { return Ok; }

 private:
  static void answer(void* self) {
    BenchPlatform* p = static_cast<BenchPlatform*>(self);
    p->handleRequestComplete(Cellular, p->result_, Ok, false);
  }
  bool posted_;
  SharedPointer<GenericObject> result_;
};

struct CountingObserver : IMeasurementsObserver {
  unsigned long long results = 0;
  void measurementsReady(unsigned int, int, SharedPointer<GenericObject>, Status) override {
    ++results;
  }
};

void runUntil(IAsyncCallDispatcher& loop, const unsigned long long& counter,
              unsigned long long target) {
  while (counter < target) loop.sleep(100);
}

void record(const std::string& name, const std::vector<double>& samples) {
  gFigures[name + " median us"] = quantile(samples, 0.5);
  gFigures[name + " p99 us"] = quantile(samples, 0.99);
}

void BM_BareRoundTrip(benchmark::State& state) {
  const Kind kind = static_cast<Kind>(state.range(0));
  LoopScope scope(kind);
  unsigned long long runs = 0;
  auto call = [](void* counter) { ++*static_cast<unsigned long long*>(counter); };
  std::vector<double> samples;
  for (auto _ : state) {
    const double start = nowMicros();
    scope.dispatcher->queueAsyncCall(call, &runs);
    runUntil(*scope.dispatcher, runs, runs + 1);
    samples.push_back(nowMicros() - start);
  }
  record(std::string(kKindNames[kind]) + " bare round trip", samples);
}
BENCHMARK(BM_BareRoundTrip)->Arg(kPoll)->Arg(kGlib);

void BM_ValidateContainer(benchmark::State& state) {
  SharedPointer<GenericObject> container = lodestack_bench::buildContainer()->wrappedObject();
  for (auto _ : state) {
    for (unsigned short id : {300, 301, 302, 310, 312})
      MeasurementsValidator::validateMeasurementCollection(id, container);
    benchmark::DoNotOptimize(container.get());
  }
}
BENCHMARK(BM_ValidateContainer);

// requestMeasurements to measurementsReady; range(0) the kind, range(1)
// whether the platform answers from a posted call.
void BM_RequestToObserver(benchmark::State& state) {
  const Kind kind = static_cast<Kind>(state.range(0));
  const bool posted = state.range(1) != 0;
  LoopScope scope(kind);
  BenchPlatform platform(posted);
  MeasurementsProvider* provider = MeasurementsProvider::create(platform);
  CountingObserver observer;
  provider->addObserver(observer, IMeasurementsObserver::Cellular);
  std::vector<double> samples;
  for (auto _ : state) {
    const double start = nowMicros();
    unsigned int id;
    if (provider->requestMeasurements(IMeasurementsObserver::Cellular, id) != Ok) {
      state.SkipWithError("request refused");
      break;
    }
    runUntil(*scope.dispatcher, observer.results, observer.results + 1);
    samples.push_back(nowMicros() - start);
  }
  delete provider;
  record(std::string(kKindNames[kind]) + (posted ? " posted answer" : " synchronous answer"),
         samples);
}
BENCHMARK(BM_RequestToObserver)->ArgsProduct({{kPoll, kGlib}, {0, 1}});

// Results per second: pushMeasurement of a batch, then the loop delivers it.
void BM_PushThroughput(benchmark::State& state) {
  const Kind kind = static_cast<Kind>(state.range(0));
  LoopScope scope(kind);
  BenchPlatform platform(false);
  MeasurementsProvider* provider = MeasurementsProvider::create(platform);
  CountingObserver observer;
  provider->addObserver(observer, IMeasurementsObserver::Cellular);
  SharedPointer<GenericObject> result = platform.result();
  const int batch = 1000;
  double micros = 0;
  for (auto _ : state) {
    const double start = nowMicros();
    for (int i = 0; i < batch; ++i) (void)provider->pushMeasurement(&result, 0, IMeasurementsObserver::Cellular);
    runUntil(*scope.dispatcher, observer.results, observer.results + batch);
    micros += nowMicros() - start;
  }
  delete provider;
  state.SetItemsProcessed(state.iterations() * batch);
  gFigures[std::string(kKindNames[kind]) + " pushed results/s"] =
      1e6 * batch * state.iterations() / micros;
}
BENCHMARK(BM_PushThroughput)->Arg(kPoll)->Arg(kGlib)->Unit(benchmark::kMillisecond);

// The dispatcher's own calls per second in the same batches.
void BM_BareCallThroughput(benchmark::State& state) {
  const Kind kind = static_cast<Kind>(state.range(0));
  LoopScope scope(kind);
  unsigned long long runs = 0;
  auto call = [](void* counter) { ++*static_cast<unsigned long long*>(counter); };
  const int batch = 1000;
  double micros = 0;
  for (auto _ : state) {
    const double start = nowMicros();
    for (int i = 0; i < batch; ++i) scope.dispatcher->queueAsyncCall(call, &runs);
    runUntil(*scope.dispatcher, runs, runs + batch);
    micros += nowMicros() - start;
  }
  state.SetItemsProcessed(state.iterations() * batch);
  gFigures[std::string(kKindNames[kind]) + " bare calls/s"] = 1e6 * batch * state.iterations() / micros;
}
BENCHMARK(BM_BareCallThroughput)->Arg(kPoll)->Arg(kGlib)->Unit(benchmark::kMillisecond);

// The street scenario with every answer given at once, in a temporary file.
std::string instantStreet() {
  std::ifstream in(LODESTACK_STREET_SCENARIO);
  std::stringstream text;
  text << in.rdbuf();
  std::string json = text.str();
  const std::string delayed = "\"answer\": \"delayed\"";
  for (std::size_t at = json.find(delayed); at != std::string::npos; at = json.find(delayed))
    json.replace(at, delayed.size(), "\"answer\": \"synchronous\"");
  const std::string path = "/tmp/lodestack-bench-street.json";
  std::ofstream(path) << json;
  return path;
}

// requestMeasurements to measurementsReady through the factory's adaptation;
// range(0) the kind, range(1) the measured kind (1 cellular, 2 WLAN).
void BM_ScenarioRequestToObserver(benchmark::State& state) {
  const Kind kind = static_cast<Kind>(state.range(0));
  const int type = static_cast<int>(state.range(1));
  LoopScope scope(kind);
  setenv("LODESTACK_SCENARIO", instantStreet().c_str(), 1);
  radioadaptation::IRadioAdaptation* radio =
      radioadaptation::RadioAdaptationFactory::createRadioAdaptation();
  if (!radio) {
    state.SkipWithError(lodestack::platform::lastError().c_str());
    return;
  }
  MeasurementsProvider* provider = MeasurementsProvider::create(*radio);
  CountingObserver observer;
  provider->addObserver(observer, type);
  std::vector<double> samples;
  for (auto _ : state) {
    const double start = nowMicros();
    unsigned int id;
    if (provider->requestMeasurements(type, id) != Ok) {
      state.SkipWithError("request refused");
      break;
    }
    runUntil(*scope.dispatcher, observer.results, observer.results + 1);
    samples.push_back(nowMicros() - start);
  }
  delete provider;
  delete radio;
  unsetenv("LODESTACK_SCENARIO");
  record(std::string(kKindNames[kind]) + (type == 1 ? " street cellular" : " street wlan"), samples);
}
BENCHMARK(BM_ScenarioRequestToObserver)->ArgsProduct({{kPoll, kGlib}, {1, 2}});

// Keeps the CPU time per iteration of the validation for the summary.
class Reporter : public benchmark::ConsoleReporter {
 public:
  void ReportRuns(const std::vector<Run>& runs) override {
    for (const Run& run : runs)
      if (run.run_name.function_name == "BM_ValidateContainer" && !run.error_occurred &&
          (run.run_type == Run::RT_Iteration || run.aggregate_name == "median"))
        gFigures["validation us"] = run.GetAdjustedCPUTime() / 1e3;
    ConsoleReporter::ReportRuns(runs);
  }
};

void printSummary() {
  std::printf("\nfigures measured in this run:\n");
  for (const auto& figure : gFigures)
    std::printf("  %-40s %12.2f\n", figure.first.c_str(), figure.second);
  std::printf("\nratios in this run (target: median latency <= 3x bare round trip + validation):\n");
  const double validation = gFigures["validation us"];
  for (Kind kind : {kPoll, kGlib}) {
    const std::string k = kKindNames[kind];
    const double floor = gFigures[k + " bare round trip median us"] + validation;
    for (const char* answer : {" synchronous answer", " posted answer"}) {
      const double median = gFigures[k + answer + " median us"];
      if (floor <= 0 || median <= 0) {
        std::printf("  %s%s: not measured\n", k.c_str(), answer);
        continue;
      }
      std::printf("  %-4s%-20s median %.2f us / (%.2f + %.2f us) = %.2fx (%s)\n", k.c_str(),
                  answer, median, gFigures[k + " bare round trip median us"], validation,
                  median / floor, median / floor <= 3.0 ? "met" : "MISSED");
    }
    for (const char* street : {" street cellular", " street wlan"})
      std::printf("  %-4s%-20s median %.2f us, p99 %.2f us (scenario answering at once)\n",
                  k.c_str(), street, gFigures[k + street + " median us"],
                  gFigures[k + street + " p99 us"]);
    const double pushed = gFigures[k + " pushed results/s"];
    const double bare = gFigures[k + " bare calls/s"];
    if (pushed > 0 && bare > 0)
      std::printf("  %-4s pushed results/s %.0f beside bare calls/s %.0f = %.2fx\n", k.c_str(),
                  pushed, bare, pushed / bare);
  }
}

}  // namespace

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 1;
  Reporter reporter;
  benchmark::RunSpecifiedBenchmarks(&reporter);
  benchmark::Shutdown();
  printSummary();
  return 0;
}
