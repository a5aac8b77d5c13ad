// The host's measurement library: each kind's answers come from its
// MeasurementSource: the scenario's, or a service of the system bus as
// LODESTACK_WLAN and LODESTACK_CELLS choose.
#include "lodestack/platform/RadioMeasurements.h"

#include <cstdlib>
#include <stdexcept>

#include "platform/host/MeasurementSource.h"
#include "platform/host/Scenario.h"
#include "platform/host/ServiceSource.h"

using lodestack::platform::host::MeasurementSource;
using lodestack::platform::host::SourceKind;

OxelObservationElement::~OxelObservationElement() = default;

namespace {

// The variable's value, "scenario" when unset or empty; a value outside
// `allowed` is refused with the platform's last error.
std::string choice(const char* variable, const std::vector<std::string>& allowed) {
  const char* env = std::getenv(variable);
  const std::string value = env && *env ? env : "scenario";
  for (const std::string& a : allowed)
    if (value == a) return value;
  std::string expected;
  for (std::size_t i = 0; i < allowed.size(); ++i)
    expected += (i == 0 ? "" : i + 1 == allowed.size() ? " or " : ", ") + allowed[i];
  const std::string message =
      std::string(variable) + ": expected " + expected + ", got \"" + value + "\"";
  lodestack::platform::host::setLastError(message);
  throw std::runtime_error(message);
}

}  // namespace

class RadioMeasurementsImpl {
 public:
  RadioMeasurementsImpl() {
    using namespace lodestack::platform::host;
    const std::string wlanChoice =
        choice("LODESTACK_WLAN", {"scenario", "wpa_supplicant", "networkmanager", "auto"});
    const std::string cellsChoice = choice("LODESTACK_CELLS", {"scenario", "modemmanager"});
    std::shared_ptr<const Scenario> scenario;
    if (wlanChoice == "scenario" || cellsChoice == "scenario") scenario = acquireScenario();
    cellular = cellsChoice == "modemmanager" ? makeServiceSource(makeModemManagerProtocol())
                                             : makeScenarioSource(scenario, SourceKind::Cellular);
    if (wlanChoice == "wpa_supplicant")
      wlan = makeServiceSource(makeWpaSupplicantProtocol());
    else if (wlanChoice == "networkmanager")
      wlan = makeServiceSource(makeNetworkManagerProtocol());
    else if (wlanChoice == "auto")
      wlan = makeServiceSource(makeAutoWlanProtocol());
    else
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
