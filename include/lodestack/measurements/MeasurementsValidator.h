// MeasurementsValidator: cleans a measurement container in place before
// observers see it. A cellular measurement that lacks what positioning needs
// is removed from its collection; an incomplete serving-cell part or
// neighbour is removed from the measurement that holds it. The checks are of
// presence and object type only, never of value ranges; WLAN and GNSS
// measurements are not checked.
//
// A measurement (GERAN 2, UTRA-FDD 3, UTRA-TDD 4, E-UTRA 14, CDMA 17) needs
// its time stamp (205) and a cell identity (200) of its technology's record
// with the required fields: GERAN mcc, mnc, lac and cid; UTRA, E-UTRA mcc,
// mnc and ucid; CDMA sid, nid and bsid. A neighbour (303) needs its
// frequency info with both values (CDMA: any), and a GERAN neighbour has lac
// and cid both or neither. The serving-cell measurement (202) is optional:
// one of another record type is dropped, and one whose frequency info (E-UTRA:
// network measurement) is incomplete loses that part only.
//
// A collection empty on entry is removed from its holder; one emptied by the
// validation stays, empty. Operations return Ok or InvalidArgument. All
// static, no state; the tree belongs to the calling thread.
#ifndef LODESTACK_MEASUREMENTS_MEASUREMENTSVALIDATOR_H
#define LODESTACK_MEASUREMENTS_MEASUREMENTSVALIDATOR_H

#include "lodestack/schema/Cdma.h"
#include "lodestack/schema/EUtra.h"
#include "lodestack/schema/Geran.h"
#include "lodestack/schema/UtraFdd.h"
#include "lodestack/schema/UtraTdd.h"

namespace lodestack {

class LODESTACK_EXPORT MeasurementsValidator {
 public:
  MeasurementsValidator() = delete;

  // Validates every measurement of the container's collection `collectionId`
  // (300 GERAN, 301 UTRA-FDD, 302 UTRA-TDD, 310 E-UTRA, 312 CDMA) and removes
  // the invalid ones and elements without an object. A collection that is
  // empty on entry is removed whatever its id; the elements of a non-empty
  // collection under any other id are left alone.
  static void validateMeasurementCollection(unsigned short collectionId,
                                            gom::SharedPointer<gom::GenericObject>& container);
  // Removes the invalid entries of `measurement`'s neighbour collection (303);
  // `measurementKey` names the technology (CDMA entries are not checked).
  static void validateNwMeasurementCollection(unsigned short measurementKey,
                                              gom::SharedPointer<gom::GenericObject>& measurement);

  static Status validateGeranMeasurement(gom::SharedPointer<gom::GenericObject>& measurement);
  static Status validateGeranDn(const schema::GeranCellDn& dn);
  static Status validateGeranFrequencyInfo(const schema::GeranFrequencyInfo& info);
  static Status validateGeranServingCell(schema::GeranServingCellMeasurement& serving);
  static Status validateGeranNwMeasurement(const schema::GeranNwMeasurement& nw);

  static Status validateUtraDn(const schema::UtraCellDn& dn);

  static Status validateUtraFddMeasurement(gom::SharedPointer<gom::GenericObject>& measurement);
  static Status validateUtraFddFrequencyInfo(const schema::UtraFddFrequencyInfo& info);
  static Status validateUtraFddServingCell(schema::UtraFddServingCellMeasurement& serving);
  static Status validateUtraFddNwMeasurement(const schema::UtraFddNwMeasurement& nw);

  static Status validateUtraTddMeasurement(gom::SharedPointer<gom::GenericObject>& measurement);
  static Status validateUtraTddFrequencyInfo(const schema::UtraTddFrequencyInfo& info);
  static Status validateUtraTddServingCell(schema::UtraTddServingCellMeasurement& serving);
  static Status validateUtraTddNwMeasurement(const schema::UtraTddNwMeasurement& nw);

  static Status validateEUtraMeasurement(gom::SharedPointer<gom::GenericObject>& measurement);
  static Status validateEUtraDn(const schema::EUtraCellDn& dn);
  static Status validateEUtraFrequencyInfo(const schema::EUtraFrequencyInfo& info);
  static Status validateEUtraServingCell(schema::EUtraServingCellMeasurement& serving);
  static Status validateEUtraNwMeasurement(const schema::EUtraNwMeasurement& nw);

  static Status validateCdmaMeasurement(gom::SharedPointer<gom::GenericObject>& measurement);
  static Status validateCdmaDn(const schema::CdmaCellDn& dn);
  static Status validateCdmaFrequencyInfo(const schema::CdmaFrequencyInfo& info);
  static Status validateCdmaServingCell(schema::CdmaServingCellMeasurement& serving);
  static Status validateCdmaNwMeasurement(const schema::CdmaNwMeasurement& nw);
};

}  // namespace lodestack

#endif  // LODESTACK_MEASUREMENTS_MEASUREMENTSVALIDATOR_H
