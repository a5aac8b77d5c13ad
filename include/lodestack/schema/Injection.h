// Injections: knowledge handed to the positioning side from outside a
// measurement, as property bags over a GenericObject (see
// GenericObjectWrapper.h). Per technology a serving cell injection (the cell,
// its measurement and coverage, and its neighbours' injections) and a
// neighbour cell injection; a cellular object injection; the GNSS injection
// (Gnss.h); and the Injection bag that collects them.
//
// Object types and flags (flag: property id), in the order of the flags:
//
//   serving cell injection  GERAN 6, UTRA-FDD 7, UTRA-TDD 8, E-UTRA 15,
//                           CDMA 18: dn 1: 200, timeStamp 2: 205,
//                           servingCellMeasurement 4: 202,
//                           servingCellNwMeasurement 8: 206, coverage 16: 204
//                           (an Area), neighborCellInjectionCollection 32: 307
//   neighbour cell inj.     GERAN 9, UTRA-FDD 10, UTRA-TDD 11, E-UTRA 16,
//                           CDMA 19: frequencyInfo 1: 201,
//                           neighborCellMeasurement 2: 203 (a network
//                           measurement), coverage 4: 204
//   CellularObjectInjection 12: dn 1: 200 (a CellularObjectDn), timeStamp
//                           2: 205, coverage 4: 204
//   Injection               5: the seven collections of its table below
//
// The neighbour injection types of the technologies but GERAN, and the bag's
// own type, fill the free ids beside the technology's other types (GERAN,
// UTRA-FDD and UTRA-TDD serving cell injections 6 to 8 and neighbour cell
// injections 9 to 11; E-UTRA 14 to 16 and CDMA 17 to 19 each hold the
// measurement, serving and neighbour types; 5 precedes them all).
//
// valueExists(mask) is false for a bit outside the class's flags, otherwise
// true when every flagged property exists; unset(mask) removes them. Like
// the cell measurements, and unlike the measurement layers, the getters do
// not throw: a time stamp reads 0 and an object an empty pointer when
// absent. The setters store the pointer they are given (empty included) and
// throw the failing Status. Factories return null on failure. One thread at
// a time.
#ifndef LODESTACK_SCHEMA_INJECTION_H
#define LODESTACK_SCHEMA_INJECTION_H

#include "lodestack/schema/Area.h"
#include "lodestack/schema/Cdma.h"
#include "lodestack/schema/CellularObject.h"
#include "lodestack/schema/EUtra.h"
#include "lodestack/schema/Geran.h"
#include "lodestack/schema/Gnss.h"
#include "lodestack/schema/InternalUtility.h"
#include "lodestack/schema/UtraFdd.h"
#include "lodestack/schema/UtraTdd.h"

namespace lodestack {
namespace schema {

// The property ids that the injections share.
enum InjectionPropertyId : unsigned short {
  kInjectionDnId = 200,
  kInjectionFrequencyInfoId = 201,
  kInjectionServingCellMeasurementId = 202,
  kInjectionNeighborCellMeasurementId = 203,
  kInjectionCoverageId = 204,
  kInjectionTimeStampId = 205,
  kInjectionServingCellNwMeasurementId = 206,
  kInjectionNeighborCellInjectionCollectionId = 307
};

// The common part of the injection classes. Self lists its flags as
// `static constexpr FlagProperty kFlags[]` and their union as kAllFlags.
template <class Self>
class LODESTACK_EXPORT InjectionObject : public MeasurementBase {
 public:
  bool valueExists(unsigned int mask) const override {
    return !(mask & ~Self::kAllFlags) && this->flagsPresent(mask, Self::kFlags);
  }
  void unset(unsigned int mask) override { this->removeFlags(mask, Self::kFlags); }

