// ConverterOxel: turns one result of the platform's measurement library
// into schema measurements in a MeasurementContainer: a GSM element becomes a
// GERAN measurement, WCDMA a UTRA-FDD one, TD-SCDMA a UTRA-TDD one, LTE an
// E-UTRA identity and WLAN an access point measurement; elements of other
// kinds are skipped. Each measurement takes the element's time stamp, its
// cell identity, and the serving and neighbour values the element carries;
// values the library marks "not available" (255, or an unset ...Set()
// flag) stay absent. Values keep the library's units. An access point's
// network name, when the library knows it, is attached to its WlanDn as
// property kSsidProperty (a string) of the record's extension: it lives
// with the object in memory and is not part of the record's bytes.
//
// All static; failures throw a Status (OutOfMemory when a record cannot be
// made, WrongObjectType for an element whose class does not match its id, or
// the container's refusal). Any thread, on objects it owns.
#ifndef LODESTACK_RADIOADAPTATION_CONVERTEROXEL_H
#define LODESTACK_RADIOADAPTATION_CONVERTEROXEL_H

#include "lodestack/platform/RadioMeasurements.h"
#include "lodestack/schema/MeasurementContainer.h"

namespace lodestack {
namespace radioadaptation {

class LODESTACK_EXPORT ConverterOxel {
 public:
  ConverterOxel() = delete;

  // The extension property of a WlanDn that holds the network name.
  static constexpr unsigned short kSsidProperty = 1;

  // Converts every element of `result`, in order, into `container`.
  static void convertOxelMeasurement(const OxelMeasurements& result,
                                     gom::SharedPointer<schema::MeasurementContainer>& container);
  // Converts one element by its elementId and adds it to `container`.
  static void convertOxelElement(const OxelObservationElement* element,
                                 gom::SharedPointer<schema::MeasurementContainer>& container);

  // Each returns the new measurement's object.
  static gom::SharedPointer<gom::GenericObject> convertOxelGsm2Geran(const OxelObservationElement* e);
  static gom::SharedPointer<gom::GenericObject> convertOxelWcdma2UtraFdd(const OxelObservationElement* e);
  static gom::SharedPointer<gom::GenericObject> convertOxelTdscdma2UtraTdd(const OxelObservationElement* e);
  static gom::SharedPointer<gom::GenericObject> convertOxelLte2EUtra(const OxelObservationElement* e);
  static gom::SharedPointer<gom::GenericObject> convertOxelWlan2Wlan(const OxelObservationElement* e);
};

}  // namespace radioadaptation
}  // namespace lodestack

#endif  // LODESTACK_RADIOADAPTATION_CONVERTEROXEL_H
