// IRadioAdaptationObserver: where a radio adaptation delivers its results.
//
// Implemented by the measurement service (MeasurementsProvider); an
// adaptation has at most one observer and does not own it. Every call comes
// on the thread that runs the adaptation's dispatcher: from a queued call for
// results the platform produced inside its own start call, from the cancel
// timer for time-outs, at once for results that arrive later.
#ifndef LODESTACK_RADIOADAPTATION_IRADIOADAPTATIONOBSERVER_H
#define LODESTACK_RADIOADAPTATION_IRADIOADAPTATIONOBSERVER_H

#include "lodestack/core/Export.h"
#include "lodestack/core/Status.h"
#include "lodestack/gom/GenericObject.h"

namespace lodestack {
namespace radioadaptation {

class LODESTACK_EXPORT IRadioAdaptationObserver {
 public:
  // The kinds of measurement, as bits of a mask. One request names one kind.
  enum MeasurementType : int {
    Cellular = 1,  // GSM, WCDMA, TD-SCDMA, LTE and CDMA cells
    Wlan = 2,      // WLAN access points
    Gnss = 4       // passive GNSS fixes; never requested, only subscribed to
  };

  virtual ~IRadioAdaptationObserver();

  // Simulation data for the adaptation; null when the observer has none.
  // Simulation is not supported by this library's adaptations, which never
  // call it.
  virtual gom::SharedPointer<gom::GenericObject> getRadioSimulationData() = 0;

  // One finished request, time-out or pushed result. `requestId` is the id
  // requestMeasurements handed out, or 0 for data nobody asked for; `type`
  // is the kind (one bit); `measurements` is the root of a
  // MeasurementContainer (key 1) when `status` is Ok or
  // UnreliableMeasurement, and null otherwise.
  virtual void radioMeasurementsReady(unsigned int requestId, int type,
                                      gom::SharedPointer<gom::GenericObject> measurements,
                                      Status status) = 0;
};

}  // namespace radioadaptation
}  // namespace lodestack

#endif  // LODESTACK_RADIOADAPTATION_IRADIOADAPTATIONOBSERVER_H