  // An empty injection; null on failure.
  static gom::SharedPointer<Self> create() {
    gom::SharedPointer<Self> i(new (std::nothrow) Self());
    return i && i->baseCreate(Self::kTypeId) ? i : gom::SharedPointer<Self>();
  }
  // Wraps `object` (shared); null unless its key is Self::kTypeId.
  static gom::SharedPointer<Self> create(const gom::SharedPointer<gom::GenericObject>& object) {
    gom::SharedPointer<Self> i(new (std::nothrow) Self());
    return i && i->baseCreate(Self::kTypeId, object) ? i : gom::SharedPointer<Self>();
  }

 protected:
  InjectionObject() = default;

  // Stores a record under `id` (throws the failing Status).
  template <class R>
  void setRecord(unsigned short id, const gom::SharedPointer<R>& record, const char* name) {
    this->setProperty(id, gom::SharedPointer<gom::ObjectBase>(record), name);
  }
  // Appends `object` to the collection under `id` when its type is `type`:
  // Refused (6) for an empty object or another type, else the append's
  // status.
  Status addTyped(const gom::SharedPointer<gom::GenericObject>& object, unsigned short type,
                  unsigned short id) {
    if (!object || object->key() != type) return Refused;
    return InternalUtility::addGenericObjectToCollection(this->object_, id, object);
  }
};

// One technology's records and injection types, for both injection classes.
template <class DnT, class FrequencyInfoT, class ServingCellMeasurementT, class NwMeasurementT,
          unsigned short ServingTypeId, unsigned short NeighborTypeId>
struct LODESTACK_EXPORT InjectionTraits {
  using Dn = DnT;
  using FrequencyInfo = FrequencyInfoT;
  using ServingCellMeasurement = ServingCellMeasurementT;
  using NwMeasurement = NwMeasurementT;
  static constexpr unsigned short kServingTypeId = ServingTypeId;
  static constexpr unsigned short kNeighborTypeId = NeighborTypeId;
};

template <class Traits>
class LODESTACK_EXPORT ServingCellInjection
    : public InjectionObject<ServingCellInjection<Traits>> {
  using Base = InjectionObject<ServingCellInjection<Traits>>;

 public:
  using Dn = typename Traits::Dn;
  using ServingCellMeasurement = typename Traits::ServingCellMeasurement;
  using NwMeasurement = typename Traits::NwMeasurement;
  static constexpr unsigned short kTypeId = Traits::kServingTypeId;
  static constexpr unsigned int kDn = 0x1, kTimeStamp = 0x2, kServingCellMeasurement = 0x4,
                                kServingCellNwMeasurement = 0x8, kCoverage = 0x10,
                                kNeighborCellInjectionCollection = 0x20, kAllFlags = 0x3F;
  static constexpr FlagProperty kFlags[] = {
      {kDn, kInjectionDnId},
      {kTimeStamp, kInjectionTimeStampId},
      {kServingCellMeasurement, kInjectionServingCellMeasurementId},
      {kServingCellNwMeasurement, kInjectionServingCellNwMeasurementId},
      {kCoverage, kInjectionCoverageId},
      {kNeighborCellInjectionCollection, kInjectionNeighborCellInjectionCollectionId}};

  using Base::create;
  // With the identity (200) and time stamp (205) set.
  static gom::SharedPointer<ServingCellInjection> create(const gom::SharedPointer<Dn>& dn,
                                                         unsigned int timeStamp) {
    gom::SharedPointer<ServingCellInjection> i(new (std::nothrow) ServingCellInjection());
    return i && i->baseCreate(dn, timeStamp) ? i : gom::SharedPointer<ServingCellInjection>();
  }

  gom::SharedPointer<Dn> dn() const { return this->template optionalRecord<Dn>(kInjectionDnId); }
  void setDn(const gom::SharedPointer<Dn>& dn) { this->setRecord(kInjectionDnId, dn, "dn"); }
  unsigned int timeStamp() const { return this->optionalUint32(kInjectionTimeStampId); }
  gom::SharedPointer<ServingCellMeasurement> servingCellMeasurement() const {
    return this->template optionalRecord<ServingCellMeasurement>(
        kInjectionServingCellMeasurementId);
  }
  void setServingCellMeasurement(const gom::SharedPointer<ServingCellMeasurement>& m) {
    this->setRecord(kInjectionServingCellMeasurementId, m, "servingCellMeasurement");
  }
  gom::SharedPointer<NwMeasurement> servingCellNwMeasurement() const {
    return this->template optionalRecord<NwMeasurement>(kInjectionServingCellNwMeasurementId);
  }
  void setServingCellNwMeasurement(const gom::SharedPointer<NwMeasurement>& m) {
    this->setRecord(kInjectionServingCellNwMeasurementId, m, "servingCellNwMeasurement");
  }
  gom::SharedPointer<Area> coverage() const {
    return this->template optionalRecord<Area>(kInjectionCoverageId);
  }
  void setCoverage(const gom::SharedPointer<Area>& area) {
    this->setRecord(kInjectionCoverageId, area, "coverage");
  }
  gom::SharedPointer<gom::ValueCollection> neighborCellInjectionCollection() const {
    return this->optionalCollection(kInjectionNeighborCellInjectionCollectionId);
  }
  void setNeighborCellInjectionCollection(const gom::SharedPointer<gom::ValueCollection>& c) {
    this->setProperty(kInjectionNeighborCellInjectionCollectionId, c,
                      "neighborCellInjectionCollection");
  }
  // Appends a neighbour cell injection of this technology to collection 307
  // (made on first use); Refused (6) for an empty object or another type.
  [[nodiscard]] Status addNeighborCellInjection(
      const gom::SharedPointer<gom::GenericObject>& injection) {
    return this->addTyped(injection, Traits::kNeighborTypeId,
                          kInjectionNeighborCellInjectionCollectionId);
  }

 protected:
  // Makes the object and sets properties 200 and 205.
  bool baseCreate(const gom::SharedPointer<Dn>& dn, unsigned int timeStamp) {
    return MeasurementBase::baseCreate(kTypeId, timeStamp) &&
           this->object_->setObjectProperty(kInjectionDnId, dn) == Ok;
  }
  using Base::baseCreate;

 private:
  friend Base;
  ServingCellInjection() = default;
};

template <class Traits>
class LODESTACK_EXPORT NeighborCellInjection
    : public InjectionObject<NeighborCellInjection<Traits>> {
  using Base = InjectionObject<NeighborCellInjection<Traits>>;

 public:
  using FrequencyInfo = typename Traits::FrequencyInfo;
  using NwMeasurement = typename Traits::NwMeasurement;
  static constexpr unsigned short kTypeId = Traits::kNeighborTypeId;
  static constexpr unsigned int kFrequencyInfo = 0x1, kNeighborCellMeasurement = 0x2,
                                kCoverage = 0x4, kAllFlags = 0x7;
  static constexpr FlagProperty kFlags[] = {
      {kFrequencyInfo, kInjectionFrequencyInfoId},
      {kNeighborCellMeasurement, kInjectionNeighborCellMeasurementId},
      {kCoverage, kInjectionCoverageId}};

  using Base::create;
  // With the frequency info (201) set.
  static gom::SharedPointer<NeighborCellInjection> create(
      const gom::SharedPointer<FrequencyInfo>& frequencyInfo) {
    gom::SharedPointer<NeighborCellInjection> i = create();
    if (i && i->object_->setObjectProperty(kInjectionFrequencyInfoId, frequencyInfo) != Ok)
      i.clear();
    return i;
  }

  gom::SharedPointer<FrequencyInfo> frequencyInfo() const {
    return this->template optionalRecord<FrequencyInfo>(kInjectionFrequencyInfoId);
  }
  void setFrequencyInfo(const gom::SharedPointer<FrequencyInfo>& f) {
    this->setRecord(kInjectionFrequencyInfoId, f, "frequencyInfo");
  }
  gom::SharedPointer<NwMeasurement> neighborCellMeasurement() const {
    return this->template optionalRecord<NwMeasurement>(kInjectionNeighborCellMeasurementId);
  }
  void setNeighborCellMeasurement(const gom::SharedPointer<NwMeasurement>& m) {
    this->setRecord(kInjectionNeighborCellMeasurementId, m, "neighborCellMeasurement");
  }
  gom::SharedPointer<Area> coverage() const {
    return this->template optionalRecord<Area>(kInjectionCoverageId);
  }
  void setCoverage(const gom::SharedPointer<Area>& area) {
    this->setRecord(kInjectionCoverageId, area, "coverage");
  }

 private:
  friend Base;
  NeighborCellInjection() = default;
};

struct LODESTACK_EXPORT GeranInjectionTraits
    : InjectionTraits<GeranCellDn, GeranFrequencyInfo, GeranServingCellMeasurement,
                      GeranNwMeasurement, 6, 9> {};
struct LODESTACK_EXPORT UtraFddInjectionTraits
    : InjectionTraits<UtraCellDn, UtraFddFrequencyInfo, UtraFddServingCellMeasurement,
                      UtraFddNwMeasurement, 7, 10> {};
struct LODESTACK_EXPORT UtraTddInjectionTraits
    : InjectionTraits<UtraCellDn, UtraTddFrequencyInfo, UtraTddServingCellMeasurement,
                      UtraTddNwMeasurement, 8, 11> {};
struct LODESTACK_EXPORT EUtraInjectionTraits
    : InjectionTraits<EUtraCellDn, EUtraFrequencyInfo, EUtraServingCellMeasurement,
                      EUtraNwMeasurement, 15, 16> {};
struct LODESTACK_EXPORT CdmaInjectionTraits
    : InjectionTraits<CdmaCellDn, CdmaFrequencyInfo, CdmaServingCellMeasurement,
                      CdmaNwMeasurement, 18, 19> {};

using GeranServingCellInjection = ServingCellInjection<GeranInjectionTraits>;
using UtraFddServingCellInjection = ServingCellInjection<UtraFddInjectionTraits>;
using UtraTddServingCellInjection = ServingCellInjection<UtraTddInjectionTraits>;
using EUtraServingCellInjection = ServingCellInjection<EUtraInjectionTraits>;
using CdmaServingCellInjection = ServingCellInjection<CdmaInjectionTraits>;
using GeranNeighborCellInjection = NeighborCellInjection<GeranInjectionTraits>;
using UtraFddNeighborCellInjection = NeighborCellInjection<UtraFddInjectionTraits>;
using UtraTddNeighborCellInjection = NeighborCellInjection<UtraTddInjectionTraits>;
using EUtraNeighborCellInjection = NeighborCellInjection<EUtraInjectionTraits>;
using CdmaNeighborCellInjection = NeighborCellInjection<CdmaInjectionTraits>;

class LODESTACK_EXPORT CellularObjectInjection : public InjectionObject<CellularObjectInjection> {
 public:
  static constexpr unsigned short kTypeId = 12;
  static constexpr unsigned int kDn = 0x1, kTimeStamp = 0x2, kCoverage = 0x4, kAllFlags = 0x7;
  static constexpr FlagProperty kFlags[] = {{kDn, kInjectionDnId},
                                            {kTimeStamp, kInjectionTimeStampId},
                                            {kCoverage, kInjectionCoverageId}};

