#include "lodestack/measurements/MeasurementsValidator.h"

namespace lodestack {

using gom::GenericObject;
using gom::ObjectBase;
using gom::SharedPointer;
using gom::ValueCollection;
using V = MeasurementsValidator;
namespace s = schema;

namespace {

const unsigned short kTimeStampId = 205;
const unsigned short kDnId = 200;
const unsigned short kServingCellId = 202;
const unsigned short kNeighboursId = 303;

// One technology's keys, required presence masks and named checks. The
// serving cell's checked part is the field at kServingPartBit: the frequency
// info, or for E-UTRA the network measurement, checked by servingPartValid.
struct Geran {
  using Dn = s::GeranCellDn;
  using FrequencyInfo = s::GeranFrequencyInfo;
  using Serving = s::GeranServingCellMeasurement;
  using Nw = s::GeranNwMeasurement;
  static constexpr unsigned short kMeasurementKey = 2, kDnKey = 100, kServingKey = 109,
                                  kNwKey = 110;
  static constexpr unsigned char kDnMask = 15, kFrequencyInfoMask = 3, kServingPartBit = 4;
  static SharedPointer<FrequencyInfo> servingPart(const Serving& s) { return s.frequencyInfo(); }
  static Status validateServingPart(const FrequencyInfo& f) { return V::validateGeranFrequencyInfo(f); }
  static Status validateDn(const Dn& dn) { return V::validateGeranDn(dn); }
  static Status validateFrequencyInfo(const FrequencyInfo& f) { return V::validateGeranFrequencyInfo(f); }
  static Status validateServing(Serving& s) { return V::validateGeranServingCell(s); }
  static Status validateNw(const Nw& nw) { return V::validateGeranNwMeasurement(nw); }
  // A neighbour's lac (bit 2) and cid (bit 4) come together or not at all.
  static bool extraNwCheck(const Nw& nw) { return nw.valueExists(2) == nw.valueExists(4); }
};

struct UtraFdd {
  using Dn = s::UtraCellDn;
  using FrequencyInfo = s::UtraFddFrequencyInfo;
  using Serving = s::UtraFddServingCellMeasurement;
  using Nw = s::UtraFddNwMeasurement;
  static constexpr unsigned short kMeasurementKey = 3, kDnKey = 101, kServingKey = 111,
                                  kNwKey = 112;
  static constexpr unsigned char kDnMask = 7, kFrequencyInfoMask = 3, kServingPartBit = 2;
  static SharedPointer<FrequencyInfo> servingPart(const Serving& s) { return s.frequencyInfo(); }
  static Status validateServingPart(const FrequencyInfo& f) { return V::validateUtraFddFrequencyInfo(f); }
  static Status validateDn(const Dn& dn) { return V::validateUtraDn(dn); }
  static Status validateFrequencyInfo(const FrequencyInfo& f) { return V::validateUtraFddFrequencyInfo(f); }
  static Status validateServing(Serving& s) { return V::validateUtraFddServingCell(s); }
  static Status validateNw(const Nw& nw) { return V::validateUtraFddNwMeasurement(nw); }
  static bool extraNwCheck(const Nw&) { return true; }
};

struct UtraTdd {
  using Dn = s::UtraCellDn;
  using FrequencyInfo = s::UtraTddFrequencyInfo;
  using Serving = s::UtraTddServingCellMeasurement;
  using Nw = s::UtraTddNwMeasurement;
  static constexpr unsigned short kMeasurementKey = 4, kDnKey = 101, kServingKey = 134,
                                  kNwKey = 135;
  // The identity is UTRA-FDD's and checked by validateUtraDn.
  static constexpr unsigned char kFrequencyInfoMask = 3, kServingPartBit = 2;
  static SharedPointer<FrequencyInfo> servingPart(const Serving& s) { return s.frequencyInfo(); }
  static Status validateServingPart(const FrequencyInfo& f) { return V::validateUtraTddFrequencyInfo(f); }
  static Status validateDn(const Dn& dn) { return V::validateUtraDn(dn); }
  static Status validateFrequencyInfo(const FrequencyInfo& f) { return V::validateUtraTddFrequencyInfo(f); }
  static Status validateServing(Serving& s) { return V::validateUtraTddServingCell(s); }
  static Status validateNw(const Nw& nw) { return V::validateUtraTddNwMeasurement(nw); }
  static bool extraNwCheck(const Nw&) { return true; }
};

struct EUtra {
  using Dn = s::EUtraCellDn;
  using FrequencyInfo = s::EUtraFrequencyInfo;
  using Serving = s::EUtraServingCellMeasurement;
  using Nw = s::EUtraNwMeasurement;
  static constexpr unsigned short kMeasurementKey = 14, kDnKey = 121, kServingKey = 118,
                                  kNwKey = 119;
  static constexpr unsigned char kDnMask = 7, kFrequencyInfoMask = 3, kServingPartBit = 1;
  static SharedPointer<Nw> servingPart(const Serving& s) { return s.nwMeasurement(); }
  static Status validateServingPart(const Nw& nw) { return V::validateEUtraNwMeasurement(nw); }
  static Status validateDn(const Dn& dn) { return V::validateEUtraDn(dn); }
  static Status validateFrequencyInfo(const FrequencyInfo& f) { return V::validateEUtraFrequencyInfo(f); }
  static Status validateServing(Serving& s) { return V::validateEUtraServingCell(s); }
  static Status validateNw(const Nw& nw) { return V::validateEUtraNwMeasurement(nw); }
  static bool extraNwCheck(const Nw&) { return true; }
};

struct Cdma {
  using Dn = s::CdmaCellDn;
  using FrequencyInfo = s::CdmaFrequencyInfo;
  using Serving = s::CdmaServingCellMeasurement;
  using Nw = s::CdmaNwMeasurement;
  // Neighbours (key 127) are not checked.
  static constexpr unsigned short kMeasurementKey = 17, kDnKey = 122, kServingKey = 126;
  static constexpr unsigned char kDnMask = 7, kFrequencyInfoMask = 0, kServingPartBit = 1;
  static SharedPointer<FrequencyInfo> servingPart(const Serving& s) { return s.frequencyInfo(); }
  static Status validateServingPart(const FrequencyInfo& f) { return V::validateCdmaFrequencyInfo(f); }
  static Status validateDn(const Dn& dn) { return V::validateCdmaDn(dn); }
  static Status validateFrequencyInfo(const FrequencyInfo& f) { return V::validateCdmaFrequencyInfo(f); }
  static Status validateServing(Serving& s) { return V::validateCdmaServingCell(s); }
  static Status validateNw(const Nw& nw) { return V::validateCdmaNwMeasurement(nw); }
  static bool extraNwCheck(const Nw&) { return true; }
};

// The record under `id` as an R with key `key`; null otherwise.
template <class R>
SharedPointer<R> recordProperty(const GenericObject& object, unsigned short id, unsigned short key) {
  SharedPointer<ObjectBase> record;
  if (object.getObjectProperty(id, record) != Ok || !record || record->key() != key)
    return SharedPointer<R>();
  return SharedPointer<R>::cast(record);
}

template <class Rat>
Status validateMeasurement(SharedPointer<GenericObject>& m) {
  unsigned int timeStamp;
  if (!m || m->key() != Rat::kMeasurementKey || m->getUint32Property(kTimeStampId, timeStamp) != Ok)
    return InvalidArgument;
  SharedPointer<typename Rat::Dn> dn = recordProperty<typename Rat::Dn>(*m, kDnId, Rat::kDnKey);
  if (!dn) return InvalidArgument;
  const Status dnStatus = Rat::validateDn(*dn);
  if (dnStatus != Ok) return dnStatus;

  // The serving cell is optional: a wrong or invalid one goes, the
  // measurement stays.
  SharedPointer<typename Rat::Serving> serving =
      recordProperty<typename Rat::Serving>(*m, kServingCellId, Rat::kServingKey);
  if (!serving || Rat::validateServing(*serving) != Ok) m->removeProperty(kServingCellId);

  V::validateNwMeasurementCollection(Rat::kMeasurementKey, m);
  return Ok;
}

template <class R>
Status requireMask(const R& record, unsigned char mask) {
  return record.valueExists(mask) ? Ok : InvalidArgument;
}

// Never fails: an incomplete part is unset and the serving cell kept.
template <class Rat>
Status validateServingCell(typename Rat::Serving& serving) {
  if (!serving.valueExists(Rat::kServingPartBit)) return Ok;
  const auto part = Rat::servingPart(serving);
  if (!part || Rat::validateServingPart(*part) != Ok) serving.unset(Rat::kServingPartBit);
  return Ok;
}

template <class Rat>
Status validateNwMeasurement(const typename Rat::Nw& nw) {
  if (!nw.valueExists(1) || !nw.frequencyInfo()) return InvalidArgument;
  const Status status = Rat::validateFrequencyInfo(*nw.frequencyInfo());
  if (status != Ok) return status;
  return Rat::extraNwCheck(nw) ? Ok : InvalidArgument;
}

// Removes the items of `collection` for which `valid` is false.
template <class Valid>
void removeInvalid(ValueCollection& collection, Valid valid) {
  for (unsigned int i = 0; i < collection.size();) {
    if (valid(collection.item(i)))
      ++i;
    else
      collection.removeAt(i);
  }
}

template <class Rat>
void validateNeighbours(ValueCollection& neighbours) {
  removeInvalid(neighbours, [](const gom::Variant* item) {
    SharedPointer<ObjectBase> record;
    if (!item || item->getObjectValue(record) != Ok || !record || record->key() != Rat::kNwKey)
      return false;
    SharedPointer<typename Rat::Nw> nw = SharedPointer<typename Rat::Nw>::cast(record);
    return nw && Rat::validateNw(*nw) == Ok;
  });
}

template <class Rat>
void validateMeasurements(ValueCollection& measurements) {
  removeInvalid(measurements, [](const gom::Variant* item) {
    SharedPointer<GenericObject> m;
    if (!item || item->getGenericObjectValue(m) != Ok || !m) return false;
    return validateMeasurement<Rat>(m) == Ok;
  });
}

// The collection under `id`, or null when absent. A collection empty on
// entry is removed from its holder and null returned.
SharedPointer<ValueCollection> nonEmptyCollection(GenericObject& holder, unsigned short id) {
  SharedPointer<ValueCollection> collection;
  if (holder.getCollectionProperty(id, collection) != Ok || !collection)
    return SharedPointer<ValueCollection>();
  if (collection->empty()) {
    holder.removeProperty(id);
    return SharedPointer<ValueCollection>();
  }
  return collection;
}

}  // namespace

void V::validateMeasurementCollection(unsigned short collectionId,
                                      SharedPointer<GenericObject>& container) {
  if (!container) return;
  SharedPointer<ValueCollection> collection = nonEmptyCollection(*container, collectionId);
  if (!collection) return;
  switch (collectionId) {
    case 300: return validateMeasurements<Geran>(*collection);
    case 301: return validateMeasurements<UtraFdd>(*collection);
    case 302: return validateMeasurements<UtraTdd>(*collection);
    case 310: return validateMeasurements<EUtra>(*collection);
    case 312: return validateMeasurements<Cdma>(*collection);
    default: return;
  }
}

void V::validateNwMeasurementCollection(unsigned short measurementKey,
                                        SharedPointer<GenericObject>& measurement) {
  if (!measurement) return;
  SharedPointer<ValueCollection> neighbours = nonEmptyCollection(*measurement, kNeighboursId);
  if (!neighbours) return;
  switch (measurementKey) {
    case Geran::kMeasurementKey: return validateNeighbours<Geran>(*neighbours);
    case UtraFdd::kMeasurementKey: return validateNeighbours<UtraFdd>(*neighbours);
    case UtraTdd::kMeasurementKey: return validateNeighbours<UtraTdd>(*neighbours);
    case EUtra::kMeasurementKey: return validateNeighbours<EUtra>(*neighbours);
    default: return;  // CDMA neighbours are not checked
  }
}

// The named checks, one line each over the templates above.
#define LODESTACK_RAT_VALIDATORS(Name, Rat)                                                    \
  Status V::validate##Name##Measurement(SharedPointer<GenericObject>& m) {                     \
    return validateMeasurement<Rat>(m);                                                        \
  }                                                                                            \
  Status V::validate##Name##FrequencyInfo(const Rat::FrequencyInfo& info) {                    \
    return requireMask(info, Rat::kFrequencyInfoMask);                                    \
  }                                                                                            \
  Status V::validate##Name##ServingCell(Rat::Serving& serving) {                               \
    return validateServingCell<Rat>(serving);                                                  \
  }                                                                                            \
  Status V::validate##Name##NwMeasurement(const Rat::Nw& nw) { return validateNwMeasurement<Rat>(nw); }

LODESTACK_RAT_VALIDATORS(Geran, Geran)
LODESTACK_RAT_VALIDATORS(UtraFdd, UtraFdd)
LODESTACK_RAT_VALIDATORS(UtraTdd, UtraTdd)
LODESTACK_RAT_VALIDATORS(EUtra, EUtra)
LODESTACK_RAT_VALIDATORS(Cdma, Cdma)
#undef LODESTACK_RAT_VALIDATORS

Status V::validateGeranDn(const s::GeranCellDn& dn) { return requireMask(dn, Geran::kDnMask); }
Status V::validateUtraDn(const s::UtraCellDn& dn) { return requireMask(dn, UtraFdd::kDnMask); }
Status V::validateEUtraDn(const s::EUtraCellDn& dn) { return requireMask(dn, EUtra::kDnMask); }
Status V::validateCdmaDn(const s::CdmaCellDn& dn) { return requireMask(dn, Cdma::kDnMask); }

}  // namespace lodestack
