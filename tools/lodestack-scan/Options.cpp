#include "Options.h"

#include <climits>
#include <cstdlib>
#include <cstring>
#include <vector>

#include <CLI/CLI.hpp>

namespace lodestack {
namespace scan {
namespace {

const char kEnvironment[] =
    "Environment: LODESTACK_SCENARIO=FILE, LODESTACK_GNSS=scenario|gpsd[:HOST[:PORT]],\n"
    "LODESTACK_WLAN=scenario|wpa_supplicant|networkmanager|auto,\n"
    "LODESTACK_CELLS=scenario|modemmanager and LODESTACK_GEOLOCATION_KEY=KEY are used when\n"
    "--scenario, --gnss, --wlan, --cells and --locate-key are not given.\n"
    "Exit status: 0 done, 1 failure (platform, files, output), 2 bad command line,\n"
    "130 interrupted (SIGINT), 143 terminated (SIGTERM).";

// A whole number from 0 to INT_MAX, in decimal digits.
std::string checkCount(const std::string& value) {
  const bool digits = !value.empty() && value.size() <= 10 &&
                      value.find_first_not_of("0123456789") == std::string::npos;
  if (digits && std::strtoll(value.c_str(), nullptr, 10) <= INT_MAX) return std::string();
  return "'" + value + "' is not a whole number of 0 or more";
}

// A number of seconds above 0, up to an hour.
std::string checkSeconds(const std::string& value) {
  char* end = nullptr;
  const double seconds = std::strtod(value.c_str(), &end);
  if (!value.empty() && *end == '\0' && seconds > 0 && seconds <= 3600) return std::string();
  return "'" + value + "' is not a number of seconds above 0 and up to 3600";
}

std::string checkServiceUrl(const std::string& value) {
  for (const char* scheme : {"http://", "https://"}) {
    if (value.compare(0, std::strlen(scheme), scheme) == 0 && value.size() > std::strlen(scheme)) {
      return std::string();
    }
  }
  return "'" + value + "' is not an http:// or https:// URL";
}

int kindBit(const std::string& name) {
  if (name == "cellular") return IMeasurementsObserver::Cellular;
  if (name == "wlan") return IMeasurementsObserver::Wlan;
  return IMeasurementsObserver::Gnss;
}

}  // namespace

bool validGnssSource(const std::string& value) {
  if (value == "scenario" || value == "gpsd") return true;
  if (value.compare(0, 5, "gpsd:") != 0) return false;
  const std::string hostPort = value.substr(5);
  const std::size_t colon = hostPort.find(':');
  if (colon == 0 || hostPort.empty()) return false;  // no host
  if (colon == std::string::npos) return true;
  const std::string port = hostPort.substr(colon + 1);
  if (port.empty() || port.size() > 5 || port.find_first_not_of("0123456789") != std::string::npos) {
    return false;
  }
  const long number = std::strtol(port.c_str(), nullptr, 10);
  return number >= 1 && number <= 65535;
}

int parseOptions(int argc, const char* const* argv, Options& options, std::ostream& out,
                 std::ostream& err) {
  CLI::App app("Requests cellular and WLAN measurements from lodestack round by round and "
               "prints every result as it arrives, GNSS fixes included.",
               "lodestack-scan");
  app.footer(kEnvironment);
  app.set_version_flag("--version", "lodestack-scan " LODESTACK_VERSION);

  std::vector<std::string> kinds = {"cellular", "wlan", "gnss"};
  app.add_option("--scenario", options.scenario, "Scenario file to replay (JSON)")
      ->type_name("FILE");
  app.add_option("--kinds", kinds, "Kinds of measurement, comma-separated")
      ->type_name("KINDS")
      ->delimiter(',')
      ->check(CLI::IsMember({"cellular", "wlan", "gnss"}))
      ->default_str("cellular,wlan,gnss");
  app.add_option("--rounds", options.rounds, "Rounds of requests; 0 runs until interrupted")
      ->type_name("N")
      ->check(checkCount, "")
      ->capture_default_str();
  app.add_option("--interval", options.intervalMs, "Milliseconds between rounds")
      ->type_name("MS")
      ->check(checkCount, "")
      ->capture_default_str();
  app.add_option("--gnss", options.gnss, "Source of GNSS fixes: scenario|gpsd[:HOST[:PORT]]")
      ->type_name("SOURCE")
      ->check([](const std::string& v) {
        return validGnssSource(v) ? std::string()
                                  : "'" + v + "' is not scenario or gpsd[:HOST[:PORT]]";
      }, "");
  app.add_option("--wlan", options.wlan,
                 "Source of WLAN scans: the scenario or a service of the system bus "
                 "(auto: wpa_supplicant, else NetworkManager)")
      ->type_name("SOURCE")
      ->check(CLI::IsMember({"scenario", "wpa_supplicant", "networkmanager", "auto"}));
  app.add_option("--cells", options.cells,
                 "Source of cellular measurements: the scenario or ModemManager")
      ->type_name("SOURCE")
      ->check(CLI::IsMember({"scenario", "modemmanager"}));
  CLI::Option* outFile =
      app.add_option("--out", options.out, "Append every result to this results file")
          ->type_name("FILE");
  app.add_option("--encrypt", options.store,
                 "Encrypt the results file with the key of this store (made on first use)")
      ->type_name("STORE")
      ->needs(outFile);
  app.add_option("--log-config", options.logConfig,
                 "Debug log configuration: what the library logs, per component, and where")
      ->type_name("FILE");
  CLI::Option* json = app.add_flag("--json", options.json, "One JSON object per result and line");
  app.add_flag("--geolocation-request", options.geolocation,
               "One geolocation web-service request (JSON) per round instead of the results")
      ->excludes(json);

  app.add_option("--locate", options.locateUrl,
                 "Post each round's geolocation request to this service and print its position")
      ->type_name("URL")
      ->check(checkServiceUrl, "");
  app.add_option("--locate-key", options.locateKey, "Key for the service (added as key=KEY)")
      ->type_name("KEY");
  app.add_option("--locate-timeout", options.locateTimeoutS,
                 "Seconds to wait for the service's answer")
      ->type_name("SECONDS")
      ->check(checkSeconds, "")
      ->capture_default_str();

  CLI::App* decode = app.add_subcommand("decode", "Print a results file written by --out");
  decode->add_option("FILE", options.decodePath, "Results file")->type_name("FILE")->required();
  decode->add_flag("--json", options.json, "One JSON object per result and line");
  decode->add_option("--decrypt", options.store, "Decrypt with the key of this store")
      ->type_name("STORE");
  app.require_subcommand(0, 1);

  try {
    app.parse(argc, argv);
  } catch (const CLI::Success& e) {
    return app.exit(e, out, err);
  } catch (const CLI::ParseError& e) {
    err << "lodestack-scan: " << e.what() << "\n";
    return ExitUsage;
  }
  options.decode = decode->parsed();
  const char* key = std::getenv("LODESTACK_GEOLOCATION_KEY");
  if (options.locateKey.empty() && key) options.locateKey = key;
  options.kinds = 0;
  for (const std::string& kind : kinds) options.kinds |= kindBit(kind);
  if (options.kinds == 0) {
    err << "lodestack-scan: --kinds: name at least one of cellular, wlan, gnss\n";
    return ExitUsage;
  }
  return -1;
}

}  // namespace scan
}  // namespace lodestack
