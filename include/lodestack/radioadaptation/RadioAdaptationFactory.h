// RadioAdaptationFactory: the way clients obtain the platform's radio
// adaptation.
//
// createRadioAdaptation() makes and initialises the adaptation on the calling
// thread, whose dispatcher it then runs on (open or choose that thread's
// dispatcher kind before calling). The caller owns the result and deletes it
// on that thread, after the MeasurementsProvider built over it. Null when the
// adaptation cannot be made: no dispatcher, or a platform that does not
// start (on the host, lodestack::platform::lastError() says why).
#ifndef LODESTACK_RADIOADAPTATION_RADIOADAPTATIONFACTORY_H
#define LODESTACK_RADIOADAPTATION_RADIOADAPTATIONFACTORY_H

#include "lodestack/radioadaptation/IRadioAdaptation.h"

namespace lodestack {
namespace radioadaptation {

class LODESTACK_EXPORT RadioAdaptationFactory {
 public:
  RadioAdaptationFactory() = delete;
  static IRadioAdaptation* createRadioAdaptation();
};

}  // namespace radioadaptation
}  // namespace lodestack

#endif  // LODESTACK_RADIOADAPTATION_RADIOADAPTATIONFACTORY_H
