// Records with every property present, built from their field tables, and a
// full measurement container: shared by the schema tests and the writer of
// the fuzz seeds.
#ifndef LODESTACK_TESTS_SCHEMA_SAMPLERECORDS_H
#define LODESTACK_TESTS_SCHEMA_SAMPLERECORDS_H

#include <type_traits>
#include <utility>
#include <vector>

#include <lodestack/lodestack.h>

namespace sample {

using namespace lodestack;
using namespace lodestack::schema;
using gom::SharedPointer;

template <class R>
SharedPointer<R> full();

template <class T>
struct Value {
  static T make(std::size_t i) { return static_cast<T>(0x41 + 7 * i); }
};
template <class R>
struct Value<SharedPointer<R>> {
  static SharedPointer<R> make(std::size_t) { return full<R>(); }
};

template <class R, std::size_t... I>
void fill(R& r, std::index_sequence<I...>) {
  (r.template setField<I>(Value<typename R::Table::template TypeAt<I>>::make(I)), ...);
}

template <class R>
struct Filler {
  static void fill(R& r) { sample::fill(r, std::make_index_sequence<R::Table::kFieldCount>()); }
};
template <class Traits>
struct Filler<ServingCell<Traits>> {
  static void fill(ServingCell<Traits>& cell) {
    sample::fill(cell, std::make_index_sequence<2>());
    for (int i = 0; i < 2; ++i) cell.neighbors().add(full<typename Traits::NeighborCell>());
  }
};

template <class R>
SharedPointer<R> full() {
  SharedPointer<R> r = R::create();
  Filler<R>::fill(*r);
  return r;
}
template <>
inline SharedPointer<CellularObjectDn> full<CellularObjectDn>() {
  return CellularObjectDn::create(CellularObjectDn::UtraFdd, 244, 5, CellularObjectDn::RncId, 300);
}

// Every record the factory knows, fully populated.
inline std::vector<SharedPointer<gom::ObjectBase>> allRecords() {
  return {full<GeranCellDn>(), full<UtraCellDn>(), full<GeranFrequencyInfo>(),
          full<UtraFddFrequencyInfo>(), full<Area>(), full<GeranCell>(),
          full<GeranNeighborCell>(), full<UtraFddCell>(), full<UtraFddNeighborCell>(),
          full<GeranServingCellMeasurement>(), full<GeranNwMeasurement>(),
          full<UtraFddServingCellMeasurement>(), full<UtraFddNwMeasurement>(),
          full<CellularObjectDn>(), full<CellularObject>(), full<EUtraCell>(),
          full<EUtraNeighborCell>(), full<EUtraServingCellMeasurement>(),
          full<EUtraNwMeasurement>(), full<EUtraFrequencyInfo>(), full<EUtraCellDn>(),
          full<CdmaCellDn>(), full<CdmaFrequencyInfo>(), full<CdmaCell>(),
          full<CdmaNeighborCell>(), full<CdmaServingCellMeasurement>(),
          full<CdmaNwMeasurement>(), full<UtraTddFrequencyInfo>(), full<UtraTddCell>(),
          full<UtraTddNeighborCell>(), full<UtraTddServingCellMeasurement>(),
          full<UtraTddNwMeasurement>()};
}

// A cell measurement with identity, time stamp, serving cell and three
// neighbours heard.
template <class M>
SharedPointer<M> measurement() {
  SharedPointer<M> m = M::create(full<typename M::Dn>(), 1700000000u);
  m->setServingCellMeasurement(full<typename M::ServingCellMeasurement>());
  for (int i = 0; i < 3; ++i) (void)m->addNwMeasurement(full<typename M::NwMeasurement>());
  return m;
}

// One measurement of every kind; WLAN and GNSS as bare objects of their type.
inline SharedPointer<MeasurementContainer> fullContainer() {
  SharedPointer<MeasurementContainer> c = MeasurementContainer::create();
  (void)c->addGeranMeasurement(measurement<GeranCellMeasurement>()->wrappedObject());
  SharedPointer<UtraFddCellMeasurement> fdd = measurement<UtraFddCellMeasurement>();
  fdd->setUnreliableStateTimeStamp(1699999990u);
  (void)c->addUtraFddMeasurement(fdd->wrappedObject());
  (void)c->addUtraTddMeasurement(measurement<UtraTddCellMeasurement>()->wrappedObject());
  (void)c->addEUtraMeasurement(measurement<EUtraCellMeasurement>()->wrappedObject());
  (void)c->addCdmaMeasurement(measurement<CdmaCellMeasurement>()->wrappedObject());
  SharedPointer<gom::GenericObject> wlan = gom::GenericObject::create(20);
  (void)wlan->setUint32Property(205, 1700000000u);
  (void)c->addWlanMeasurement(wlan);
  SharedPointer<gom::GenericObject> gnss = gom::GenericObject::create(21);
  (void)gnss->setUint32Property(205, 1700000000u);
  (void)c->addGnssMeasurement(gnss);
  return c;
}

}  // namespace sample

#endif  // LODESTACK_TESTS_SCHEMA_SAMPLERECORDS_H
