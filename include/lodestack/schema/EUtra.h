// The E-UTRA (LTE) records and measurement set, over the shared cellular
// record templates. Presence bits in brackets; "via" marks a property
// delegated to the held network measurement.
//
//   EUtraFrequencyInfo (120)           earfcn u16 (1), pci u16 (2)
//   EUtraNwMeasurement (119)           frequencyInfo (1), tac u16 (2),
//                                      rsrp u8 (4), rsrq u8 (8), ucid u32 (16)
//   EUtraServingCellMeasurement (118)  nwMeasurement (1), timingAdvance u16
//                                      (2), frequencyInfo via (4)
//   EUtraNeighborCell (117)            frequencyInfo (1), coverage (2)
//   EUtraCell (116)                    dn, coverage, neighbours
//   EUtraCellMeasurement (type 14)     accepts EUtraNwMeasurement only
#ifndef LODESTACK_SCHEMA_EUTRA_H
#define LODESTACK_SCHEMA_EUTRA_H

#include "lodestack/schema/CellDn.h"
#include "lodestack/schema/CellMeasurement.h"
#include "lodestack/schema/CellularRecords.h"

namespace lodestack {
namespace schema {

class LODESTACK_EXPORT EUtraFrequencyInfo
    : public FrequencyInfoRecord<EUtraFrequencyInfo, 120, unsigned short, unsigned short> {
 public:
  using FrequencyInfoRecord::FrequencyInfoRecord;
  LODESTACK_RECORD_PROPERTY(0, earfcn, setEarfcn)
  LODESTACK_RECORD_PROPERTY(1, pci, setPci)
};

class LODESTACK_EXPORT EUtraNwMeasurement
    : public NwMeasurementRecord<EUtraNwMeasurement, 119, EUtraFrequencyInfo,
                                 Field<unsigned short, 2>, Field<unsigned char, 4>,
                                 Field<unsigned char, 8>, Field<unsigned int, 16>> {
 public:
  LODESTACK_RECORD_PROPERTY(1, tac, setTac)
  LODESTACK_RECORD_PROPERTY(2, rsrp, setRsrp)
  LODESTACK_RECORD_PROPERTY(3, rsrq, setRsrq)
  LODESTACK_RECORD_PROPERTY(4, ucid, setUcid)
};

class LODESTACK_EXPORT EUtraServingCellMeasurement
    : public ServingCellMeasurementRecord<
          EUtraServingCellMeasurement, 118, EUtraNwMeasurement,
          FieldTable<unsigned char, Field<gom::SharedPointer<EUtraNwMeasurement>, 1>,
                     Field<unsigned short, 2>>,
          Via<4, 0>> {
 public:
  LODESTACK_RECORD_PROPERTY(1, timingAdvance, setTimingAdvance)
  LODESTACK_VIA_PROPERTY(0, frequencyInfo, setFrequencyInfo)
};

class LODESTACK_EXPORT EUtraNeighborCell
    : public NeighborCellRecord<EUtraNeighborCell, 117, EUtraFrequencyInfo> {};

struct LODESTACK_EXPORT EUtraServingCellTraits
    : ServingCellTraits<EUtraCellDn, EUtraNeighborCell, 116> {};
using EUtraCell = ServingCell<EUtraServingCellTraits>;

struct LODESTACK_EXPORT EUtraCellMeasurementTraits
    : CellMeasurementTraits<Measurement<EUtraCellDn, 14>, EUtraServingCellMeasurement,
                            EUtraNwMeasurement, 14, false> {};
using EUtraCellMeasurement = CellMeasurement<EUtraCellMeasurementTraits>;

}  // namespace schema
}  // namespace lodestack

#endif  // LODESTACK_SCHEMA_EUTRA_H
