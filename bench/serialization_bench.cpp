// Writing and reading a representative measurement tree built from generic
// objects, beside memcpy of the same number of bytes and protobuf encoding
// and decoding the same content, all in one run.
//
// Two trees. The generic one: a container holding one GSM-like object (4
// scalars and 6 neighbours of 3 scalars), one WCDMA-like object (3 scalars
// and 8 neighbours of 6 scalars) and 30 WLAN-like objects (an 8-byte string
// and 3 scalars each). The measurement container: one GERAN measurement
// (identity, time stamp, serving cell measurement, 6 neighbours), one
// UTRA-FDD measurement (8 neighbours with every value), one E-UTRA identity,
// 30 WLAN measurements (8-byte BSSID, time stamp, access point measurement
// with rxLevel, txLevel and rssi) and one GNSS measurement.
#include <cstring>
#include <vector>

#include <benchmark/benchmark.h>

#include <lodestack/lodestack.h>

#include "ratio_reporter.h"
#include "sample_container.h"
#ifdef LODESTACK_BENCH_HAVE_PROTOBUF
#include "serialization.pb.h"
#endif

using namespace lodestack;
using namespace lodestack::gom;
using namespace lodestack::schema;

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


void BM_Container_Write(benchmark::State& state) {
  SharedPointer<MeasurementContainer> container = lodestack_bench::buildContainer();
  unsigned int bytes = 0;
  for (auto _ : state) {
    BufferStream s;
    container->write(s);
    bytes = s.buffer().size();
    benchmark::DoNotOptimize(s.buffer().data());
  }
  state.counters["bytes"] = bytes;
}
BENCHMARK(BM_Container_Write);

void BM_Container_Read(benchmark::State& state) {
  BufferStream out;
  lodestack_bench::buildContainer()->write(out);
  BufferStream s(out.buffer());
  for (auto _ : state) {
    s.seekFromStart(0);
    SharedPointer<GenericObject> back = GenericObject::create(s);
    benchmark::DoNotOptimize(back.get());
  }
  state.counters["bytes"] = s.buffer().size();
}
BENCHMARK(BM_Container_Read);

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

lodestack_bench::MeasurementSet buildMeasurementSet() {
  lodestack_bench::MeasurementSet m;
  const unsigned int now = 1700000000u;
  lodestack_bench::GeranMeasurement* geran = m.add_geran();
  geran->mutable_dn()->set_mcc(244);
  geran->mutable_dn()->set_mnc(91);
  geran->mutable_dn()->set_lac(1234);
  geran->mutable_dn()->set_cid(23456);
  geran->set_time_stamp(now);
  geran->mutable_serving()->set_timing_advance(3);
  geran->mutable_serving()->set_frequency(1);
  geran->mutable_serving()->mutable_nw()->set_rx_level(40);
  geran->mutable_serving()->mutable_nw()->mutable_frequency_info()->set_bsic(17);
  geran->mutable_serving()->mutable_nw()->mutable_frequency_info()->set_arfcn(62);
  for (int i = 0; i < 6; ++i) {
    lodestack_bench::GeranNw* n = geran->add_neighbours();
    n->mutable_frequency_info()->set_bsic(10 + i);
    n->mutable_frequency_info()->set_arfcn(100 + i);
    n->set_lac(1234);
    n->set_cid(23000 + i);
    n->set_rx_level(30 - i);
  }
  lodestack_bench::UtraMeasurement* utra = m.add_utra_fdd();
  utra->mutable_dn()->set_mcc(244);
  utra->mutable_dn()->set_mnc(91);
  utra->mutable_dn()->set_ucid(0x0ABCDEF1);
  utra->set_time_stamp(now);
  for (int i = 0; i < 8; ++i) {
    lodestack_bench::UtraNw* n = utra->add_neighbours();
    n->mutable_frequency_info()->set_uarfcn_dl(10700);
    n->mutable_frequency_info()->set_pcpich(300 + i);
    n->set_uarfcn_ul(9750);
    n->set_carrier_rssi(50 + i);
    n->set_ucid(0x0ABCDE00u + i);
    n->set_ec_no(20 + i);
    n->set_rscp(-95 + i);
    n->set_pathloss(120 + i);
  }
  lodestack_bench::EUtraMeasurement* eutra = m.add_eutra();
  eutra->mutable_dn()->set_mcc(244);
  eutra->mutable_dn()->set_mnc(91);
  eutra->mutable_dn()->set_ucid(0x01234567);
  eutra->set_time_stamp(now);
  for (int i = 0; i < 30; ++i) {
    lodestack_bench::WlanMeasurement* w = m.add_wlan();
    const unsigned long long id = 0x001A2B3C4D5E0000ull + i;
    char bssid[8];
    for (int b = 0; b < 8; ++b) bssid[b] = static_cast<char>(id >> (56 - 8 * b));
    w->set_bssid(bssid, 8);
    w->set_time_stamp(now);
    w->mutable_ap()->set_rx_level(-40 - i);
    w->mutable_ap()->set_tx_level(15);
    w->mutable_ap()->set_rssi(60 + i);
  }
  lodestack_bench::GnssMeasurement* gnss = m.add_gnss();
  gnss->set_time_stamp(now);
  lodestack_bench::GnssData* d = gnss->mutable_data();
  d->set_latitude(717000000);
  d->set_longitude(148000000);
  d->set_major_axis(25);
  d->set_minor_axis(15);
  d->set_angle(30.0f);
  d->set_altitude(12.5f);
  d->set_altitude_uncertainty(5.0f);
  d->set_speed(1.5);
  d->set_speed_uncertainty(0.5);
  d->set_course(270.0);
  d->set_course_uncertainty(10.0);
  return m;
}

