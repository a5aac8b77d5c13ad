// FreeGnssListener: passive GNSS positions from the platform's location
// manager. It never starts a fix of its own: once installed (an observer
// set) it waits for the location service to report itself enabled, then
// reads the current position once a second and hands each one, as a
// PositionEstimate (technology GNSS, speed in m/s), to its observer. A
// disabled service stops the reading; setObserver(nullptr) stops it and
// releases the location manager.
//
// Made, used and destroyed on the thread of the dispatcher its timer runs
// on; the service-state callback comes through the same loop. The observer
// is not owned. Failures inside a poll reach the observer as a Status with
// the last good position (or null); a position the manager cannot give is
// skipped silently.
#ifndef LODESTACK_RADIOADAPTATION_FREEGNSSLISTENER_H
#define LODESTACK_RADIOADAPTATION_FREEGNSSLISTENER_H

#include "lodestack/core/ITimer.h"
#include "lodestack/platform/LocationManager.h"
#include "lodestack/schema/PositionEstimate.h"

namespace lodestack {
namespace radioadaptation {

class LODESTACK_EXPORT FreeGnssListener : public core::ITimerObserver {
 public:
  class LODESTACK_EXPORT Observer {
   public:
    virtual ~Observer();
    // One poll's outcome: Ok with the new position, or the failure's Status
    // with the last good position (null before the first).
    virtual void handleFreeGnssReport(const gom::SharedPointer<schema::PositionEstimate>& position,
                                      Status status) = 0;
  };

  FreeGnssListener();
  // Uninstalls: no observer call after destruction.
  ~FreeGnssListener() override;
  FreeGnssListener(const FreeGnssListener&) = delete;
  FreeGnssListener& operator=(const FreeGnssListener&) = delete;

  // A non-null observer installs the listener (throws Failed when the
  // location manager cannot be made); null uninstalls it.
  void setObserver(Observer* observer);
  // The poll timer's expiry: reads the position and reports it.
  void timeout(core::ITimer* timer) override;

  // Creates the manager and registers for its state; true when registered
  // (or already installed). Throws Failed when the manager cannot be made.
  bool install();
  void uninstall();
  // Starts the 1 s poll (first read after 1 ms); throws OutOfMemory without
  // a timer, or the timer's Status when it does not start.
  void startGpsListener();
  void stopGpsListener();
  // Reads the manager's position into `position`: false when it has none;
  // throws WrongObjectType when not installed and a setter's Status for a
  // value out of range.
  bool obtainLastPosition();
  void notifyObserver(Status status);
  void onLocationCollectionStateChanged(location_service_state_e state);
  static void staticLocationCollectionStateChanged(location_service_state_e state, void* listener);

  bool isInstalled() const { return manager != nullptr; }
  bool isListening() const { return listening; }

 private:
  location_manager_h manager;
  gom::SharedPointer<core::ITimer> timer;
  gom::SharedPointer<schema::PositionEstimate> position;
  Observer* observer;
  bool listening;
};

}  // namespace radioadaptation
}  // namespace lodestack

#endif  // LODESTACK_RADIOADAPTATION_FREEGNSSLISTENER_H
