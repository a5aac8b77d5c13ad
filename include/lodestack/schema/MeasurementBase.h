// MeasurementBase and Measurement<Dn, TypeId>: the roots of the measurement
// classes, typed faces of a wrapped GenericObject (see GenericObjectWrapper)
// whose key is the measurement's type id.
//
// Each class layer owns a few flags (bits of an unsigned int mask), each
// naming one property of the wrapped object. valueExists(mask) is false for a
// bit outside the class's complete flag set and otherwise true when every
// flagged property exists (0 is always true); unset(mask) removes the flagged
// properties that exist. The typed getters of these two layers throw NotFound
// (4) for an absent property: test valueExists first. Setters throw the
// failing Status. Measurements share their object on copy; equality compares
// the wrapped objects. One thread at a time.
#ifndef LODESTACK_SCHEMA_MEASUREMENTBASE_H
#define LODESTACK_SCHEMA_MEASUREMENTBASE_H

#include <cstddef>

#include "lodestack/schema/GenericObjectWrapper.h"

namespace lodestack {
namespace schema {

// One flag of a measurement class and the property id it names.
struct FlagProperty {
  unsigned int flag;
  unsigned short id;
};

class LODESTACK_EXPORT MeasurementBase : public GenericObjectWrapper {
 public:
  static constexpr unsigned int kTimeStamp = 0x2;
  static constexpr unsigned int kAllFlags = kTimeStamp;
  static constexpr unsigned short kTimeStampId = 205;

  ~MeasurementBase() override;

  virtual bool valueExists(unsigned int mask) const;
  virtual void unset(unsigned int mask);
  virtual void dump() const;

  // Seconds since the epoch; throws NotFound when absent.
  unsigned int timeStamp() const;
  void setTimeStamp(unsigned int timeStamp);

  // The wrapped objects by content (both absent counts as equal).
  bool operator==(const MeasurementBase& other) const;
  bool operator!=(const MeasurementBase& other) const { return !(*this == other); }

 protected:
  MeasurementBase();
  MeasurementBase(const MeasurementBase&) = default;
  MeasurementBase& operator=(const MeasurementBase&) = default;

  // Make the wrapped object with key typeId (and property 205); false when
  // that fails.
  bool baseCreate(unsigned short typeId);
  bool baseCreate(unsigned short typeId, unsigned int timeStamp);
  // Wraps `object` (shared) when its key is typeId; false otherwise.
  bool baseCreate(unsigned short typeId, const gom::SharedPointer<gom::GenericObject>& object);

  // Every flag of `flags` that is in `mask` has its property.
  bool flagsPresent(unsigned int mask, const FlagProperty* flags, std::size_t count) const;
  // Removes the property of every flag of `flags` that is in `mask`.
  void removeFlags(unsigned int mask, const FlagProperty* flags, std::size_t count);
  template <std::size_t N>
  bool flagsPresent(unsigned int mask, const FlagProperty (&flags)[N]) const {
    return flagsPresent(mask, flags, N);
  }
  template <std::size_t N>
  void removeFlags(unsigned int mask, const FlagProperty (&flags)[N]) {
    removeFlags(mask, flags, N);
  }

  // Lenient reads for the classes whose getters do not throw: the record
  // under `id` as an R (empty when absent or of another class), the
  // collection under `id` (empty when absent), the number under `id` (0
  // when absent).
  template <class R>
  gom::SharedPointer<R> optionalRecord(unsigned short id) const {
    gom::SharedPointer<gom::ObjectBase> record;
    if (!object_ || object_->getObjectProperty(id, record) != Ok) return gom::SharedPointer<R>();
    return gom::SharedPointer<R>::cast(record);
  }
  gom::SharedPointer<gom::ValueCollection> optionalCollection(unsigned short id) const;
  unsigned int optionalUint32(unsigned short id) const;
};

// The layer that adds the measured cell's identity, a Dn record under
// property 200 (flag 0x1). TypeId is the measurement type the layer was made
// for (the UTRA-FDD and UTRA-TDD measurements share Measurement<UtraCellDn, 4>).
template <class DnT, unsigned short TypeId>
class LODESTACK_EXPORT Measurement : public MeasurementBase {
 public:
  using Dn = DnT;
  static constexpr unsigned short kTypeId = TypeId;
  static constexpr unsigned int kDn = 0x1;
  static constexpr unsigned int kAllFlags = kDn | MeasurementBase::kAllFlags;
  static constexpr unsigned short kDnId = 200;

  bool valueExists(unsigned int mask) const override {
    return !(mask & ~kAllFlags) && flagsPresent(mask, kOwnFlags) &&
           MeasurementBase::valueExists(mask & MeasurementBase::kAllFlags);
  }
  void unset(unsigned int mask) override {
    removeFlags(mask, kOwnFlags);
    MeasurementBase::unset(mask & MeasurementBase::kAllFlags);
  }

  // Throws NotFound when absent; empty when the stored record is not a Dn.
  gom::SharedPointer<Dn> dn() const {
    gom::SharedPointer<gom::ObjectBase> record;
    getProperty(kDnId, record, "dn");
    return gom::SharedPointer<Dn>::cast(record);
  }
  void setDn(const gom::SharedPointer<Dn>& dn) {
    setProperty(kDnId, gom::SharedPointer<gom::ObjectBase>(dn), "dn");
  }

 protected:
  static constexpr FlagProperty kOwnFlags[] = {{kDn, kDnId}};

  Measurement() = default;
  Measurement(const Measurement&) = default;
  Measurement& operator=(const Measurement&) = default;

  bool baseCreate(unsigned short typeId, const gom::SharedPointer<Dn>& dn,
                  unsigned int timeStamp) {
    if (!MeasurementBase::baseCreate(typeId, timeStamp)) return false;
    return object_->setObjectProperty(kDnId, dn) == Ok;
  }
  using MeasurementBase::baseCreate;
};

}  // namespace schema
}  // namespace lodestack

#endif  // LODESTACK_SCHEMA_MEASUREMENTBASE_H
