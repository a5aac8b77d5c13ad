// Tracing hooks that see every result of the platform's measurement library
// as it arrives, and FlushLogBuffer, which writes collected trace text to
// the debug log. The hooks record nothing in this library; they mark the
// place where a platform traces its raw results. Any thread; never throw.
#ifndef LODESTACK_RADIOADAPTATION_MEASUREMENTTRACINGOXEL_H
#define LODESTACK_RADIOADAPTATION_MEASUREMENTTRACINGOXEL_H

#include <string>

#include "lodestack/platform/RadioMeasurements.h"

namespace lodestack {
namespace radioadaptation {

class LODESTACK_EXPORT MeasurementTracingOxel {
 public:
  MeasurementTracingOxel() = delete;
  static void logMeasurement(const OxelMeasurements& measurements, long time);
  static void logMeasurementDebug(const OxelMeasurements& measurements, const char* label,
                                  const char* source, bool verbose);
};

// Writes `buffer` as one entry of the debug log under the adaptation's
// component ("RadioAdapt"), then empties it.
LODESTACK_EXPORT void FlushLogBuffer(std::string& buffer);

}  // namespace radioadaptation
}  // namespace lodestack

#endif  // LODESTACK_RADIOADAPTATION_MEASUREMENTTRACINGOXEL_H
