#include "lodestack/radioadaptation/MeasurementTracingOxel.h"

#include "lodestack/debug/Debug.h"

namespace lodestack {
namespace radioadaptation {

// Places for a platform's tracing of raw results; this library records nothing.
void MeasurementTracingOxel::logMeasurement(const OxelMeasurements&, long) {}
void MeasurementTracingOxel::logMeasurementDebug(const OxelMeasurements&, const char*, const char*,
                                                 bool) {}

void FlushLogBuffer(std::string& buffer) {
  Debug::log(Debug::Level1, gRadioAdaptationComponentName, "%s", buffer.c_str());
  buffer.clear();
}

}  // namespace radioadaptation
}  // namespace lodestack
