// CellularObjectDn (type id 114): a technology-neutral, layered cell
// identity (country, network, area) that can be derived from a GERAN or UTRA
// identity. It has no presence mask: idType tells how many layers are valid
// (1: layer1; 2: layer1 and layer2; 3: all three), and only those take part
// in equality. Bytes: version 1, then idType u8, nwType u8, layer1 u16,
// layer2 u16, l3IdType u8, layer3 u32.
//
// CellularObject (type id 115): a CellularObjectDn (bit 1) with its coverage
// Area (bit 2), following the value-record conventions of Record.h.
//
// Factories return an empty pointer for a refused argument or when memory is
// exhausted. One thread at a time.
#ifndef LODESTACK_SCHEMA_CELLULAROBJECT_H
#define LODESTACK_SCHEMA_CELLULAROBJECT_H

#include "lodestack/schema/Area.h"
#include "lodestack/schema/CellDn.h"

namespace lodestack {
namespace schema {

class LODESTACK_EXPORT CellularObjectDn : public gom::ObjectBase {
 public:
  static constexpr unsigned short kTypeId = 114;
  enum IdType : unsigned char { Layer1 = 1, Layer2 = 2, Layer3 = 3 };
  // The schema's five cellular network kinds; only Geran (1) is fixed by
  // the format, the rest follow the order of the measurement type ids.
  enum NwType : unsigned char { Geran = 1, UtraFdd = 2, UtraTdd = 3, EUtra = 4, Cdma = 5 };
  // Third-layer id kinds: no factory produces TrackingAreaCode.
  enum L3IdType : unsigned char { LocationAreaCode = 1, RncId = 2, TrackingAreaCode = 3 };

  CellularObjectDn();
  CellularObjectDn(NwType nwType, unsigned short layer1);
  CellularObjectDn(NwType nwType, unsigned short layer1, unsigned short layer2);
  CellularObjectDn(NwType nwType, unsigned short layer1, unsigned short layer2,
                   L3IdType l3IdType, unsigned int layer3);

  // idType 1 and nwType 0 (not checked).
  static gom::SharedPointer<CellularObjectDn> create();
  // Refused unless nwType is 1 to 5 (and l3IdType 1 to 3).
  static gom::SharedPointer<CellularObjectDn> create(NwType nwType, unsigned short layer1);
  static gom::SharedPointer<CellularObjectDn> create(NwType nwType, unsigned short layer1,
                                                     unsigned short layer2);
  static gom::SharedPointer<CellularObjectDn> create(NwType nwType, unsigned short layer1,
                                                     unsigned short layer2, L3IdType l3IdType,
                                                     unsigned int layer3);
  // From a GERAN identity: nwType Geran; mcc, mnc and the lac (l3IdType
  // LocationAreaCode) as far as idType asks. Refused for an empty pointer or
  // an idType outside 1 to 3. The source's presence bits are not checked.
  static gom::SharedPointer<CellularObjectDn> create(const gom::SharedPointer<GeranCellDn>& dn,
                                                     IdType idType);
  // From a UTRA identity, as above with the caller's nwType (not checked)
  // and the RNC id (l3IdType RncId) as third layer.
  static gom::SharedPointer<CellularObjectDn> create(NwType nwType,
                                                     const gom::SharedPointer<UtraCellDn>& dn,
                                                     IdType idType);
  // A deep copy; empty for an empty source.
  static gom::SharedPointer<CellularObjectDn> create(
      const gom::SharedPointer<CellularObjectDn>& source);

  unsigned char idType() const { return idType_; }
  unsigned char nwType() const { return nwType_; }
  unsigned short layer1() const { return layer1_; }
  unsigned short layer2() const { return layer2_; }
  unsigned char l3IdType() const { return l3IdType_; }
  unsigned int layer3() const { return layer3_; }

  // The valid layers only, then the ObjectBase part.
  bool operator==(const CellularObjectDn& other) const;
  bool operator!=(const CellularObjectDn& other) const { return !(*this == other); }

  gom::SharedPointer<gom::ObjectBase> clone() const override;
  bool compare(const gom::ObjectBase* other) const override;
  bool write(IStream& stream) const override;
  // Fails (fields cleared) on a version other than 1 or a short stream.
  bool read(IStream& stream) override;

 private:
  unsigned char idType_;
  unsigned char nwType_;
  unsigned short layer1_;
  unsigned short layer2_;
  unsigned char l3IdType_;
  unsigned int layer3_;
};

class LODESTACK_EXPORT CellularObject
    : public Record<CellularObject, 115,
                    FieldTable<unsigned char, Field<gom::SharedPointer<CellularObjectDn>, 1>,
                               Field<gom::SharedPointer<Area>, 2>>> {
 public:
  CellularObject() = default;
  explicit CellularObject(const gom::SharedPointer<CellularObjectDn>& dn) { setFields(dn); }
  using Record::create;
  static gom::SharedPointer<CellularObject> create(const gom::SharedPointer<CellularObjectDn>& dn) {
    return createWith(dn);
  }

  LODESTACK_RECORD_PROPERTY(0, dn, setDn)
  LODESTACK_RECORD_PROPERTY(1, coverage, setCoverage)
};

}  // namespace schema
}  // namespace lodestack

#endif  // LODESTACK_SCHEMA_CELLULAROBJECT_H
