// The CDMA records and measurement set, over the shared cellular record
// templates. Presence bits in brackets; "via" marks a property delegated to
// the held network measurement.
//
//   CdmaFrequencyInfo (123)           no properties: only its empty mask
//   CdmaNwMeasurement (127)           frequencyInfo (1)
//   CdmaServingCellMeasurement (126)  frequencyInfo via (1), nwMeasurement (2)
//   CdmaNeighborCell (125)            frequencyInfo (1), coverage (2)
//   CdmaCell (124)                    dn, coverage, neighbours
//   CdmaCellMeasurement (type 17)     accepts CdmaNwMeasurement only
#ifndef LODESTACK_SCHEMA_CDMA_H
#define LODESTACK_SCHEMA_CDMA_H

#include "lodestack/schema/CellDn.h"
#include "lodestack/schema/CellMeasurement.h"
#include "lodestack/schema/CellularRecords.h"

namespace lodestack {
namespace schema {

class LODESTACK_EXPORT CdmaFrequencyInfo
    : public Record<CdmaFrequencyInfo, 123, FieldTable<unsigned char>> {};

class LODESTACK_EXPORT CdmaNwMeasurement
    : public NwMeasurementRecord<CdmaNwMeasurement, 127, CdmaFrequencyInfo> {};

class LODESTACK_EXPORT CdmaServingCellMeasurement
    : public ServingCellMeasurementRecord<
          CdmaServingCellMeasurement, 126, CdmaNwMeasurement,
          FieldTable<unsigned char, Field<gom::SharedPointer<CdmaNwMeasurement>, 2>>, Via<1, 0>> {
 public:
  LODESTACK_VIA_PROPERTY(0, frequencyInfo, setFrequencyInfo)
};

class LODESTACK_EXPORT CdmaNeighborCell
    : public NeighborCellRecord<CdmaNeighborCell, 125, CdmaFrequencyInfo> {};

struct LODESTACK_EXPORT CdmaServingCellTraits
    : ServingCellTraits<CdmaCellDn, CdmaNeighborCell, 124> {};
using CdmaCell = ServingCell<CdmaServingCellTraits>;

struct LODESTACK_EXPORT CdmaCellMeasurementTraits
    : CellMeasurementTraits<Measurement<CdmaCellDn, 17>, CdmaServingCellMeasurement,
                            CdmaNwMeasurement, 17, false> {};
using CdmaCellMeasurement = CellMeasurement<CdmaCellMeasurementTraits>;

}  // namespace schema
}  // namespace lodestack

#endif  // LODESTACK_SCHEMA_CDMA_H
