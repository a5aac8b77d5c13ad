// ISimulationDataProvider: a client's source of simulated radio data.
//
// Simulation is not supported by this library: the provider refuses it
// (MeasurementsProvider::setSimulationEnabled returns NotSupported) and never
// calls this interface. It is kept so that clients written for platforms
// with simulation build unchanged.
#ifndef LODESTACK_MEASUREMENTS_ISIMULATIONDATAPROVIDER_H
#define LODESTACK_MEASUREMENTS_ISIMULATIONDATAPROVIDER_H

#include "lodestack/core/Export.h"
#include "lodestack/gom/GenericObject.h"

namespace lodestack {

class LODESTACK_EXPORT ISimulationDataProvider {
 public:
  virtual ~ISimulationDataProvider();
  // The simulated data for the radio adaptation; null when there is none.
  virtual gom::SharedPointer<gom::GenericObject> getSimulationData() = 0;
};

}  // namespace lodestack

#endif  // LODESTACK_MEASUREMENTS_ISIMULATIONDATAPROVIDER_H
