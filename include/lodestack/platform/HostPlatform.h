// What the host platform tells its clients beyond the platform interfaces.
//
// The host platform is configured by the environment, read when its objects
// are made (the measurement library with the adaptation, the location
// manager when GNSS is first subscribed): LODESTACK_SCENARIO names the scenario file (JSON, see
// doc/scenarios.md; the built-in street when unset), LODESTACK_GNSS the
// location source (see LocationManager.h). When a platform object cannot be
// made, for example because the scenario file does not load, lastError()
// says why in one line; the factory of the radio adaptation then returns
// null. Any thread; the text is per process, the last failure's.
#ifndef LODESTACK_PLATFORM_HOSTPLATFORM_H
#define LODESTACK_PLATFORM_HOSTPLATFORM_H

#include <string>

#include "lodestack/core/Export.h"

namespace lodestack {
namespace platform {

// The last failure's message ("scenario FILE: line L: ..."), or empty.
LODESTACK_EXPORT std::string lastError();
// Checks a scenario file without using it: empty when it loads, else the
// message lastError() would give.
LODESTACK_EXPORT std::string checkScenarioFile(const std::string& path);

}  // namespace platform
}  // namespace lodestack

#endif  // LODESTACK_PLATFORM_HOSTPLATFORM_H
