// MeasurementTracing: hooks that see every measurement container on its way
// to the observer, with the time it was handled. Requests' results pass with
// null labels, pushed ones with "PUSH RADIO" and "api". They record nothing
// in this library; they mark the place where a platform traces results.
// Any thread; they never throw.
#ifndef LODESTACK_RADIOADAPTATION_MEASUREMENTTRACING_H
#define LODESTACK_RADIOADAPTATION_MEASUREMENTTRACING_H

#include "lodestack/core/Export.h"
#include "lodestack/schema/MeasurementContainer.h"

namespace lodestack {
namespace radioadaptation {

class LODESTACK_EXPORT MeasurementTracing {
 public:
  MeasurementTracing() = delete;
  static void logMeasurement(const schema::MeasurementContainer& measurements, long time);
  static void logMeasurementDebug(const schema::MeasurementContainer& measurements,
                                  const char* label, const char* source, bool verbose);
};

}  // namespace radioadaptation
}  // namespace lodestack

#endif  // LODESTACK_RADIOADAPTATION_MEASUREMENTTRACING_H
