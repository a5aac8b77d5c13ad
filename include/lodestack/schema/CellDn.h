// The cell identities: value records (see Record.h) that name one radio cell
// of one access technology. Measurements and injections hold them as their
// `dn`. Setters do not check ranges. One thread at a time.
//
//   record        type id  fields (presence bit)
//   GeranCellDn   100      mcc u16 (1), mnc u16 (2), lac u16 (4), cid u16 (8)
//   UtraCellDn    101      mcc u16 (1), mnc u16 (2), ucid u32 (4)
//   EUtraCellDn   121      mcc u16 (1), mnc u16 (2), ucid u32 (4)
//   CdmaCellDn    122      sid u16 (1), nid u16 (2), bsid u16 (4)
//
// Every constructor and create() taking values marks all of them present.
#ifndef LODESTACK_SCHEMA_CELLDN_H
#define LODESTACK_SCHEMA_CELLDN_H

#include "lodestack/schema/Record.h"

namespace lodestack {
namespace schema {

class LODESTACK_EXPORT GeranCellDn
    : public Record<GeranCellDn, 100,
                    FieldTable<unsigned char, Field<unsigned short, 1>, Field<unsigned short, 2>,
                               Field<unsigned short, 4>, Field<unsigned short, 8>>> {
 public:
  GeranCellDn() = default;
  GeranCellDn(unsigned short mcc, unsigned short mnc, unsigned short lac, unsigned short cid) {
    setFields(mcc, mnc, lac, cid);
  }
  using Record::create;
  static gom::SharedPointer<GeranCellDn> create(unsigned short mcc, unsigned short mnc,
                                                unsigned short lac, unsigned short cid) {
    return createWith(mcc, mnc, lac, cid);
  }

  LODESTACK_RECORD_PROPERTY(0, mcc, setMcc)
  LODESTACK_RECORD_PROPERTY(1, mnc, setMnc)
  LODESTACK_RECORD_PROPERTY(2, lac, setLac)
  LODESTACK_RECORD_PROPERTY(3, cid, setCid)
};

// The shape shared by the UTRA and E-UTRA identities: country, network and a
// 32-bit cell id whose layout each technology gives.
using MobileCellFields = FieldTable<unsigned char, Field<unsigned short, 1>,
                                    Field<unsigned short, 2>, Field<unsigned int, 4>>;

template <class Self, unsigned short TypeId>
class LODESTACK_EXPORT MobileCellDn : public Record<Self, TypeId, MobileCellFields> {
  using Base = Record<Self, TypeId, MobileCellFields>;

 public:
  using Table = typename Base::Table;
  MobileCellDn() = default;
  MobileCellDn(unsigned short mcc, unsigned short mnc, unsigned int ucid) {
    this->setFields(mcc, mnc, ucid);
  }
  using Base::create;
  static gom::SharedPointer<Self> create(unsigned short mcc, unsigned short mnc,
                                         unsigned int ucid) {
    return Base::createWith(mcc, mnc, ucid);
  }

  LODESTACK_RECORD_PROPERTY(0, mcc, setMcc)
  LODESTACK_RECORD_PROPERTY(1, mnc, setMnc)
  LODESTACK_RECORD_PROPERTY(2, ucid, setUcid)
};

// ucid: RNC id in bits 16 to 27, cell id in bits 0 to 15.
class LODESTACK_EXPORT UtraCellDn : public MobileCellDn<UtraCellDn, 101> {
 public:
  using MobileCellDn::MobileCellDn;

  unsigned short rncId() const { return static_cast<unsigned short>((ucid() >> 16) & 0xFFF); }
  unsigned short cid() const { return static_cast<unsigned short>(ucid() & 0xFFFF); }
  static void splitUcid(unsigned int ucid, unsigned short& rncId, unsigned short& cid) {
    rncId = static_cast<unsigned short>((ucid >> 16) & 0xFFF);
    cid = static_cast<unsigned short>(ucid & 0xFFFF);
  }
  // Deliberately unmasked: an RNC id wider than 12 bits lands above bit 27.
  static unsigned int mergeUcid(unsigned short rncId, unsigned short cid) {
    return static_cast<unsigned int>(cid) | (static_cast<unsigned int>(rncId) << 16);
  }
};

// ucid: eNodeB id in bits 8 to 27, local cell id in bits 0 to 7.
class LODESTACK_EXPORT EUtraCellDn : public MobileCellDn<EUtraCellDn, 121> {
 public:
  using MobileCellDn::MobileCellDn;

  unsigned int eNodeBId() const { return (ucid() >> 8) & 0xFFFFF; }
  unsigned char lcid() const { return static_cast<unsigned char>(ucid() & 0xFF); }
  static void splitUcid(unsigned int ucid, unsigned int& eNodeBId, unsigned char& lcid) {
    eNodeBId = (ucid >> 8) & 0xFFFFF;
    lcid = static_cast<unsigned char>(ucid & 0xFF);
  }
  // Deliberately unmasked: an eNodeB id wider than 20 bits lands above bit 27.
  static unsigned int mergeUcid(unsigned int eNodeBId, unsigned char lcid) {
    return static_cast<unsigned int>(lcid) | (eNodeBId << 8);
  }
};

class LODESTACK_EXPORT CdmaCellDn
    : public Record<CdmaCellDn, 122,
                    FieldTable<unsigned char, Field<unsigned short, 1>, Field<unsigned short, 2>,
                               Field<unsigned short, 4>>> {
 public:
  CdmaCellDn() = default;
  CdmaCellDn(unsigned short sid, unsigned short nid, unsigned short bsid) {
    setFields(sid, nid, bsid);
  }
  using Record::create;
  static gom::SharedPointer<CdmaCellDn> create(unsigned short sid, unsigned short nid,
                                               unsigned short bsid) {
    return createWith(sid, nid, bsid);
  }

  LODESTACK_RECORD_PROPERTY(0, sid, setSid)
  LODESTACK_RECORD_PROPERTY(1, nid, setNid)
  LODESTACK_RECORD_PROPERTY(2, bsid, setBsid)
};

}  // namespace schema
}  // namespace lodestack

#endif  // LODESTACK_SCHEMA_CELLDN_H
