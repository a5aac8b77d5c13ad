// IMeasurementsObserver: a client's receiver of measurement results.
//
// Registered with MeasurementsProvider::addObserver for a mask of kinds; not
// owned by the provider, so remove it (or destroy the provider) before
// destroying it. measurementsReady runs on the thread of the library's
// dispatcher, the thread that created the provider. An exception thrown from
// it is caught and dropped by the provider.
#ifndef LODESTACK_MEASUREMENTS_IMEASUREMENTSOBSERVER_H
#define LODESTACK_MEASUREMENTS_IMEASUREMENTSOBSERVER_H

#include "lodestack/core/Export.h"
#include "lodestack/core/Status.h"
#include "lodestack/gom/GenericObject.h"

namespace lodestack {

class LODESTACK_EXPORT IMeasurementsObserver {
 public:
  // The kinds of measurement, as bits of a mask (the same values as the
  // radio adaptation's).
  enum MeasurementType : int { Cellular = 1, Wlan = 2, Gnss = 4 };

  virtual ~IMeasurementsObserver();

  // One result of kind `types`: `requestId` is the id requestMeasurements
  // gave (anyone's request) or 0 for pushed data and GNSS fixes.
  // `measurements` is the root of a validated MeasurementContainer when
  // `status` is Ok or UnreliableMeasurement, else null. Keep the pointer to
  // keep the tree; do not change it, other observers share it.
  virtual void measurementsReady(unsigned int requestId, int types,
                                 gom::SharedPointer<gom::GenericObject> measurements,
                                 Status status) = 0;
};

}  // namespace lodestack

#endif  // LODESTACK_MEASUREMENTS_IMEASUREMENTSOBSERVER_H
