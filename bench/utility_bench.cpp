// Trimming a scan of 200 WLAN measurements to its 10 strongest entries,
// beside a plain sort of the same 200 received levels as the floor of what
// any trimming costs.
#include <benchmark/benchmark.h>

#include <algorithm>
#include <random>
#include <utility>
#include <vector>

#include <lodestack/lodestack.h>

using namespace lodestack;
using namespace lodestack::schema;
using gom::SharedPointer;

namespace {

const int kEntries = 200;
const unsigned int kLimit = 10;

std::vector<signed char> levels() {
  std::mt19937 random(3);
  std::uniform_int_distribution<int> level(-100, -30);
  std::vector<signed char> out;
  for (int i = 0; i < kEntries; ++i) out.push_back(static_cast<signed char>(level(random)));
  return out;
}

// The measurements of one scan; every tenth has no received level.
std::vector<SharedPointer<gom::GenericObject>> scan() {
  std::vector<SharedPointer<gom::GenericObject>> out;
  unsigned long long bssid = 0x0200000000000000ull;
  for (signed char level : levels()) {
    SharedPointer<WlanMeasurement> m = WlanMeasurement::create(WlanDn::create(++bssid), 1000);
    SharedPointer<WlanApMeasurement> ap = WlanApMeasurement::create();
    if (bssid % 10) ap->setRxLevel(level);
    ap->setRssi(static_cast<unsigned char>(level + 128));
    m->setWlanApMeasurement(ap);
    out.push_back(m->wrappedObject());
  }
  return out;
}

void BM_TrimWlanCollection(benchmark::State& state) {
  const std::vector<SharedPointer<gom::GenericObject>> objects = scan();
  for (auto _ : state) {
    state.PauseTiming();
    SharedPointer<gom::ValueCollection> c = gom::ValueCollection::create();
    for (const auto& o : objects) {
      gom::Variant* v = gom::Variant::create();
      (void)v->setGenericObjectValue(o);
      (void)c->add(v);
    }
    state.ResumeTiming();
    benchmark::DoNotOptimize(Utility::trimWlanCollection(kLimit, c));
    state.PauseTiming();
    c.clear();
    state.ResumeTiming();
  }
}
BENCHMARK(BM_TrimWlanCollection);

void BM_ReferenceSortOfLevels(benchmark::State& state) {
  const std::vector<signed char> source = levels();
  std::vector<std::pair<int, const void*>> ranked(source.size());
  for (auto _ : state) {
    for (std::size_t i = 0; i < source.size(); ++i) ranked[i] = {source[i], &source[i]};
    std::stable_sort(ranked.begin(), ranked.end(),
                     [](const auto& a, const auto& b) { return a.first < b.first; });
    benchmark::DoNotOptimize(ranked.data());
  }
}
BENCHMARK(BM_ReferenceSortOfLevels);

}  // namespace

BENCHMARK_MAIN();
