// The scenario's GNSS track as a location source: the service follows the
// scenario's enabled and disabled periods, the position the fix in effect.
#include <algorithm>
#include <cmath>

#include "lodestack/core/ITimer.h"
#include "lodestack/core/Status.h"
#include "lodestack/gom/SharedPointer.h"
#include "platform/host/LocationSource.h"
#include "platform/host/Scenario.h"

namespace lodestack {
namespace platform {
namespace host {

namespace {

class ScenarioLocationSource : public LocationSource, public core::ITimerObserver {
 public:
  explicit ScenarioLocationSource(std::shared_ptr<const Scenario> scenario)
      : scenario_(std::move(scenario)) {}

  bool start(std::function<void(bool)> changed) override {
    changed_ = std::move(changed);
    timer_ = gom::SharedPointer<core::ITimer>(core::ITimer::create(this));
    if (!timer_) {
      setLastError("location manager: no timer on this thread's dispatcher");
      return false;
    }
    // The state current now is reported from the loop, at once.
    return timer_->start(1, 0, 0) == Ok;
  }

  bool enabled() const override { return scenario_->serviceEnabled(scenario_->elapsed()); }

  bool position(Position& out) const override {
    const Fix* fix = scenario_->fixAt(scenario_->elapsed());
    if (!fix) return false;
    out.altitude = fix->altitude;
    out.latitude = fix->latitude;
    out.longitude = fix->longitude;
    out.climb = fix->climb;
    out.direction = fix->direction;
    out.speedKmh = fix->speedKmh;
    out.horizontal = fix->accuracy;
    out.vertical = fix->verticalAccuracy;
    out.level = LOCATION_ACCURACY_DETAILED;
    out.time = fix->time ? *fix->time : std::time(nullptr);
    return true;
  }

  void timeout(core::ITimer*) override {
    // Report the state, then wait for the scenario's next change.
    const double now = scenario_->elapsed();
    const double next = scenario_->nextServiceChange(now);
    if (next >= 0) {
      const long long ms = std::max(1LL, static_cast<long long>(std::ceil((next - now) * 1000)));
      timer_->start(ms, 0, 0);
    }
    if (changed_) changed_(scenario_->serviceEnabled(now));
  }

 private:
  std::shared_ptr<const Scenario> scenario_;
  std::function<void(bool)> changed_;
  gom::SharedPointer<core::ITimer> timer_;
};

}  // namespace

std::unique_ptr<LocationSource> makeScenarioLocationSource(std::string& error) {
  try {
    return std::make_unique<ScenarioLocationSource>(acquireScenario());
  } catch (const ScenarioError& e) {
    error = e.what();
    return nullptr;
  }
}

}  // namespace host
}  // namespace platform
}  // namespace lodestack
