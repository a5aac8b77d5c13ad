// The platform's location manager, as lodestack uses it: a C interface that
// tells whether the location service is enabled and hands out the current
// position. lodestack never starts a fix; it reads the position once a
// second while the service is enabled.
//
// The host build implements it with two sources, chosen by the environment
// variable LODESTACK_GNSS: "scenario" (the default) replays the GNSS track
// of the scenario (LODESTACK_SCENARIO, or the built-in street);
// "gpsd[:HOST[:PORT]]" (default localhost:2947) reads fixes from gpsd, the
// service counting as enabled while gpsd delivers 2D or 3D fixes.
//
// Threading: create, use and destroy a manager on one thread, the one
// running lodestack's dispatcher; the state callback runs on that thread,
// from its loop, never inside the call that registered it.
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
