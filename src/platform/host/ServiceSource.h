// Measurement sources over the services of the D-Bus system bus: WLAN from
// wpa_supplicant or NetworkManager, cells from ModemManager.
//
// A source runs its bus work on a thread of its own (a BusWorker with its
// own GMainContext), so the dispatcher's thread never waits on the bus, and
// hands every answer back to the dispatcher's thread through a queued call,
// which works with both dispatcher kinds. What a service is asked, and how
// its answers become measurement elements, is its ServiceProtocol.
//
// Failures: start() throws (the request fails at once) when the source
// already knows that none of its services is on the bus, or that there is
// no system bus; every failure found while measuring is logged, kept for
// lastError(), and left to the engine's time-out. Made, used and destroyed
// on the dispatcher's thread; ServiceProtocol::measure runs on the worker.
#ifndef LODESTACK_SRC_PLATFORM_HOST_SERVICESOURCE_H
#define LODESTACK_SRC_PLATFORM_HOST_SERVICESOURCE_H

#include <memory>
#include <string>
#include <vector>

#include "lodestack/platform/HostPlatform.h"
#include "lodestack/platform/RadioMeasurements.h"
#include "platform/host/MeasurementSource.h"
#include "platform/host/SystemBus.h"

namespace lodestack {
namespace platform {
namespace host {

// One finished measurement of a service.
struct ServiceAnswer {
  OxelMeasurements result;
  SkippedCells skipped;
};

class ServiceProtocol {
 public:
  virtual ~ServiceProtocol() = default;
  // The services it asks, in order; the source watches their names.
  virtual std::vector<BusService> services() const = 0;
  // The message of a request made while none of them is on the bus.
  virtual std::string absentMessage() const;
  // True for cellular answers, whose skipped cells lastSkippedCells() tells.
  virtual bool cellular() const { return false; }
  // Measures once, on the worker thread: BusFailure with the one-line
  // reason, BusCancelled when the session was cancelled.
  virtual ServiceAnswer measure(BusSession& bus) = 0;
};

std::unique_ptr<MeasurementSource> makeServiceSource(std::unique_ptr<ServiceProtocol> protocol);

std::unique_ptr<ServiceProtocol> makeWpaSupplicantProtocol();
std::unique_ptr<ServiceProtocol> makeNetworkManagerProtocol();
// wpa_supplicant when it answers, else NetworkManager.
std::unique_ptr<ServiceProtocol> makeAutoWlanProtocol();
std::unique_ptr<ServiceProtocol> makeModemManagerProtocol();

// Debug log and lastError() at once: what every source failure gets.
void reportFailure(const std::string& message);
void setLastSkippedCells(const SkippedCells& skipped);

}  // namespace host
}  // namespace platform
}  // namespace lodestack

#endif  // LODESTACK_SRC_PLATFORM_HOST_SERVICESOURCE_H