template <class Message>
void encode(benchmark::State& state, const Message& message) {
  std::vector<unsigned char> out(message.ByteSizeLong());
  for (auto _ : state) {
    const size_t size = message.ByteSizeLong();
    if (out.size() < size) out.resize(size);
    message.SerializeToArray(out.data(), static_cast<int>(size));
    benchmark::ClobberMemory();
  }
  state.counters["bytes"] = message.ByteSizeLong();
}

template <class Message>
void decode(benchmark::State& state, const Message& message) {
  const std::string bytes = message.SerializeAsString();
  for (auto _ : state) {
    Message fresh;
    fresh.ParseFromArray(bytes.data(), static_cast<int>(bytes.size()));
    benchmark::DoNotOptimize(&fresh);
  }
  state.counters["bytes"] = bytes.size();
}

void BM_Protobuf_Encode(benchmark::State& state) { encode(state, buildMessage()); }
BENCHMARK(BM_Protobuf_Encode);
void BM_Protobuf_Decode(benchmark::State& state) { decode(state, buildMessage()); }
BENCHMARK(BM_Protobuf_Decode);
void BM_ContainerProtobuf_Encode(benchmark::State& state) { encode(state, buildMeasurementSet()); }
BENCHMARK(BM_ContainerProtobuf_Encode);
void BM_ContainerProtobuf_Decode(benchmark::State& state) { decode(state, buildMeasurementSet()); }
BENCHMARK(BM_ContainerProtobuf_Decode);
#endif

}  // namespace

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  lodestack_bench::RatioReporter reporter;
  reporter.compare("BM_GenericObject_Write", "BM_Protobuf_Encode", 3.0);
  reporter.compare("BM_GenericObject_Read", "BM_Protobuf_Decode", 2.0);
  reporter.compare("BM_Container_Write", "BM_ContainerProtobuf_Encode", 3.0);
  reporter.compare("BM_Container_Read", "BM_ContainerProtobuf_Decode", 2.0);
#ifndef LODESTACK_BENCH_HAVE_PROTOBUF
  std::printf("protobuf was not found at build time: the reference cases are missing\n");
#endif
  benchmark::RunSpecifiedBenchmarks(&reporter);
  benchmark::Shutdown();
  return 0;
}
