// The UTRA-FDD (WCDMA) records and measurement set, over the shared cellular
// record templates. Presence bits in brackets; "via" marks a property
// delegated to the held network measurement.
//
//   UtraFddFrequencyInfo (103)           uarfcnDl u16 (1), pcpich u16 (2)
//   UtraFddNwMeasurement (112)           frequencyInfo (1), uarfcnUl u16 (2),
//                                        utraCarrierRssi u8 (4), ucid u32 (8),
//                                        ecNo u8 (16), rscp i8 (32),
//                                        pathloss u8 (64)
//   UtraFddServingCellMeasurement (111)  lac u16 (1), frequencyInfo via (2),
//                                        uarfcnUl via (4), nwMeasurement (128)
//   UtraFddNeighborCell (108)            frequencyInfo (1), coverage (2)
//   UtraFddCell (107)                    dn, coverage, neighbours
//   UtraFddCellMeasurement (type 3)      with unreliableStateTimeStamp (207)
//
// The serving record keeps nwMeasurement on bit 128 with bits 8 to 64
// unused: the mask byte travels in that form.
#ifndef LODESTACK_SCHEMA_UTRAFDD_H
#define LODESTACK_SCHEMA_UTRAFDD_H

#include "lodestack/schema/CellDn.h"
#include "lodestack/schema/CellMeasurement.h"
#include "lodestack/schema/CellularRecords.h"

namespace lodestack {
namespace schema {

class LODESTACK_EXPORT UtraFddFrequencyInfo
    : public FrequencyInfoRecord<UtraFddFrequencyInfo, 103, unsigned short, unsigned short> {
 public:
  using FrequencyInfoRecord::FrequencyInfoRecord;
  LODESTACK_RECORD_PROPERTY(0, uarfcnDl, setUarfcnDl)
  LODESTACK_RECORD_PROPERTY(1, pcpich, setPcpich)
};

class LODESTACK_EXPORT UtraFddNwMeasurement
    : public NwMeasurementRecord<UtraFddNwMeasurement, 112, UtraFddFrequencyInfo,
                                 Field<unsigned short, 2>, Field<unsigned char, 4>,
                                 Field<unsigned int, 8>, Field<unsigned char, 16>,
                                 Field<signed char, 32>, Field<unsigned char, 64>> {
 public:
  LODESTACK_RECORD_PROPERTY(1, uarfcnUl, setUarfcnUl)
  LODESTACK_RECORD_PROPERTY(2, utraCarrierRssi, setUtraCarrierRssi)
  LODESTACK_RECORD_PROPERTY(3, ucid, setUcid)
  LODESTACK_RECORD_PROPERTY(4, ecNo, setEcNo)
  LODESTACK_RECORD_PROPERTY(5, rscp, setRscp)
  LODESTACK_RECORD_PROPERTY(6, pathloss, setPathloss)
};

class LODESTACK_EXPORT UtraFddServingCellMeasurement
    : public ServingCellMeasurementRecord<
          UtraFddServingCellMeasurement, 111, UtraFddNwMeasurement,
          FieldTable<unsigned char, Field<unsigned short, 1>,
                     Field<gom::SharedPointer<UtraFddNwMeasurement>, 128>>,
          Via<2, 0>, Via<4, 1>> {
 public:
  LODESTACK_RECORD_PROPERTY(0, lac, setLac)
  LODESTACK_VIA_PROPERTY(0, frequencyInfo, setFrequencyInfo)
  LODESTACK_VIA_PROPERTY(1, uarfcnUl, setUarfcnUl)
};

class LODESTACK_EXPORT UtraFddNeighborCell
    : public NeighborCellRecord<UtraFddNeighborCell, 108, UtraFddFrequencyInfo> {};

struct LODESTACK_EXPORT UtraFddServingCellTraits
    : ServingCellTraits<UtraCellDn, UtraFddNeighborCell, 107> {};
using UtraFddCell = ServingCell<UtraFddServingCellTraits>;

struct LODESTACK_EXPORT UtraFddCellMeasurementTraits
    : CellMeasurementTraits<Measurement<UtraCellDn, 4>, UtraFddServingCellMeasurement,
                            UtraFddNwMeasurement, 3, true> {};
using UtraFddCellMeasurement = CellMeasurement<UtraFddCellMeasurementTraits>;

}  // namespace schema
}  // namespace lodestack

#endif  // LODESTACK_SCHEMA_UTRAFDD_H
