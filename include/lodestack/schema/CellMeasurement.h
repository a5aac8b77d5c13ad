// CellMeasurement<Traits>: the measurement set of one cellular technology,
// over the wrapped GenericObject of type Traits::kTypeId. Traits names:
//   Base                    the Measurement<Dn, id> layer below;
//   ServingCellMeasurement  the record under property 202 (flag 0x4);
//   NwMeasurement           the records of the collection 303 (flag 0x8);
//   kTypeId                 the wrapped object's key;
//   kUnreliableState        whether property 207 (flag 0x10, start of the
//                           modem's unreliable state) exists.
//
// Unlike the layers below, the getters of this class do not throw:
// timeStamp() and unreliableStateTimeStamp() give 0 when absent, dn(),
// servingCellMeasurement() and nwMeasurementCollection() an empty pointer.
// The setters throw the failing Status (see GenericObjectWrapper).
// Factories do not throw: they return null on failure. One thread at a time.
#ifndef LODESTACK_SCHEMA_CELLMEASUREMENT_H
#define LODESTACK_SCHEMA_CELLMEASUREMENT_H

#include "lodestack/schema/InternalUtility.h"
#include "lodestack/schema/MeasurementBase.h"

namespace lodestack {
namespace schema {

template <class Traits>
class LODESTACK_EXPORT CellMeasurement : public Traits::Base {
  using Base = typename Traits::Base;

 public:
  using Dn = typename Base::Dn;
  using ServingCellMeasurement = typename Traits::ServingCellMeasurement;
  using NwMeasurement = typename Traits::NwMeasurement;

  static constexpr unsigned short kTypeId = Traits::kTypeId;
  static constexpr unsigned int kServingCellMeasurement = 0x4;
  static constexpr unsigned int kNwMeasurementCollection = 0x8;
  static constexpr unsigned int kUnreliableStateTimeStamp = 0x10;
  static constexpr unsigned int kAllFlags = (Traits::kUnreliableState ? 0x1F : 0xF);
  static constexpr unsigned short kServingCellMeasurementId = 202;
  static constexpr unsigned short kNwMeasurementCollectionId = 303;
  static constexpr unsigned short kUnreliableStateTimeStampId = 207;

  // An empty measurement; null when memory is exhausted.
  static gom::SharedPointer<CellMeasurement> create() {
    gom::SharedPointer<CellMeasurement> m(new (std::nothrow) CellMeasurement());
    return m && m->baseCreate(kTypeId) ? m : gom::SharedPointer<CellMeasurement>();
  }
  // With the identity (200) and time stamp (205) set.
  static gom::SharedPointer<CellMeasurement> create(const gom::SharedPointer<Dn>& dn,
                                                    unsigned int timeStamp) {
    gom::SharedPointer<CellMeasurement> m(new (std::nothrow) CellMeasurement());
    return m && m->baseCreate(kTypeId, dn, timeStamp) ? m : gom::SharedPointer<CellMeasurement>();
  }
  // Wraps `object` (shared); null unless its key is kTypeId.
  static gom::SharedPointer<CellMeasurement> create(
      const gom::SharedPointer<gom::GenericObject>& object) {
    gom::SharedPointer<CellMeasurement> m(new (std::nothrow) CellMeasurement());
    return m && m->baseCreate(kTypeId, object) ? m : gom::SharedPointer<CellMeasurement>();
  }

  CellMeasurement(const CellMeasurement&) = default;
  CellMeasurement& operator=(const CellMeasurement&) = default;

  bool valueExists(unsigned int mask) const override {
    return !(mask & ~kAllFlags) && this->flagsPresent(mask, kOwnFlags) &&
           Base::valueExists(mask & Base::kAllFlags);
  }
  void unset(unsigned int mask) override {
    this->removeFlags(mask, kOwnFlags);
    Base::unset(mask & Base::kAllFlags);
  }

  unsigned int timeStamp() const { return this->optionalUint32(MeasurementBase::kTimeStampId); }
  gom::SharedPointer<Dn> dn() const { return this->template optionalRecord<Dn>(Base::kDnId); }
  gom::SharedPointer<ServingCellMeasurement> servingCellMeasurement() const {
    return this->template optionalRecord<ServingCellMeasurement>(kServingCellMeasurementId);
  }
  void setServingCellMeasurement(const gom::SharedPointer<ServingCellMeasurement>& m) {
    this->setProperty(kServingCellMeasurementId, gom::SharedPointer<gom::ObjectBase>(m),
                      "servingCellMeasurement");
  }
  gom::SharedPointer<gom::ValueCollection> nwMeasurementCollection() const {
    return this->optionalCollection(kNwMeasurementCollectionId);
  }
  void setNwMeasurementCollection(const gom::SharedPointer<gom::ValueCollection>& collection) {
    this->setProperty(kNwMeasurementCollectionId, collection, "nwMeasurementCollection");
  }
  // Appends a network measurement of this technology to collection 303 (made
  // on first use). Refused (6) for an empty pointer or a record of another
  // type; otherwise the status of the append.
  [[nodiscard]] Status addNwMeasurement(const gom::SharedPointer<gom::ObjectBase>& m) {
    if (!m || m->key() != NwMeasurement::kTypeId) return Refused;
    return InternalUtility::addObjectBaseToCollection(this->object_, kNwMeasurementCollectionId, m);
  }

  // Start of the modem's unreliable state (UTRA only); 0 when absent.
  unsigned int unreliableStateTimeStamp() const {
    static_assert(Traits::kUnreliableState, "no unreliable state in this technology");
    return this->optionalUint32(kUnreliableStateTimeStampId);
  }
  void setUnreliableStateTimeStamp(unsigned int timeStamp) {
    static_assert(Traits::kUnreliableState, "no unreliable state in this technology");
    this->setProperty(kUnreliableStateTimeStampId, timeStamp, "unreliableStateTimeStamp");
  }

 private:
  static constexpr FlagProperty kOwnFlags[] = {
      {kServingCellMeasurement, kServingCellMeasurementId},
      {kNwMeasurementCollection, kNwMeasurementCollectionId},
      {kAllFlags & kUnreliableStateTimeStamp, kUnreliableStateTimeStampId}};

  CellMeasurement() = default;
};

// The traits of one technology's cell measurement in one line.
template <class BaseT, class ServingCellMeasurementT, class NwMeasurementT,
          unsigned short TypeId, bool UnreliableState>
struct LODESTACK_EXPORT CellMeasurementTraits {
  using Base = BaseT;
  using ServingCellMeasurement = ServingCellMeasurementT;
  using NwMeasurement = NwMeasurementT;
  static constexpr unsigned short kTypeId = TypeId;
  static constexpr bool kUnreliableState = UnreliableState;
};

}  // namespace schema
}  // namespace lodestack

#endif  // LODESTACK_SCHEMA_CELLMEASUREMENT_H
