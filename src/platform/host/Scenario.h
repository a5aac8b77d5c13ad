// A scenario: what the host platform's simulated measurement library and
// location manager answer, over time. Loaded from a JSON file (the format is
// documented in doc/scenarios.md) or from the built-in street.
//
// Results are served in order, one per request of their kind, from the
// first again after the last. The modem's states and the GNSS track are
// timelines in seconds since the scenario was loaded: one Scenario object is
// shared by the platform objects alive at the same time (see acquire), so
// the measurement library and the location manager of one adaptation see
// one clock. Immutable after loading; any thread may read it.
#ifndef LODESTACK_SRC_PLATFORM_HOST_SCENARIO_H
#define LODESTACK_SRC_PLATFORM_HOST_SCENARIO_H

#include <chrono>
#include <ctime>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <variant>
#include <vector>

#include "lodestack/platform/RadioMeasurements.h"

namespace lodestack {
namespace platform {
namespace host {

// A scenario that cannot be loaded; what() is the one-line message.
class ScenarioError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

// How the library answers a start call.
struct Answer {
  enum Mode { Delayed, Synchronous, Never, Throw };
  Mode mode = Delayed;
  int delayMs = 100;
};

// An element of a result as the scenario gives it; `timestamp` unset means
// "when it is delivered".
using ElementValue = std::variant<OxelElementGSM, OxelElementWCDMA, OxelElementTDSCDMA,
                                  OxelElementLTE, OxelElementWLAN, OxelObservationElement>;
struct ElementTemplate {
  ElementValue value;
  bool hasTimestamp = false;
};

struct Result {
  std::optional<Answer> answer;  // the kind's answer when unset
  int unreliableState = 0;
  int dchStateDuration = -2;  // what the modem reports when this result's request starts
  // When the dedicated-channel state began, as the result reports it; when
  // the scenario does not say, it follows from dchStateDuration at the start.
  std::optional<long> dchTimestamp;
  std::vector<ElementTemplate> elements;

  // The result of a measurement started at `started`, handed over at `now`:
  // elements stamped with `now` where the scenario gave no time.
  OxelMeasurements build(std::time_t started, std::time_t now) const;
};

struct Kind {
  Answer answer;
  std::vector<Result> results;  // at least one
};

struct Window {
  double from = 0;
  double until = 0;
};

struct ServicePeriod {
  double from = 0;
  bool enabled = true;
};

struct Fix {
  double at = 0;
  double latitude = 0, longitude = 0, altitude = 0;
  double climb = 0, direction = 0, speedKmh = 0;
  double accuracy = 0, verticalAccuracy = 0;
  std::optional<std::time_t> time;  // when unset, the time it is read
};

struct Scenario {
  std::string name;
  std::string source;  // the file, or "built-in street"
  Kind cellular;
  Kind wlan;
  std::vector<Window> techChange;  // cellular measurements unusable within
  std::vector<ServicePeriod> gnssService;  // ordered by `from`; enabled from 0 when empty
  std::vector<Fix> fixes;                  // ordered by `at`
  bool loopTrack = false;  // after the last fix, the track starts again

  // Seconds since the scenario was loaded.
  double elapsed() const;
  bool inTechChange(double t) const;
  bool serviceEnabled(double t) const;
  // The first time after `t` at which the service state changes; negative
  // when it never does.
  double nextServiceChange(double t) const;
  // The fix in effect at `t` (the last one with at <= t); null before the first.
  const Fix* fixAt(double t) const;

  std::chrono::steady_clock::time_point loaded = std::chrono::steady_clock::now();
};

// Parses scenario JSON text; `source` names it in messages. Throws ScenarioError.
std::shared_ptr<const Scenario> parseScenario(const std::string& text, const std::string& source);
// Loads the file (empty path: the built-in street). Throws ScenarioError.
std::shared_ptr<const Scenario> loadScenario(const std::string& path);
// The scenario of LODESTACK_SCENARIO (or the built-in street), shared with
// the platform objects that hold it now, loaded afresh once none does.
// Throws ScenarioError and records the message as the platform's last error.
std::shared_ptr<const Scenario> acquireScenario();

// The built-in street, as scenario JSON.
extern const char* const kDefaultScenario;

// The platform's last error (see lodestack/platform/HostPlatform.h).
void setLastError(const std::string& message);

}  // namespace host
}  // namespace platform
}  // namespace lodestack

#endif  // LODESTACK_SRC_PLATFORM_HOST_SCENARIO_H