  using InjectionObject::create;
  // In one step: identity (200), time stamp (205) and coverage (204).
  static gom::SharedPointer<CellularObjectInjection> create(
      const gom::SharedPointer<CellularObjectDn>& dn, unsigned int timeStamp,
      const gom::SharedPointer<Area>& coverage);
  ~CellularObjectInjection() override;

  gom::SharedPointer<CellularObjectDn> dn() const;
  void setDn(const gom::SharedPointer<CellularObjectDn>& dn);
  unsigned int timeStamp() const;
  gom::SharedPointer<Area> coverage() const;
  void setCoverage(const gom::SharedPointer<Area>& area);

 private:
  friend InjectionObject;
  CellularObjectInjection() = default;
};

// The top-level bag: one collection per kind of injection. Flags, property
// ids and the object type an added element must have:
//
//   flag  property  collection                    element type
//   0x01  304       geranInjectionCollection      6
//   0x02  305       utraFddInjectionCollection    7
//   0x40  306       utraTddInjectionCollection    8   (flag out of sequence
//   0x04  308       cellularObjectInjectionColl.  12   on purpose, as in the
//   0x08  309       gnssInjectionCollection       13   measurement container)
//   0x10  311       eutraInjectionCollection      15
//   0x20  313       cdmaInjectionCollection       18
class LODESTACK_EXPORT Injection : public InjectionObject<Injection> {
 public:
  static constexpr unsigned short kTypeId = 5;
  enum Flag : unsigned int {
    Geran = 0x01,
    UtraFdd = 0x02,
    CellularObject = 0x04,
    Gnss = 0x08,
    EUtra = 0x10,
    Cdma = 0x20,
    UtraTdd = 0x40
  };
  static constexpr unsigned int kAllFlags = 0x7F;
  static constexpr FlagProperty kFlags[] = {{Geran, 304},  {UtraFdd, 305}, {UtraTdd, 306},
                                            {CellularObject, 308}, {Gnss, 309},
                                            {EUtra, 311}, {Cdma, 313}};

