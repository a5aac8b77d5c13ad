// The host's measurement library: each kind's answers come from its
// MeasurementSource, the scenario's unless a service was chosen.
#include "lodestack/platform/RadioMeasurements.h"

#include "platform/host/MeasurementSource.h"
#include "platform/host/Scenario.h"

using lodestack::platform::host::MeasurementSource;
using lodestack::platform::host::SourceKind;

OxelObservationElement::~OxelObservationElement() = default;

class RadioMeasurementsImpl {
 public:
  RadioMeasurementsImpl() {
    std::shared_ptr<const lodestack::platform::host::Scenario> scenario =
        lodestack::platform::host::acquireScenario();
    cellular = makeScenarioSource(scenario, SourceKind::Cellular);
    wlan = makeScenarioSource(scenario, SourceKind::Wlan);
  }
  std::unique_ptr<MeasurementSource> cellular;
  std::unique_ptr<MeasurementSource> wlan;
};

RadioMeasurements::RadioMeasurements() : impl_(new RadioMeasurementsImpl()) {}

RadioMeasurements::~RadioMeasurements() {
  impl_->cellular->cancel();
  impl_->wlan->cancel();
}

void RadioMeasurements::startCellMeasurements(Callback callback, void* context) {
  impl_->cellular->start(callback, context);
}

void RadioMeasurements::cancelCellMeasurements() { impl_->cellular->cancel(); }

void RadioMeasurements::wlanIcdScan(Callback callback, void* context) {
  impl_->wlan->start(callback, context);
}

void RadioMeasurements::wlanIcdScanCancel() { impl_->wlan->cancel(); }

int RadioMeasurements::cellDchStateDuration() { return impl_->cellular->dchStateDuration(); }

int RadioMeasurements::unreliableMeasurementsAfterTechChange() {
  return impl_->cellular->inTechChange() ? 1 : 0;
}
