// Where the host's measurement library gets the answers of one kind of
// measurement (cellular or WLAN): the scenario, or a service of the machine.
// A source is made, used and destroyed on the thread of the caller's
// dispatcher, and answers there.
#ifndef LODESTACK_SRC_PLATFORM_HOST_MEASUREMENTSOURCE_H
#define LODESTACK_SRC_PLATFORM_HOST_MEASUREMENTSOURCE_H

#include <memory>
#include <string>

#include "lodestack/platform/RadioMeasurements.h"

namespace lodestack {
namespace platform {
namespace host {

struct Scenario;

class MeasurementSource {
 public:
  virtual ~MeasurementSource() = default;
  // Starts one measurement, replacing one that runs. callback(context,
  // result) reports it once unless cancel() comes first: inside this call or
  // later from the loop. Throws std::runtime_error when the measurement
  // cannot start (the request then fails).
  virtual void start(RadioMeasurements::Callback callback, void* context) = 0;
  virtual void cancel() = 0;
  // Cellular sources: what the modem reports before the next measurement.
  virtual int dchStateDuration() const { return -2; }
  virtual bool inTechChange() const { return false; }
};

enum class SourceKind { Cellular, Wlan };

// The scenario's results of one kind, replayed.
std::unique_ptr<MeasurementSource> makeScenarioSource(std::shared_ptr<const Scenario> scenario,
                                                      SourceKind kind);

}  // namespace host
}  // namespace platform
}  // namespace lodestack

#endif  // LODESTACK_SRC_PLATFORM_HOST_MEASUREMENTSOURCE_H