  ~Injection() override;

  // Appends `object` to the collection under `propertyId` (made on first
  // use). Refused (6), with nothing changed, for an empty object or one
  // whose type is not `objectType`; otherwise the append's status.
  [[nodiscard]] Status addInjection(const gom::SharedPointer<gom::GenericObject>& object,
                                    unsigned short objectType, unsigned short propertyId) {
    return addTyped(object, objectType, propertyId);
  }
  // The collection under `propertyId`; empty when absent.
  gom::SharedPointer<gom::ValueCollection> injectionCollection(unsigned short propertyId) const {
    return optionalCollection(propertyId);
  }
  void setInjectionCollection(const gom::SharedPointer<gom::ValueCollection>& collection,
                              unsigned short propertyId) {
    setProperty(propertyId, collection, "injectionCollection");
  }

#define LODESTACK_INJECTION_ROW(Name, name, type, id)                                    \
  [[nodiscard]] Status add##Name##Injection(const gom::SharedPointer<gom::GenericObject>& o) { \
    return addInjection(o, type, id);                                                     \
  }                                                                                       \
  void set##Name##InjectionCollection(const gom::SharedPointer<gom::ValueCollection>& c) { \
    setInjectionCollection(c, id);                                                        \
  }                                                                                       \
  gom::SharedPointer<gom::ValueCollection> name##InjectionCollection() const {            \
    return injectionCollection(id);                                                       \
  }
  LODESTACK_INJECTION_ROW(Geran, geran, 6, 304)
  LODESTACK_INJECTION_ROW(UtraFdd, utraFdd, 7, 305)
  LODESTACK_INJECTION_ROW(UtraTdd, utraTdd, 8, 306)
  LODESTACK_INJECTION_ROW(CellularObject, cellularObject, 12, 308)
  LODESTACK_INJECTION_ROW(Gnss, gnss, 13, 309)
  LODESTACK_INJECTION_ROW(EUtra, eutra, 15, 311)
  LODESTACK_INJECTION_ROW(Cdma, cdma, 18, 313)
#undef LODESTACK_INJECTION_ROW

 private:
  friend InjectionObject;
  Injection() = default;
};

}  // namespace schema
}  // namespace lodestack

#endif  // LODESTACK_SCHEMA_INJECTION_H
