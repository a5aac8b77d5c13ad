// The scenario's results of one kind as a measurement source: served in
// order, answered as each result's answer says, through timers of the
// calling thread's dispatcher.
#include <algorithm>
#include <ctime>
#include <stdexcept>

#include "lodestack/core/ITimer.h"
#include "lodestack/core/Status.h"
#include "lodestack/gom/SharedPointer.h"
#include "platform/host/MeasurementSource.h"
#include "platform/host/Scenario.h"

namespace lodestack {
namespace platform {
namespace host {

namespace {

class ScenarioSource : public MeasurementSource, public core::ITimerObserver {
 public:
  ScenarioSource(std::shared_ptr<const Scenario> scenario, SourceKind kind)
      : scenario_(std::move(scenario)),
        kind_(kind == SourceKind::Cellular ? scenario_->cellular : scenario_->wlan) {}

  void start(RadioMeasurements::Callback cb, void* ctx) override {
    cancel();
    const Result& result = kind_.results[next_++ % kind_.results.size()];
    const Answer answer = result.answer.value_or(kind_.answer);
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
    if (!timer_) {
      timer_ = gom::SharedPointer<core::ITimer>(core::ITimer::create(this));
      if (!timer_) throw std::runtime_error("no timer on this thread's dispatcher");
    }
    callback_ = cb;
    context_ = ctx;
    pending_ = &result;
    started_ = std::time(nullptr);
    // A timer cannot expire at once: no delay still answers from the loop.
    if (timer_->start(std::max(answer.delayMs, 1), 0, 0) != Ok) {
      callback_ = nullptr;
      throw std::runtime_error("the answer's timer did not start");
    }
  }

  void cancel() override {
    callback_ = nullptr;
    if (timer_) timer_->stop();
  }

  // The result of the next request decides what the modem reports before it.
  int dchStateDuration() const override {
    return kind_.results[next_ % kind_.results.size()].dchStateDuration;
  }
  bool inTechChange() const override { return scenario_->inTechChange(scenario_->elapsed()); }

  void timeout(core::ITimer*) override {
    if (!callback_) return;
    RadioMeasurements::Callback cb = callback_;
    callback_ = nullptr;
    // Last: the callback may destroy the library object.
    cb(context_, pending_->build(started_, std::time(nullptr)));
  }

 private:
  std::shared_ptr<const Scenario> scenario_;
  const Kind& kind_;
  std::size_t next_ = 0;
  RadioMeasurements::Callback callback_ = nullptr;
  void* context_ = nullptr;
  const Result* pending_ = nullptr;
  std::time_t started_ = 0;
  gom::SharedPointer<core::ITimer> timer_;
};

}  // namespace

std::unique_ptr<MeasurementSource> makeScenarioSource(std::shared_ptr<const Scenario> scenario,
                                                      SourceKind kind) {
  return std::make_unique<ScenarioSource>(std::move(scenario), kind);
}

}  // namespace host
}  // namespace platform
}  // namespace lodestack
