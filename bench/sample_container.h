// The representative measurement container of the benchmarks: one GERAN
// measurement (identity, time stamp, serving cell measurement, 6
// neighbours), one UTRA-FDD measurement (8 neighbours with every value), one
// E-UTRA identity, 30 WLAN measurements (8-byte BSSID, time stamp, access
// point measurement with rxLevel, txLevel and rssi) and one GNSS measurement.
#ifndef LODESTACK_BENCH_SAMPLE_CONTAINER_H
#define LODESTACK_BENCH_SAMPLE_CONTAINER_H

#include <lodestack/lodestack.h>

namespace lodestack_bench {

using namespace lodestack;
using namespace lodestack::gom;
using namespace lodestack::schema;

inline SharedPointer<MeasurementContainer> buildContainer() {
  SharedPointer<MeasurementContainer> c = MeasurementContainer::create();
  const unsigned int now = 1700000000u;

  SharedPointer<GeranCellMeasurement> geran =
      GeranCellMeasurement::create(GeranCellDn::create(244, 91, 1234, 23456), now);
  SharedPointer<GeranServingCellMeasurement> serving = GeranServingCellMeasurement::create();
  (void)serving->setTimingAdvance(3);
  (void)serving->setFrequency(1);
  (void)serving->setRxLevel(40);
  (void)serving->setFrequencyInfo(GeranFrequencyInfo::create(17, 62));
  geran->setServingCellMeasurement(serving);
  for (int i = 0; i < 6; ++i) {
    SharedPointer<GeranNwMeasurement> n = GeranNwMeasurement::create(
        GeranFrequencyInfo::create(static_cast<unsigned char>(10 + i), static_cast<unsigned short>(100 + i)));
    (void)n->setLac(1234);
    (void)n->setCid(static_cast<unsigned short>(23000 + i));
    (void)n->setRxLevel(static_cast<unsigned char>(30 - i));
    (void)geran->addNwMeasurement(n);
  }
  (void)c->addGeranMeasurement(geran->wrappedObject());

  SharedPointer<UtraFddCellMeasurement> utra =
      UtraFddCellMeasurement::create(UtraCellDn::create(244, 91, 0x0ABCDEF1), now);
  for (int i = 0; i < 8; ++i) {
    SharedPointer<UtraFddNwMeasurement> n = UtraFddNwMeasurement::create(
        UtraFddFrequencyInfo::create(10700, static_cast<unsigned short>(300 + i)));
    (void)n->setUarfcnUl(9750);
    (void)n->setUtraCarrierRssi(static_cast<unsigned char>(50 + i));
    (void)n->setUcid(0x0ABCDE00u + i);
    (void)n->setEcNo(static_cast<unsigned char>(20 + i));
    (void)n->setRscp(static_cast<signed char>(-95 + i));
    (void)n->setPathloss(static_cast<unsigned char>(120 + i));
    (void)utra->addNwMeasurement(n);
  }
  (void)c->addUtraFddMeasurement(utra->wrappedObject());

  SharedPointer<EUtraCellMeasurement> eutra =
      EUtraCellMeasurement::create(EUtraCellDn::create(244, 91, 0x01234567), now);
  (void)c->addEUtraMeasurement(eutra->wrappedObject());

  for (int i = 0; i < 30; ++i) {
    SharedPointer<WlanMeasurement> w =
        WlanMeasurement::create(WlanDn::create(0x001A2B3C4D5E0000ull + i), now);
    SharedPointer<WlanApMeasurement> ap = WlanApMeasurement::create();
    (void)ap->setRxLevel(static_cast<signed char>(-40 - i));
    (void)ap->setTxLevel(static_cast<signed char>(15));
    (void)ap->setRssi(static_cast<unsigned char>(60 + i));
    w->setWlanApMeasurement(ap);
    (void)c->addWlanMeasurement(w->wrappedObject());
  }

  const Coverage fix(717000000, 148000000, 25u, 15u, 30.0f, 12.5f, 5.0f);
  SharedPointer<GnssMeasurement> gnss =
      GnssMeasurement::create(now, GnssMeasurementData::create(fix, 1.5, 0.5, 270.0, 10.0));
  (void)c->addGnssMeasurement(gnss->wrappedObject());
  return c;
}

}  // namespace lodestack_bench

#endif  // LODESTACK_BENCH_SAMPLE_CONTAINER_H
