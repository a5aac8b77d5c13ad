// The platform's location manager, as lodestack uses it: a C interface that
// tells whether the location service is enabled and hands out the current
// position. lodestack never starts a fix; it reads the position once a
// second while the service is enabled.
//
// The host build implements it with two sources, chosen by the environment
// variable LODESTACK_GNSS: "scenario" (the default) replays the GNSS track
// of the scenario (LODESTACK_SCENARIO, or the built-in street);
// "gpsd[:HOST[:PORT]]" (default localhost:2947; an IPv6 address in
// brackets) reads fixes from gpsd.
//
// With gpsd the service is enabled while gpsd delivers 2D or 3D fixes, and
// disabled when a report drops below 2D, when no fix has come for 3 s, or
// while gpsd cannot be reached; a new connection is tried every 2 s, so a
// gpsd that is not running (yet) leaves the service disabled without
// failing. A fix is handed over with what gpsd knows; where it does not say,
// the horizontal accuracy is 100 m, the speed 0 km/h, the time that of
// arrival, and altitude, climb, direction and vertical accuracy are 0.
//
// Threading: create, use and destroy a manager on one thread, the one
// running lodestack's dispatcher; the state callback runs on that thread,
// from its loop, never inside the call that registered it. Do not destroy
// the manager from inside its callback.
#ifndef LODESTACK_PLATFORM_LOCATIONMANAGER_H
#define LODESTACK_PLATFORM_LOCATIONMANAGER_H

#include <time.h>

#include "lodestack/core/Export.h"

#ifdef __cplusplus
extern "C" {
#endif

typedef struct location_manager_s* location_manager_h;

typedef enum {
  LOCATION_SERVICE_DISABLED = 0,
  LOCATION_SERVICE_ENABLED = 1
} location_service_state_e;

typedef enum {
  LOCATION_ACCURACY_NONE = 0,
  LOCATION_ACCURACY_COUNTRY,
  LOCATION_ACCURACY_REGION,
  LOCATION_ACCURACY_LOCALITY,
  LOCATION_ACCURACY_POSTALCODE,
  LOCATION_ACCURACY_STREET,
  LOCATION_ACCURACY_DETAILED
} location_accuracy_level_e;

// The positioning method a manager uses; lodestack asks for GNSS (1).
typedef enum {
  LOCATION_METHOD_HYBRID = 0,
  LOCATION_METHOD_GNSS = 1
} location_method_e;

// Results: 0 success; the others below.
enum {
  LOCATION_ERROR_NONE = 0,
  LOCATION_ERROR_INVALID_PARAMETER = -22,      // a null output or manager
  LOCATION_ERROR_OUT_OF_MEMORY = -12,
  LOCATION_ERROR_SERVICE_NOT_AVAILABLE = -61,  // no source, or it cannot start
  LOCATION_ERROR_NO_POSITION = -62             // service disabled or no fix yet
};

// Called with every change of the service's state, and once with the state
// current when it is registered.
typedef void (*location_service_state_changed_cb)(location_service_state_e state, void* user_data);

// A new manager in *manager (owned by the caller: location_manager_destroy).
LODESTACK_EXPORT int location_manager_create(location_method_e method, location_manager_h* manager);
LODESTACK_EXPORT int location_manager_destroy(location_manager_h manager);
// One callback per manager; a second registration replaces the first.
LODESTACK_EXPORT int location_manager_set_service_state_changed_cb(
    location_manager_h manager, location_service_state_changed_cb callback, void* user_data);
LODESTACK_EXPORT int location_manager_unset_service_state_changed_cb(location_manager_h manager);
// The current position: altitude (m), latitude and longitude (degrees),
// climb (m/s), direction (degrees from north), speed (km/h), accuracy level,
// horizontal and vertical accuracy (m), time of the fix (seconds since the
// epoch). Outputs are written only on success; LOCATION_ERROR_NO_POSITION
// while the service is disabled or before the first fix.
LODESTACK_EXPORT int location_manager_get_location(
    location_manager_h manager, double* altitude, double* latitude, double* longitude,
    double* climb, double* direction, double* speed, location_accuracy_level_e* level,
    double* horizontal, double* vertical, time_t* timestamp);

#ifdef __cplusplus
}
#endif

#endif  // LODESTACK_PLATFORM_LOCATIONMANAGER_H
