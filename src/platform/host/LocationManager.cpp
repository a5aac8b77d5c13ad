// The host's location manager: the C interface over a LocationSource.
#include "lodestack/platform/LocationManager.h"

#include <cstdlib>
#include <new>

#include "platform/host/LocationSource.h"
#include "platform/host/Scenario.h"

using lodestack::platform::host::LocationSource;
using lodestack::platform::host::Position;

struct location_manager_s {
  std::unique_ptr<LocationSource> source;
  bool started = false;
  location_service_state_changed_cb callback = nullptr;
  void* userData = nullptr;

  void changed(bool enabled) {
    if (callback)
      callback(enabled ? LOCATION_SERVICE_ENABLED : LOCATION_SERVICE_DISABLED, userData);
  }
};

namespace lodestack {
namespace platform {
namespace host {

std::unique_ptr<LocationSource> makeLocationSource(std::string& error) {
  const char* env = std::getenv("LODESTACK_GNSS");
  const std::string value = env && *env ? env : "scenario";
  if (value == "scenario") return makeScenarioLocationSource(error);
  if (value == "gpsd" || value.rfind("gpsd:", 0) == 0) {
    std::string host = "localhost", port = "2947";
    if (value.size() > 5) {
      // gpsd:HOST, gpsd:HOST:PORT, or an IPv6 address in brackets: gpsd:[::1]:2947.
      const std::string rest = value.substr(5);
      std::string after;
      if (rest.front() == '[') {
        const std::size_t close = rest.find(']');
        host = close == std::string::npos ? "" : rest.substr(1, close - 1);
        after = close == std::string::npos ? "" : rest.substr(close + 1);
        if (!after.empty() && after.front() != ':') host.clear();
        if (!after.empty()) after = after.substr(1);
      } else {
        const std::size_t colon = rest.find(':');
        host = rest.substr(0, colon);
        if (colon != std::string::npos) after = rest.substr(colon + 1);
      }
      if (!after.empty()) port = after;
      if (host.empty() || port.find_first_not_of("0123456789") != std::string::npos ||
          (value.back() == ':')) {
        error = "LODESTACK_GNSS: expected gpsd[:HOST[:PORT]], got \"" + value + "\"";
        return nullptr;
      }
    }
    return makeGpsdLocationSource(host, port, error);
  }
  error = "LODESTACK_GNSS: expected scenario or gpsd[:HOST[:PORT]], got \"" + value + "\"";
  return nullptr;
}

}  // namespace host
}  // namespace platform
}  // namespace lodestack

int location_manager_create(location_method_e, location_manager_h* manager) {
  if (!manager) return LOCATION_ERROR_INVALID_PARAMETER;
  *manager = nullptr;
  std::string error;
  std::unique_ptr<LocationSource> source = lodestack::platform::host::makeLocationSource(error);
  if (!source) {
    lodestack::platform::host::setLastError(error);
    return LOCATION_ERROR_SERVICE_NOT_AVAILABLE;
  }
  location_manager_h m = new (std::nothrow) location_manager_s();
  if (!m) return LOCATION_ERROR_OUT_OF_MEMORY;
  m->source = std::move(source);
  *manager = m;
  return LOCATION_ERROR_NONE;
}

int location_manager_destroy(location_manager_h manager) {
  if (!manager) return LOCATION_ERROR_INVALID_PARAMETER;
  delete manager;
  return LOCATION_ERROR_NONE;
}

int location_manager_set_service_state_changed_cb(location_manager_h manager,
                                                  location_service_state_changed_cb callback,
                                                  void* userData) {
  if (!manager || !callback) return LOCATION_ERROR_INVALID_PARAMETER;
  manager->callback = callback;
  manager->userData = userData;
  if (!manager->started) {
    if (!manager->source->start([manager](bool enabled) { manager->changed(enabled); }))
      return LOCATION_ERROR_SERVICE_NOT_AVAILABLE;
    manager->started = true;
  }
  return LOCATION_ERROR_NONE;
}

int location_manager_unset_service_state_changed_cb(location_manager_h manager) {
  if (!manager) return LOCATION_ERROR_INVALID_PARAMETER;
  manager->callback = nullptr;
  manager->userData = nullptr;
  return LOCATION_ERROR_NONE;
}

int location_manager_get_location(location_manager_h manager, double* altitude, double* latitude,
                                  double* longitude, double* climb, double* direction,
                                  double* speed, location_accuracy_level_e* level,
                                  double* horizontal, double* vertical, time_t* timestamp) {
  if (!manager || !altitude || !latitude || !longitude || !climb || !direction || !speed ||
      !level || !horizontal || !vertical || !timestamp)
    return LOCATION_ERROR_INVALID_PARAMETER;
  Position p;
  if (!manager->source->enabled() || !manager->source->position(p))
    return LOCATION_ERROR_NO_POSITION;
  *altitude = p.altitude;
  *latitude = p.latitude;
  *longitude = p.longitude;
  *climb = p.climb;
  *direction = p.direction;
  *speed = p.speedKmh;
  *level = p.level;
  *horizontal = p.horizontal;
  *vertical = p.vertical;
  *timestamp = p.time;
  return LOCATION_ERROR_NONE;
}
