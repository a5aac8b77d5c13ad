// gpsd as a location source. (Being written: refuses to start for now.)
#include "platform/host/LocationSource.h"

namespace lodestack {
namespace platform {
namespace host {

std::unique_ptr<LocationSource> makeGpsdLocationSource(const std::string& host,
                                                       const std::string& port, std::string& error) {
  error = "location manager: gpsd at " + host + ":" + port + " is not supported yet";
  return nullptr;
}

}  // namespace host
}  // namespace platform
}  // namespace lodestack
