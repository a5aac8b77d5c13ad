#include "lodestack/schema/ObjectBaseFactory.h"

#include "lodestack/gom/RecordFactory.h"
#include "lodestack/schema/Area.h"
#include "lodestack/schema/Cdma.h"
#include "lodestack/schema/CellularObject.h"
#include "lodestack/schema/EUtra.h"
#include "lodestack/schema/Geran.h"
#include "lodestack/schema/Gnss.h"
#include "lodestack/schema/PositionEstimate.h"
#include "lodestack/schema/UtraFdd.h"
#include "lodestack/schema/UtraTdd.h"
#include "lodestack/schema/Wlan.h"

namespace lodestack {
namespace schema {

gom::SharedPointer<gom::ObjectBase> ObjectBaseFactory::createObject(unsigned short id) {
  switch (id) {
    case GeranCellDn::kTypeId:
      return GeranCellDn::create();
    case UtraCellDn::kTypeId:
      return UtraCellDn::create();
    case GeranFrequencyInfo::kTypeId:
      return GeranFrequencyInfo::create();
    case UtraFddFrequencyInfo::kTypeId:
      return UtraFddFrequencyInfo::create();
    case Area::kTypeId:
      return Area::create();
    case GeranCell::kTypeId:
      return GeranCell::create();
    case GeranNeighborCell::kTypeId:
      return GeranNeighborCell::create();
    case UtraFddCell::kTypeId:
      return UtraFddCell::create();
    case UtraFddNeighborCell::kTypeId:
      return UtraFddNeighborCell::create();
    case GeranServingCellMeasurement::kTypeId:
      return GeranServingCellMeasurement::create();
    case GeranNwMeasurement::kTypeId:
      return GeranNwMeasurement::create();
    case UtraFddServingCellMeasurement::kTypeId:
      return UtraFddServingCellMeasurement::create();
    case UtraFddNwMeasurement::kTypeId:
      return UtraFddNwMeasurement::create();
    case PositionEstimate::kTypeId:
      return PositionEstimate::create();
    case CellularObjectDn::kTypeId:
      return CellularObjectDn::create();
    case CellularObject::kTypeId:
      return CellularObject::create();
    case EUtraCell::kTypeId:
      return EUtraCell::create();
    case EUtraNeighborCell::kTypeId:
      return EUtraNeighborCell::create();
    case EUtraServingCellMeasurement::kTypeId:
      return EUtraServingCellMeasurement::create();
    case EUtraNwMeasurement::kTypeId:
      return EUtraNwMeasurement::create();
    case EUtraFrequencyInfo::kTypeId:
      return EUtraFrequencyInfo::create();
    case EUtraCellDn::kTypeId:
      return EUtraCellDn::create();
    case CdmaCellDn::kTypeId:
      return CdmaCellDn::create();
    case CdmaFrequencyInfo::kTypeId:
      return CdmaFrequencyInfo::create();
    case CdmaCell::kTypeId:
      return CdmaCell::create();
    case CdmaNeighborCell::kTypeId:
      return CdmaNeighborCell::create();
    case CdmaServingCellMeasurement::kTypeId:
      return CdmaServingCellMeasurement::create();
    case CdmaNwMeasurement::kTypeId:
      return CdmaNwMeasurement::create();
    case WlanDn::kTypeId:
      return WlanDn::create();
    case WlanApMeasurement::kTypeId:
      return WlanApMeasurement::create();
    case UtraTddFrequencyInfo::kTypeId:
      return UtraTddFrequencyInfo::create();
    case UtraTddCell::kTypeId:
      return UtraTddCell::create();
    case UtraTddNeighborCell::kTypeId:
      return UtraTddNeighborCell::create();
    case UtraTddServingCellMeasurement::kTypeId:
      return UtraTddServingCellMeasurement::create();
    case UtraTddNwMeasurement::kTypeId:
      return UtraTddNwMeasurement::create();
    case GnssMeasurementData::kTypeId:
      return GnssMeasurementData::create();
    default:
      return gom::SharedPointer<gom::ObjectBase>();
  }
}

namespace {
// The object model reads code-14 variants through this factory.
[[maybe_unused]] const bool registered =
    (gom::installRecordFactory(&ObjectBaseFactory::createObject), true);
}  // namespace

}  // namespace schema
}  // namespace lodestack
