// The part of LinuxRadioAdaptationOxel that receives the GNSS listener's
// reports and owns the listener (made when Gnss is first subscribed).
#ifndef LODESTACK_SRC_RADIOADAPTATION_LINUXRADIOADAPTATIONOXELPRIVATE_H
#define LODESTACK_SRC_RADIOADAPTATION_LINUXRADIOADAPTATIONOXELPRIVATE_H

#include "lodestack/radioadaptation/FreeGnssListener.h"
#include "lodestack/radioadaptation/LinuxRadioAdaptationOxel.h"

namespace lodestack {
namespace radioadaptation {

class LinuxRadioAdaptationOxelPrivate : public FreeGnssListener::Observer {
 public:
  explicit LinuxRadioAdaptationOxelPrivate(LinuxRadioAdaptationOxel* owner) : owner(owner) {}
  ~LinuxRadioAdaptationOxelPrivate() override { delete listener; }

  void handleFreeGnssReport(const gom::SharedPointer<schema::PositionEstimate>& position,
                            Status status) override {
    owner->freeGnssScanCallback(position, status);
  }

  LinuxRadioAdaptationOxel* owner;
  FreeGnssListener* listener = nullptr;
};

}  // namespace radioadaptation
}  // namespace lodestack

#endif  // LODESTACK_SRC_RADIOADAPTATION_LINUXRADIOADAPTATIONOXELPRIVATE_H
