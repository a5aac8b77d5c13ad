// A device's platform has no scenarios or bus services: the host platform's
// report functions exist so that clients build the same way on both.
#include "lodestack/platform/HostPlatform.h"

namespace lodestack {
namespace platform {

std::string lastError() { return std::string(); }

std::string checkScenarioFile(const std::string& path) {
  return "scenario " + path + ": scenarios are replayed by the host platform only";
}

SkippedCells lastSkippedCells() { return SkippedCells(); }

}  // namespace platform
}  // namespace lodestack
