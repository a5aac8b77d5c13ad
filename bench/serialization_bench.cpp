// Writing and reading a representative measurement tree built from generic
// objects, beside memcpy of the same number of bytes and protobuf encoding
// and decoding the same content, all in one run.
//
// The tree: a container holding one GSM-like object (4 scalars and 6
// neighbours of 3 scalars), one WCDMA-like object (3 scalars and 8
// neighbours of 6 scalars) and 30 WLAN-like objects (an 8-byte string and 3
// scalars each).
#include <cstring>
#include <vector>

#include <benchmark/benchmark.h>

#include <lodestack/lodestack.h>

#include "ratio_reporter.h"
#ifdef LODESTACK_BENCH_HAVE_PROTOBUF
#include "serialization.pb.h"
#endif

using namespace lodestack;
using namespace lodestack::gom;

namespace {

void addToCollection(GenericObject& parent, unsigned short id, const SharedPointer<GenericObject>& item) {
  SharedPointer<ValueCollection> list;
  if (parent.getCollectionProperty(id, list) != Ok) {
    list = ValueCollection::create();
    (void)parent.setCollectionProperty(id, list);
  }
  Variant* v = Variant::create();
  (void)v->setGenericObjectValue(item);
  if (list->add(v) != Ok) delete v;
}

SharedPointer<GenericObject> buildTree() {
  SharedPointer<GenericObject> root = GenericObject::create(1);
  SharedPointer<GenericObject> gsm = GenericObject::create(2);
  (void)gsm->setUint32Property(205, 1700000000u);
  (void)gsm->setUint32Property(1, 23456);
  (void)gsm->setUint16Property(2, 1234);
  (void)gsm->setInt16Property(3, -71);
  for (int i = 0; i < 6; ++i) {
    SharedPointer<GenericObject> n = GenericObject::create(106);
    (void)n->setUint16Property(1, static_cast<unsigned short>(100 + i));
    (void)n->setUint8Property(2, static_cast<unsigned char>(i * 7));
    (void)n->setInt16Property(3, static_cast<short>(-80 - i));
    addToCollection(*gsm, 303, n);
  }
  addToCollection(*root, 300, gsm);

  SharedPointer<GenericObject> wcdma = GenericObject::create(3);
  (void)wcdma->setUint32Property(205, 1700000001u);
  (void)wcdma->setUint32Property(1, 0x0ABCDEF1);
  (void)wcdma->setUint16Property(2, 10700);
  for (int i = 0; i < 8; ++i) {
    SharedPointer<GenericObject> n = GenericObject::create(108);
    (void)n->setUint16Property(1, 10700);
    (void)n->setUint16Property(2, static_cast<unsigned short>(300 + i));
    (void)n->setInt16Property(3, static_cast<short>(-95 + i));
    (void)n->setInt16Property(4, static_cast<short>(-12 - i));
    (void)n->setInt16Property(5, static_cast<short>(120 + i));
    (void)n->setUint8Property(6, static_cast<unsigned char>(i));
    addToCollection(*wcdma, 303, n);
  }
  addToCollection(*root, 301, wcdma);

  for (int i = 0; i < 30; ++i) {
    SharedPointer<GenericObject> w = GenericObject::create(20);
    const char bssid[8] = {0x00, 0x1A, 0x2B, 0x3C, 0x4D, static_cast<char>(i), 0, 0};
    (void)w->setStringProperty(200, CharacterData::create(bssid, 8));
    (void)w->setUint32Property(205, 1700000002u);
    (void)w->setInt16Property(2, static_cast<short>(-40 - i));
    (void)w->setUint8Property(3, static_cast<unsigned char>(1 + i % 13));
    addToCollection(*root, 314, w);
  }
  return root;
}

std::vector<unsigned char> serialised(const GenericObject& tree) {
  BufferStream s;
  tree.write(s);
  return std::vector<unsigned char>(s.buffer().data(), s.buffer().data() + s.buffer().size());
}

void BM_GenericObject_Write(benchmark::State& state) {
  SharedPointer<GenericObject> tree = buildTree();
  unsigned int bytes = 0;
  for (auto _ : state) {
    BufferStream s;
    tree->write(s);
    bytes = s.buffer().size();
    benchmark::DoNotOptimize(s.buffer().data());
  }
  state.counters["bytes"] = bytes;
}
BENCHMARK(BM_GenericObject_Write);

void BM_GenericObject_Read(benchmark::State& state) {
  const std::vector<unsigned char> bytes = serialised(*buildTree());
  BufferStream s(bytes.data(), static_cast<unsigned int>(bytes.size()));
  for (auto _ : state) {
    s.seekFromStart(0);
    SharedPointer<GenericObject> back = GenericObject::create(s);
    benchmark::DoNotOptimize(back.get());
  }
  state.counters["bytes"] = bytes.size();
}
BENCHMARK(BM_GenericObject_Read);

void BM_Memcpy(benchmark::State& state) {
  const std::vector<unsigned char> bytes = serialised(*buildTree());
  std::vector<unsigned char> target(bytes.size());
  for (auto _ : state) {
    std::memcpy(target.data(), bytes.data(), bytes.size());
    benchmark::ClobberMemory();
  }
  state.counters["bytes"] = bytes.size();
}
BENCHMARK(BM_Memcpy);

#ifdef LODESTACK_BENCH_HAVE_PROTOBUF
lodestack_bench::Container buildMessage() {
  lodestack_bench::Container c;
  lodestack_bench::GsmCell* gsm = c.add_gsm();
  gsm->set_time_stamp(1700000000u);
  gsm->set_cell_id(23456);
  gsm->set_lac(1234);
  gsm->set_rxlev(-71);
  for (int i = 0; i < 6; ++i) {
    lodestack_bench::Neighbour3* n = gsm->add_neighbours();
    n->set_arfcn(100 + i);
    n->set_bsic(i * 7);
    n->set_rxlev(-80 - i);
  }
  lodestack_bench::WcdmaCell* wcdma = c.add_wcdma();
  wcdma->set_time_stamp(1700000001u);
  wcdma->set_ucid(0x0ABCDEF1);
  wcdma->set_uarfcn(10700);
  for (int i = 0; i < 8; ++i) {
    lodestack_bench::Neighbour6* n = wcdma->add_neighbours();
    n->set_uarfcn(10700);
    n->set_psc(300 + i);
    n->set_rscp(-95 + i);
    n->set_ecno(-12 - i);
    n->set_pathloss(120 + i);
    n->set_flags(i);
  }
  for (int i = 0; i < 30; ++i) {
    lodestack_bench::Wlan* w = c.add_wlan();
    const char bssid[8] = {0x00, 0x1A, 0x2B, 0x3C, 0x4D, static_cast<char>(i), 0, 0};
    w->set_bssid(bssid, 8);
    w->set_time_stamp(1700000002u);
    w->set_rssi(-40 - i);
    w->set_channel(1 + i % 13);
  }
  return c;
}

void BM_Protobuf_Encode(benchmark::State& state) {
  const lodestack_bench::Container message = buildMessage();
  std::vector<unsigned char> out(message.ByteSizeLong());
  for (auto _ : state) {
    const size_t size = message.ByteSizeLong();
    if (out.size() < size) out.resize(size);
    message.SerializeToArray(out.data(), static_cast<int>(size));
    benchmark::ClobberMemory();
  }
  state.counters["bytes"] = message.ByteSizeLong();
}
BENCHMARK(BM_Protobuf_Encode);

void BM_Protobuf_Decode(benchmark::State& state) {
  const std::string bytes = buildMessage().SerializeAsString();
  for (auto _ : state) {
    lodestack_bench::Container fresh;
    fresh.ParseFromArray(bytes.data(), static_cast<int>(bytes.size()));
    benchmark::DoNotOptimize(&fresh);
  }
  state.counters["bytes"] = bytes.size();
}
BENCHMARK(BM_Protobuf_Decode);
#endif

}  // namespace

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  lodestack_bench::RatioReporter reporter;
  reporter.compare("BM_GenericObject_Write", "BM_Protobuf_Encode", 3.0);
  reporter.compare("BM_GenericObject_Read", "BM_Protobuf_Decode", 2.0);
#ifndef LODESTACK_BENCH_HAVE_PROTOBUF
  std::printf("protobuf was not found at build time: the reference cases are missing\n");
#endif
  benchmark::RunSpecifiedBenchmarks(&reporter);
  benchmark::Shutdown();
  return 0;
}
