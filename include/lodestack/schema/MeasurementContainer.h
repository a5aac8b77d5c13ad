// MeasurementContainer: the object tree one measurement request produces.
// It wraps a GenericObject of key 1 holding one ValueCollection per kind of
// measurement; each item is a variant of code 13 holding one measurement's
// generic object (shared, not copied):
//
//   flag  property  kind       item type id
//   0x01  300       GERAN      2
//   0x02  301       UTRA-FDD   3
//   0x40  302       UTRA-TDD   4   (flag out of sequence on purpose: masks
//   0x04  310       E-UTRA     14   are exchanged with the rest of the library)
//   0x08  312       CDMA       17
//   0x10  314       WLAN       20
//   0x20  315       GNSS       21
//
// Factories and the add operations report by null and Status; the collection
// getters throw NotFound (4) when the collection is absent (test valueExists
// first), the setters throw the failing Status; the indexed getters give null
// for an absent collection or an index past the end. One thread at a time.
#ifndef LODESTACK_SCHEMA_MEASUREMENTCONTAINER_H
#define LODESTACK_SCHEMA_MEASUREMENTCONTAINER_H

#include "lodestack/schema/MeasurementBase.h"

// The four named operations of one row of the table above.
#define LODESTACK_CONTAINER_ROW(Name, name, typeId, propertyId)                           \
  void set##Name##MeasurementCollection(const gom::SharedPointer<gom::ValueCollection>& c) { \
    setMeasurementCollection(c, propertyId);                                              \
  }                                                                                       \
  [[nodiscard]] Status add##Name##Measurement(const gom::SharedPointer<gom::GenericObject>& m) { \
    return addMeasurement(m, typeId, propertyId);                                         \
  }                                                                                       \
  gom::SharedPointer<gom::ValueCollection> name##MeasurementCollection() const {          \
    return measurementCollection(propertyId);                                             \
  }                                                                                       \
  gom::SharedPointer<gom::GenericObject> name##Measurement(unsigned int index) const {    \
    return collectionItem(optionalCollection(propertyId), index);                         \
  }

namespace lodestack {
namespace schema {

class LODESTACK_EXPORT MeasurementContainer : public MeasurementBase {
 public:
  static constexpr unsigned short kTypeId = 1;
  enum Flag : unsigned int {
    Geran = 0x01,
    UtraFdd = 0x02,
    EUtra = 0x04,
    Cdma = 0x08,
    Wlan = 0x10,
    Gnss = 0x20,
    UtraTdd = 0x40
  };
  static constexpr unsigned int kAllFlags = 0x7F;

  // An empty container; null when memory is exhausted.
  static gom::SharedPointer<MeasurementContainer> create();
  // Wraps `object` (shared); null unless its key is 1.
  static gom::SharedPointer<MeasurementContainer> create(
      const gom::SharedPointer<gom::GenericObject>& object);

  ~MeasurementContainer() override;

  bool valueExists(unsigned int mask) const override;
  void unset(unsigned int mask) override;

  void setMeasurementCollection(const gom::SharedPointer<gom::ValueCollection>& collection,
                                unsigned short propertyId);
  // Appends `m` to the collection under collectionId, made on first use.
  // Refused (6) when m is empty or its key is not typeId.
  [[nodiscard]] Status addMeasurement(const gom::SharedPointer<gom::GenericObject>& m,
                                      unsigned short typeId, unsigned short collectionId);
  gom::SharedPointer<gom::ValueCollection> measurementCollection(unsigned short propertyId) const;
  // The generic object at `index`; null past the end, for an empty
  // collection pointer or for an item that holds no generic object.
  static gom::SharedPointer<gom::GenericObject> collectionItem(
      const gom::SharedPointer<gom::ValueCollection>& collection, unsigned int index);

  LODESTACK_CONTAINER_ROW(Geran, geran, 2, 300)
  LODESTACK_CONTAINER_ROW(UtraFdd, utraFdd, 3, 301)
  LODESTACK_CONTAINER_ROW(UtraTdd, utraTdd, 4, 302)
  LODESTACK_CONTAINER_ROW(EUtra, eutra, 14, 310)
  LODESTACK_CONTAINER_ROW(Cdma, cdma, 17, 312)
  LODESTACK_CONTAINER_ROW(Wlan, wlan, 20, 314)
  LODESTACK_CONTAINER_ROW(Gnss, gnss, 21, 315)

 private:
  MeasurementContainer();
};

}  // namespace schema
}  // namespace lodestack

#undef LODESTACK_CONTAINER_ROW

#endif  // LODESTACK_SCHEMA_MEASUREMENTCONTAINER_H
