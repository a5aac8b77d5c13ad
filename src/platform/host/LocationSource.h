// Where the host's location manager gets its service state and positions:
// the scenario's GNSS track, or gpsd. A source is made and used on the
// thread of the caller's dispatcher, and reports state changes there.
#ifndef LODESTACK_SRC_PLATFORM_HOST_LOCATIONSOURCE_H
#define LODESTACK_SRC_PLATFORM_HOST_LOCATIONSOURCE_H

#include <ctime>
#include <functional>
#include <memory>
#include <string>

#include "lodestack/platform/LocationManager.h"

namespace lodestack {
namespace platform {
namespace host {

struct Position {
  double altitude = 0, latitude = 0, longitude = 0;
  double climb = 0, direction = 0, speedKmh = 0;
  location_accuracy_level_e level = LOCATION_ACCURACY_DETAILED;
  double horizontal = 0, vertical = 0;
  std::time_t time = 0;
};

class LocationSource {
 public:
  virtual ~LocationSource() = default;
  // Begins watching; from then on `changed` is called with the current
  // state, soon but never inside start(), and with every change after.
  // False (and a message for lastError) when the source cannot start.
  virtual bool start(std::function<void(bool enabled)> changed) = 0;
  virtual bool enabled() const = 0;
  // The current position; false while there is none.
  virtual bool position(Position& out) const = 0;
};

// The source LODESTACK_GNSS names: "scenario" (default) or
// "gpsd[:HOST[:PORT]]"; null, with the reason in `error`, when the value or
// the scenario is bad.
std::unique_ptr<LocationSource> makeLocationSource(std::string& error);

std::unique_ptr<LocationSource> makeScenarioLocationSource(std::string& error);
std::unique_ptr<LocationSource> makeGpsdLocationSource(const std::string& host,
                                                       const std::string& port, std::string& error);

}  // namespace host
}  // namespace platform
}  // namespace lodestack

#endif  // LODESTACK_SRC_PLATFORM_HOST_LOCATIONSOURCE_H
