// IRadioAdaptation: the radio side of the measurement path, as the
// measurement service sees it.
//
// An adaptation takes one request per kind of measurement at a time, hands
// out request ids (1, 2, 3, ... shared by all kinds), and reports every
// result, time-out and pushed measurement to its one observer. Obtain one
// from RadioAdaptationFactory::createRadioAdaptation(); the caller owns it
// and deletes it after the provider built over it. Every operation belongs
// to the thread that created the adaptation (its dispatcher's thread).
#ifndef LODESTACK_RADIOADAPTATION_IRADIOADAPTATION_H
#define LODESTACK_RADIOADAPTATION_IRADIOADAPTATION_H

#include "lodestack/radioadaptation/IRadioAdaptationObserver.h"

namespace lodestack {
namespace radioadaptation {

class LODESTACK_EXPORT IRadioAdaptation {
 public:
  using MeasurementType = IRadioAdaptationObserver::MeasurementType;
  static constexpr MeasurementType Cellular = IRadioAdaptationObserver::Cellular;
  static constexpr MeasurementType Wlan = IRadioAdaptationObserver::Wlan;
  static constexpr MeasurementType Gnss = IRadioAdaptationObserver::Gnss;

  virtual ~IRadioAdaptation();

  // Starts a measurement of exactly one kind (Cellular or Wlan). On Ok
  // `requestId` holds the new id and the result follows through the
  // observer. AlreadyPending: a request of that kind runs, and `requestId`
  // holds its id. Otherwise `requestId` is 0: Refused (no observer),
  // InvalidArgument (no kind, or several), NotSupported (Gnss), or the
  // platform's failure.
  virtual Status requestMeasurements(int types, unsigned int& requestId) = 0;
  // Forgets a pending request; its result, if any, is never delivered.
  // InvalidArgument for id 0, NotFound for an id that is not pending.
  virtual Status cancelRequest(unsigned int requestId) = 0;
  // NotSupported: simulation is not provided.
  virtual Status setSimulationEnabled(bool enabled) = 0;
  // Sets the one observer (not owned); null cancels every pending request.
  virtual Status setObserver(IRadioAdaptationObserver* observer) = 0;
  // Some client started (true) or stopped (false) wanting the kinds of
  // `types`; passive kinds (Gnss) are switched on and off by this.
  virtual void onSubscriptionChanged(int types, bool subscribed) = 0;
  // Hands in a measurement nobody requested (one kind in `types`); it
  // reaches the observer later with request id 0. `data` is the platform's
  // form of a result; see the adaptation.
  virtual Status pushMeasurement(const void* data, int size, int types) = 0;
  // Hands in a status word of `type` for `subscription` (only 0 and below,
  // the default subscription, are kept: NotSupported otherwise).
  virtual Status pushNetworkStatus(const void* data, int subscription, MeasurementType type) = 0;
  // The last status words: cellular (bit 0x1000: measurements unreliable;
  // 0 for a subscription above 0), WLAN, GNSS.
  virtual int networkStatus(int subscription) = 0;
  virtual int wifiStatus(int subscription) = 0;
  virtual int gnssStatus(int subscription) = 0;
};

}  // namespace radioadaptation
}  // namespace lodestack

#endif  // LODESTACK_RADIOADAPTATION_IRADIOADAPTATION_H
