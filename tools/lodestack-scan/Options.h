// The command line of lodestack-scan.
#ifndef LODESTACK_SCAN_OPTIONS_H
#define LODESTACK_SCAN_OPTIONS_H

#include <ostream>
#include <string>

#include <lodestack/measurements/IMeasurementsObserver.h>

namespace lodestack {
namespace scan {

struct Options {
  // `lodestack-scan decode FILE`: print a results file instead of scanning.
  bool decode = false;
  std::string decodePath;

  std::string scenario;  // empty: LODESTACK_SCENARIO, else the built-in street
  std::string gnss;      // empty: LODESTACK_GNSS, else the scenario's track
  std::string wlan;      // empty: LODESTACK_WLAN, else the scenario
  std::string cells;     // empty: LODESTACK_CELLS, else the scenario
  std::string out;       // results file to append to; empty: none
  std::string store;     // --encrypt / decode --decrypt: the key's store; empty: plain
  std::string logConfig;  // debug log configuration; empty: no log
  int kinds = IMeasurementsObserver::Cellular | IMeasurementsObserver::Wlan |
              IMeasurementsObserver::Gnss;
  int rounds = 3;           // 0: until interrupted
  int intervalMs = 1000;    // pause between rounds
  bool json = false;
  bool geolocation = false;
  // --locate: the geolocation service each round's request is posted to;
  // empty: none. The key is --locate-key, else LODESTACK_GEOLOCATION_KEY.
  std::string locateUrl;
  std::string locateKey;
  double locateTimeoutS = 10;
};

// Exit statuses of the tool.
enum ExitStatus : int {
  ExitOk = 0,
  ExitFailure = 1,  // a file, the platform or the output failed
  ExitUsage = 2     // bad command line
};

// Reads the command line into `options`. -1 when the tool should go on;
// otherwise the exit status: ExitOk after --help or --version (printed on
// `out`), ExitUsage after a bad command line (one line on `err`).
int parseOptions(int argc, const char* const* argv, Options& options, std::ostream& out,
                 std::ostream& err);

// Whether `value` reads "scenario" or "gpsd[:HOST[:PORT]]" (PORT 1-65535).
bool validGnssSource(const std::string& value);

}  // namespace scan
}  // namespace lodestack

#endif  // LODESTACK_SCAN_OPTIONS_H
