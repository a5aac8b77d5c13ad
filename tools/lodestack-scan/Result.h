// One result as the tool sees it: what an observer was handed, or what a
// refused request answered. Shared by the printers and the results file.
#ifndef LODESTACK_SCAN_RESULT_H
#define LODESTACK_SCAN_RESULT_H

#include <lodestack/core/Status.h>
#include <lodestack/gom/GenericObject.h>
#include <lodestack/measurements/IMeasurementsObserver.h>

namespace lodestack {
namespace scan {

struct Result {
  int kind = 0;                // one IMeasurementsObserver::MeasurementType bit
  unsigned int requestId = 0;  // 0 for GNSS fixes and refused requests
  Status status = Ok;
  gom::SharedPointer<gom::GenericObject> measurements;  // container root or null
};

// "cellular", "wlan" or "gnss"; null for any other value.
inline const char* kindName(int kind) {
  switch (kind) {
    case IMeasurementsObserver::Cellular: return "cellular";
    case IMeasurementsObserver::Wlan: return "wlan";
    case IMeasurementsObserver::Gnss: return "gnss";
    default: return nullptr;
  }
}

}  // namespace scan
}  // namespace lodestack

#endif  // LODESTACK_SCAN_RESULT_H
