// What the host platform tells its clients beyond the platform interfaces.
//
// The host platform is configured by the environment, read when its objects
// are made (the measurement library with the adaptation, the location
// manager when GNSS is first subscribed):
// - LODESTACK_SCENARIO names the scenario file (JSON, see doc/scenarios.md;
//   the built-in street when unset);
// - LODESTACK_GNSS the location source (see LocationManager.h);
// - LODESTACK_WLAN where WLAN scans come from: "scenario" (default),
//   "wpa_supplicant" or "networkmanager" (the services on the D-Bus system
//   bus), or "auto" (wpa_supplicant when it answers, else NetworkManager);
// - LODESTACK_CELLS where cellular measurements come from: "scenario"
//   (default) or "modemmanager" (ModemManager 1.20 or later).
// An unknown value of either is refused like a scenario that does not load.
//
// A measurement from a service fails at once when the source already knows
// that the service is not on the system bus (or there is no system bus);
// any other failure (no modem or wireless device, a refused or failed call,
// malformed answers, a service that leaves during the measurement or never
// answers) ends in the request's time-out. Either way lastError() says why.
//
// When a platform object cannot be made, for example because the scenario
// file does not load, lastError() says why in one line; the factory of the
// radio adaptation then returns null. Any thread; the text is per process,
// the last failure's.
#ifndef LODESTACK_PLATFORM_HOSTPLATFORM_H
#define LODESTACK_PLATFORM_HOSTPLATFORM_H

#include <string>

#include "lodestack/core/Export.h"

namespace lodestack {
namespace platform {

// The last failure's message ("scenario FILE: line L: ...", "ModemManager:
// no modem"), or empty.
LODESTACK_EXPORT std::string lastError();
// Checks a scenario file without using it: empty when it loads, else the
// message lastError() would give.
LODESTACK_EXPORT std::string checkScenarioFile(const std::string& path);

// Cells of a cellular answer that have no records in lodestack and were
// left out of the result, by technology.
struct SkippedCells {
  unsigned int nr = 0;    // 5G NR
  unsigned int cdma = 0;  // CDMA
};
// The skipped cells of the last cellular answer ModemManager gave (set
// before that answer reaches the adaptation); all zero before the first.
LODESTACK_EXPORT SkippedCells lastSkippedCells();

}  // namespace platform
}  // namespace lodestack

#endif  // LODESTACK_PLATFORM_HOSTPLATFORM_H
