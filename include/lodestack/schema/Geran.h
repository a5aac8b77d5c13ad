// The GERAN (GSM) records and measurement set, over the shared cellular
// record templates (CellularRecords.h) and CellMeasurement. Presence bits in
// brackets; "via" marks a property delegated to the held network measurement.
//
//   GeranFrequencyInfo (102)           bsic u8 (1), arfcn u16 (2)
//   GeranNwMeasurement (110)           frequencyInfo (1), lac u16 (2),
//                                      cid u16 (4), rxLevel u8 (8)
//   GeranServingCellMeasurement (109)  rxLevel via (1), timingAdvance u8 (2),
//                                      frequencyInfo via (4), frequency u8 (8),
//                                      nwMeasurement (16)
//   GeranNeighborCell (106)            frequencyInfo (1), coverage (2),
//                                      lac u16 (4), cid u16 (8)
//   GeranCell (105)                    dn, coverage, neighbours
//   GeranCellMeasurement (type 2)      accepts GeranNwMeasurement only
#ifndef LODESTACK_SCHEMA_GERAN_H
#define LODESTACK_SCHEMA_GERAN_H

#include "lodestack/schema/CellDn.h"
#include "lodestack/schema/CellMeasurement.h"
#include "lodestack/schema/CellularRecords.h"

namespace lodestack {
namespace schema {

class LODESTACK_EXPORT GeranFrequencyInfo
    : public FrequencyInfoRecord<GeranFrequencyInfo, 102, unsigned char, unsigned short> {
 public:
  using FrequencyInfoRecord::FrequencyInfoRecord;
  LODESTACK_RECORD_PROPERTY(0, bsic, setBsic)
  LODESTACK_RECORD_PROPERTY(1, arfcn, setArfcn)
};

class LODESTACK_EXPORT GeranNwMeasurement
    : public NwMeasurementRecord<GeranNwMeasurement, 110, GeranFrequencyInfo,
                                 Field<unsigned short, 2>, Field<unsigned short, 4>,
                                 Field<unsigned char, 8>> {
 public:
  LODESTACK_RECORD_PROPERTY(1, lac, setLac)
  LODESTACK_RECORD_PROPERTY(2, cid, setCid)
  LODESTACK_RECORD_PROPERTY(3, rxLevel, setRxLevel)
};

class LODESTACK_EXPORT GeranServingCellMeasurement
    : public ServingCellMeasurementRecord<
          GeranServingCellMeasurement, 109, GeranNwMeasurement,
          FieldTable<unsigned char, Field<unsigned char, 2>, Field<unsigned char, 8>,
                     Field<gom::SharedPointer<GeranNwMeasurement>, 16>>,
          Via<1, 3>, Via<4, 0>> {
 public:
  LODESTACK_VIA_PROPERTY(3, rxLevel, setRxLevel)
  LODESTACK_RECORD_PROPERTY(0, timingAdvance, setTimingAdvance)
  LODESTACK_VIA_PROPERTY(0, frequencyInfo, setFrequencyInfo)
  LODESTACK_RECORD_PROPERTY(1, frequency, setFrequency)
};

class LODESTACK_EXPORT GeranNeighborCell
    : public NeighborCellRecord<GeranNeighborCell, 106, GeranFrequencyInfo,
                                Field<unsigned short, 4>, Field<unsigned short, 8>> {
 public:
  LODESTACK_RECORD_PROPERTY(2, lac, setLac)
  LODESTACK_RECORD_PROPERTY(3, cid, setCid)
};

struct LODESTACK_EXPORT GeranServingCellTraits
    : ServingCellTraits<GeranCellDn, GeranNeighborCell, 105> {};
using GeranCell = ServingCell<GeranServingCellTraits>;

struct LODESTACK_EXPORT GeranCellMeasurementTraits
    : CellMeasurementTraits<Measurement<GeranCellDn, 2>, GeranServingCellMeasurement,
                            GeranNwMeasurement, 2, false> {};
using GeranCellMeasurement = CellMeasurement<GeranCellMeasurementTraits>;

}  // namespace schema
}  // namespace lodestack

#endif  // LODESTACK_SCHEMA_GERAN_H
