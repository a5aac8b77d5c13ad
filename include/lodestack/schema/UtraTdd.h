// The UTRA-TDD (TD-SCDMA) records and measurement set, over the shared
// cellular record templates. Presence bits in brackets; "via" marks a
// property delegated to the held network measurement.
//
//   UtraTddFrequencyInfo (131)           uarfcn u16 (1), cellParam u8 (2)
//   UtraTddNwMeasurement (135)           frequencyInfo (1), utraCarrierRssi u8
//                                        (2), ucid u32 (4), rscp i8 (8),
//                                        pathloss u8 (16)
//   UtraTddServingCellMeasurement (134)  lac u16 (1), frequencyInfo via (2),
//                                        timingAdvance u16 (4),
//                                        nwMeasurement (8)
//   UtraTddNeighborCell (133)            frequencyInfo (1), coverage (2)
//   UtraTddCell (132)                    dn, coverage, neighbours
//   UtraTddCellMeasurement (type 4)      with unreliableStateTimeStamp (207)
#ifndef LODESTACK_SCHEMA_UTRATDD_H
#define LODESTACK_SCHEMA_UTRATDD_H

#include "lodestack/schema/CellDn.h"
#include "lodestack/schema/CellMeasurement.h"
#include "lodestack/schema/CellularRecords.h"

namespace lodestack {
namespace schema {

class LODESTACK_EXPORT UtraTddFrequencyInfo
    : public FrequencyInfoRecord<UtraTddFrequencyInfo, 131, unsigned short, unsigned char> {
 public:
  using FrequencyInfoRecord::FrequencyInfoRecord;
  LODESTACK_RECORD_PROPERTY(0, uarfcn, setUarfcn)
  LODESTACK_RECORD_PROPERTY(1, cellParam, setCellParam)
};

class LODESTACK_EXPORT UtraTddNwMeasurement
    : public NwMeasurementRecord<UtraTddNwMeasurement, 135, UtraTddFrequencyInfo,
                                 Field<unsigned char, 2>, Field<unsigned int, 4>,
                                 Field<signed char, 8>, Field<unsigned char, 16>> {
 public:
  LODESTACK_RECORD_PROPERTY(1, utraCarrierRssi, setUtraCarrierRssi)
  LODESTACK_RECORD_PROPERTY(2, ucid, setUcid)
  LODESTACK_RECORD_PROPERTY(3, rscp, setRscp)
  LODESTACK_RECORD_PROPERTY(4, pathloss, setPathloss)
};

class LODESTACK_EXPORT UtraTddServingCellMeasurement
    : public ServingCellMeasurementRecord<
          UtraTddServingCellMeasurement, 134, UtraTddNwMeasurement,
          FieldTable<unsigned char, Field<unsigned short, 1>, Field<unsigned short, 4>,
                     Field<gom::SharedPointer<UtraTddNwMeasurement>, 8>>,
          Via<2, 0>> {
 public:
  LODESTACK_RECORD_PROPERTY(0, lac, setLac)
  LODESTACK_VIA_PROPERTY(0, frequencyInfo, setFrequencyInfo)
  LODESTACK_RECORD_PROPERTY(1, timingAdvance, setTimingAdvance)
};

class LODESTACK_EXPORT UtraTddNeighborCell
    : public NeighborCellRecord<UtraTddNeighborCell, 133, UtraTddFrequencyInfo> {};

struct LODESTACK_EXPORT UtraTddServingCellTraits
    : ServingCellTraits<UtraCellDn, UtraTddNeighborCell, 132> {};
using UtraTddCell = ServingCell<UtraTddServingCellTraits>;

struct LODESTACK_EXPORT UtraTddCellMeasurementTraits
    : CellMeasurementTraits<Measurement<UtraCellDn, 4>, UtraTddServingCellMeasurement,
                            UtraTddNwMeasurement, 4, true> {};
using UtraTddCellMeasurement = CellMeasurement<UtraTddCellMeasurementTraits>;

}  // namespace schema
}  // namespace lodestack

#endif  // LODESTACK_SCHEMA_UTRATDD_H
