// The host's measurement library: replays the scenario's results through
// timers on the calling thread's dispatcher.
#include "lodestack/platform/RadioMeasurements.h"

#include <algorithm>
#include <ctime>
#include <stdexcept>

#include "lodestack/core/ITimer.h"
#include "lodestack/core/Status.h"
#include "lodestack/gom/SharedPointer.h"
#include "platform/host/Scenario.h"

using lodestack::gom::SharedPointer;
using lodestack::platform::host::Answer;
using lodestack::platform::host::Kind;
using lodestack::platform::host::Result;
using lodestack::platform::host::Scenario;

OxelObservationElement::~OxelObservationElement() = default;

namespace {

// The running measurement of one kind, answered later by its timer.
struct PendingMeasurement : lodestack::core::ITimerObserver {
  explicit PendingMeasurement(const Kind& k) : kind(k) {}

  void start(RadioMeasurements::Callback cb, void* ctx) {
    cancel();
    const Result& result = kind.results[next++ % kind.results.size()];
    const Answer answer = result.answer.value_or(kind.answer);
    switch (answer.mode) {
      case Answer::Throw:
        throw std::runtime_error("simulated measurement library failure");
      case Answer::Never:
        return;
      case Answer::Synchronous:
        cb(ctx, result.build(std::time(nullptr), std::time(nullptr)));
        return;
      case Answer::Delayed:
        break;
    }
    if (!timer) {
      timer = SharedPointer<lodestack::core::ITimer>(lodestack::core::ITimer::create(this));
      if (!timer) throw std::runtime_error("no timer on this thread's dispatcher");
    }
    callback = cb;
    context = ctx;
    pending = &result;
    started = std::time(nullptr);
    // A timer cannot expire at once: no delay still answers from the loop.
    if (timer->start(std::max(answer.delayMs, 1), 0, 0) != lodestack::Ok) {
      callback = nullptr;
      throw std::runtime_error("the answer's timer did not start");
    }
  }
  void cancel() {
    callback = nullptr;
    if (timer) timer->stop();
  }
  // The result of the next request: what the modem reports before it starts.
  const Result& upcoming() const { return kind.results[next % kind.results.size()]; }

  void timeout(lodestack::core::ITimer*) override {
    if (!callback) return;
    RadioMeasurements::Callback cb = callback;
    callback = nullptr;
    // Last: the callback may destroy the library object.
    cb(context, pending->build(started, std::time(nullptr)));
  }

  const Kind& kind;
  std::size_t next = 0;
  RadioMeasurements::Callback callback = nullptr;
  void* context = nullptr;
  const Result* pending = nullptr;
  std::time_t started = 0;
  SharedPointer<lodestack::core::ITimer> timer;
};

}  // namespace

class RadioMeasurementsImpl {
 public:
  RadioMeasurementsImpl()
      : scenario(lodestack::platform::host::acquireScenario()),
        cellular(scenario->cellular),
        wlan(scenario->wlan) {}
  std::shared_ptr<const Scenario> scenario;
  PendingMeasurement cellular;
  PendingMeasurement wlan;
};

RadioMeasurements::RadioMeasurements() : impl_(new RadioMeasurementsImpl()) {}

RadioMeasurements::~RadioMeasurements() {
  impl_->cellular.cancel();
  impl_->wlan.cancel();
}

void RadioMeasurements::startCellMeasurements(Callback callback, void* context) {
  impl_->cellular.start(callback, context);
}

void RadioMeasurements::cancelCellMeasurements() { impl_->cellular.cancel(); }

void RadioMeasurements::wlanIcdScan(Callback callback, void* context) {
  impl_->wlan.start(callback, context);
}

void RadioMeasurements::wlanIcdScanCancel() { impl_->wlan.cancel(); }

int RadioMeasurements::cellDchStateDuration() { return impl_->cellular.upcoming().dchStateDuration; }

int RadioMeasurements::unreliableMeasurementsAfterTechChange() {
  return impl_->scenario->inTechChange(impl_->scenario->elapsed()) ? 1 : 0;
}
