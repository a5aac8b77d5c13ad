#include "lodestack/radioadaptation/FreeGnssListener.h"

#include <cmath>
#include <limits>

#include "lodestack/debug/Debug.h"

namespace lodestack {
namespace radioadaptation {

using gom::SharedPointer;
using schema::PositionEstimate;

namespace {

const int kPollFirstMs = 1;
const int kPollIntervalMs = 1000;
const double kKmhPerMs = 3.6;

void check(Status status) {
  if (status != Ok) throw status;
}

}  // namespace

FreeGnssListener::Observer::~Observer() = default;

FreeGnssListener::FreeGnssListener()
    : manager(nullptr), observer(nullptr), listening(false) {}

FreeGnssListener::~FreeGnssListener() {
  uninstall();
  timer.clear();
  position.clear();
}

void FreeGnssListener::setObserver(Observer* o) {
  observer = o;
  if (o)
    install();
  else
    uninstall();
}

bool FreeGnssListener::install() {
  if (manager) return true;
  if (location_manager_create(LOCATION_METHOD_GNSS, &manager) != LOCATION_ERROR_NONE) {
    manager = nullptr;
    throw Failed;
  }
  // Reading starts when the service reports itself enabled.
  return location_manager_set_service_state_changed_cb(manager, &staticLocationCollectionStateChanged,
                                                       this) == LOCATION_ERROR_NONE;
}

void FreeGnssListener::uninstall() {
  stopGpsListener();
  if (!manager) return;
  location_manager_unset_service_state_changed_cb(manager);
  location_manager_destroy(manager);
  manager = nullptr;
}

void FreeGnssListener::staticLocationCollectionStateChanged(location_service_state_e state,
                                                            void* listener) {
  try {
    static_cast<FreeGnssListener*>(listener)->onLocationCollectionStateChanged(state);
  } catch (...) {
    // Nothing leaves the platform's callback; the next state change retries.
    Debug::log(Debug::Level1, gRadioAdaptationComponentName, "FREE GNSS: listener did not start\n");
  }
}

void FreeGnssListener::onLocationCollectionStateChanged(location_service_state_e state) {
  if (state == LOCATION_SERVICE_ENABLED)
    startGpsListener();
  else if (state == LOCATION_SERVICE_DISABLED)
    stopGpsListener();
}

void FreeGnssListener::startGpsListener() {
  if (listening) return;
  if (!timer) {
    timer = SharedPointer<core::ITimer>(core::ITimer::create(this));
    if (!timer) throw OutOfMemory;
  }
  const int status = timer->start(kPollFirstMs, kPollIntervalMs, 100);
  if (status != Ok) {
    stopGpsListener();
    throw static_cast<Status>(status);
  }
  listening = true;
}

void FreeGnssListener::stopGpsListener() {
  if (timer) timer->stop();
  listening = false;
}

void FreeGnssListener::timeout(core::ITimer*) {
  try {
    if (obtainLastPosition()) notifyObserver(Ok);
  } catch (Status status) {
    notifyObserver(status);
  } catch (...) {
    notifyObserver(Failed);
  }
}

bool FreeGnssListener::obtainLastPosition() {
  if (!manager) throw WrongObjectType;
  const double nan = std::numeric_limits<double>::quiet_NaN();
  double altitude = nan, latitude = nan, longitude = nan, climb = nan, direction = nan;
  double speed = nan, horizontal = nan, vertical = nan;
  location_accuracy_level_e level = LOCATION_ACCURACY_NONE;
  time_t timestamp = 0;
  if (location_manager_get_location(manager, &altitude, &latitude, &longitude, &climb, &direction,
                                    &speed, &level, &horizontal, &vertical, &timestamp) != 0)
    return false;

  SharedPointer<PositionEstimate> estimate = PositionEstimate::create();
  if (!estimate) throw OutOfMemory;
  check(estimate->setTechnology(PositionEstimate::TechnologyGnss));
  check(estimate->setLatitude(latitude));
  check(estimate->setLongitude(longitude));
  check(estimate->setTimeStamp(static_cast<unsigned int>(timestamp)));
  check(estimate->setHorizontalCepUncertainty(horizontal));
  check(estimate->setSpeed(speed / kKmhPerMs));
  position = estimate;
  return true;
}

void FreeGnssListener::notifyObserver(Status status) {
  if (observer) observer->handleFreeGnssReport(position, status);
}

}  // namespace radioadaptation
}  // namespace lodestack
