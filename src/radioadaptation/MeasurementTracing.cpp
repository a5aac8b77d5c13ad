#include "lodestack/radioadaptation/MeasurementTracing.h"

namespace lodestack {
namespace radioadaptation {

// Places for a platform's tracing of results; this library records nothing.
void MeasurementTracing::logMeasurement(const schema::MeasurementContainer&, long) {}
void MeasurementTracing::logMeasurementDebug(const schema::MeasurementContainer&, const char*,
                                             const char*, bool) {}

}  // namespace radioadaptation
}  // namespace lodestack
