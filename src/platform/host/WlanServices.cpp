// WLAN scans from wpa_supplicant or NetworkManager.
//
// wpa_supplicant (fi.w1.wpa_supplicant1): every interface of its
// Interfaces property is asked to Scan ({"Type": "active"}); once each has
// sent ScanDone (or refused the scan, often for lack of permission: then
// the BSS list it already has is taken), every object of its BSSs property
// becomes an access point: BSSID (ay, 6 bytes) the BSSID, Signal (n, dBm)
// the received level, SSID (ay) the network name.
//
// NetworkManager (org.freedesktop.NetworkManager): every device of
// GetDevices whose DeviceType is 2 (Wi-Fi) is asked to RequestScan; once
// its LastScan property has changed (or at once, when the scan is refused
// or the device has no LastScan), every object of GetAllAccessPoints
// becomes an access point: HwAddress (s, "AA:BB:CC:DD:EE:FF") the BSSID,
// Strength (y, percent) the RSSI, Ssid (ay) the network name.
// NetworkManager publishes no dBm, so the received level stays unset.
//
// Access points that vanish between the list and the reading of their
// properties are left out; a BSSID that is not 6 bytes, or any value of
// another type than documented, fails the measurement.
#include <algorithm>
#include <cctype>
#include <ctime>

#include "lodestack/debug/Debug.h"
#include "platform/host/ServiceSource.h"

namespace lodestack {
namespace platform {
namespace host {

namespace {

const BusService kWpaSupplicant{"wpa_supplicant", "fi.w1.wpa_supplicant1"};
const BusService kNetworkManager{"NetworkManager", "org.freedesktop.NetworkManager"};

const char* const kWpaInterface = "fi.w1.wpa_supplicant1.Interface";
const char* const kNmWireless = "org.freedesktop.NetworkManager.Device.Wireless";
const unsigned int kNmDeviceTypeWifi = 2;

// Longer than the engine's WLAN time-out, which normally ends the wait.
const int kScanLimitMs = 30000;

std::shared_ptr<OxelElementWLAN> accessPoint(const Dictionary& properties,
                                             const std::vector<unsigned char>& bssid,
                                             const std::optional<std::vector<unsigned char>>& ssid) {
  if (bssid.size() != 6)
    properties.fail("BSSID of " + std::to_string(bssid.size()) + " bytes, expected 6");
  auto ap = std::make_shared<OxelElementWLAN>();
  ap->mac().setBytes(bssid.data(), 6);
  if (ssid) ap->setSsid(std::string(ssid->begin(), ssid->end()));
  ap->setTimestamp(static_cast<unsigned int>(std::time(nullptr)));
  return ap;
}

// "AA:BB:CC:DD:EE:FF" as 6 bytes; empty when it is not one.
std::vector<unsigned char> parseHardwareAddress(const std::string& text) {
  std::vector<unsigned char> bytes;
  if (text.size() != 17) return bytes;
  for (std::size_t i = 0; i < 17; i += 3) {
    if ((i + 2 < 17 && text[i + 2] != ':') || !std::isxdigit(static_cast<unsigned char>(text[i])) ||
        !std::isxdigit(static_cast<unsigned char>(text[i + 1])))
      return std::vector<unsigned char>();
    bytes.push_back(static_cast<unsigned char>(std::stoul(text.substr(i, 2), nullptr, 16)));
  }
  return bytes;
}

void logScanRefused(const BusFailure& refusal, const char* fallback) {
  Debug::log(Debug::Level1, gRadioAdaptationComponentName, "%s; %s\n", refusal.what(), fallback);
}

std::string objectsWaitedFor(const ObjectPaths& paths) {
  return paths.size() == 1 ? paths.front() : std::to_string(paths.size()) + " objects";
}

class WpaSupplicant : public ServiceProtocol {
 public:
  std::vector<BusService> services() const override { return {kWpaSupplicant}; }

  ServiceAnswer measure(BusSession& bus) override {
    const ObjectPaths interfaces = bus.property<ObjectPaths>(
        kWpaSupplicant, "/fi/w1/wpa_supplicant1", "fi.w1.wpa_supplicant1", "Interfaces");
    if (interfaces.empty()) throw BusFailure("wpa_supplicant: no wireless interface");

    std::vector<char> done(interfaces.size(), false);
    std::vector<std::unique_ptr<BusSubscription>> scanDone;
    for (std::size_t i = 0; i < interfaces.size(); ++i)
      scanDone.push_back(bus.subscribe(kWpaSupplicant, interfaces[i], kWpaInterface, "ScanDone",
                                       [&done, i](GVariant*) { done[i] = true; }));
    for (std::size_t i = 0; i < interfaces.size(); ++i) {
      try {
        bus.call(kWpaSupplicant, interfaces[i], kWpaInterface, "Scan",
                 g_variant_new_parsed("({'Type': <'active'>},)"), "()");
      } catch (const BusFailure& refused) {
        logScanRefused(refused, "taking the BSS list wpa_supplicant has");
        done[i] = true;
      }
    }
    bus.wait(kWpaSupplicant,
             [&done] { return std::all_of(done.begin(), done.end(), [](char d) { return d; }); },
             kScanLimitMs, "ScanDone from " + objectsWaitedFor(interfaces));
    scanDone.clear();

    ServiceAnswer answer;
    for (const std::string& interface : interfaces) {
      for (const std::string& bss :
           bus.property<ObjectPaths>(kWpaSupplicant, interface, kWpaInterface, "BSSs")) {
        Variant all;
        try {
          all = bus.properties(kWpaSupplicant, bss, "fi.w1.wpa_supplicant1.BSS");
        } catch (const BusFailure& failure) {
          if (BusSession::isGone(failure)) continue;  // expired since the list was read
          throw;
        }
        const Dictionary properties(kWpaSupplicant, all.get(), "BSS " + bss);
        const auto bssid = properties.get<std::vector<unsigned char>>("BSSID");
        if (!bssid) properties.fail("no BSSID");
        auto ap = accessPoint(properties, *bssid, properties.get<std::vector<unsigned char>>("SSID"));
        if (auto dbm = properties.get<std::int16_t>("Signal"))
          ap->setPowerRx(static_cast<signed char>(std::clamp<int>(*dbm, -128, 127)));
        answer.result.add(ap);
      }
    }
    return answer;
  }
};

class NetworkManager : public ServiceProtocol {
 public:
  std::vector<BusService> services() const override { return {kNetworkManager}; }

  ServiceAnswer measure(BusSession& bus) override {
    Variant reply = bus.call(kNetworkManager, "/org/freedesktop/NetworkManager",
                             "org.freedesktop.NetworkManager", "GetDevices", nullptr, "(ao)");
    Variant all(g_variant_get_child_value(reply.get(), 0));
    ObjectPaths wireless;
    for (const std::string& device : fromVariant<ObjectPaths>(all.get())) {
      if (bus.property<std::uint32_t>(kNetworkManager, device, "org.freedesktop.NetworkManager.Device",
                                      "DeviceType") == kNmDeviceTypeWifi)
        wireless.push_back(device);
    }
    if (wireless.empty()) throw BusFailure("NetworkManager: no wireless device");

    struct Scan {
      std::optional<std::int64_t> lastScan;  // before the request
      bool done = false;
      std::string malformed;  // a PropertiesChanged of the wrong type
    };
    std::vector<Scan> scans(wireless.size());
    std::vector<std::unique_ptr<BusSubscription>> changes;
    for (std::size_t i = 0; i < wireless.size(); ++i) {
      Variant properties = bus.properties(kNetworkManager, wireless[i], kNmWireless);
      scans[i].lastScan =
          Dictionary(kNetworkManager, properties.get(), "device " + wireless[i]).get<std::int64_t>("LastScan");
      Scan& scan = scans[i];
      const std::string where = "device " + wireless[i];
      changes.push_back(bus.subscribe(
          kNetworkManager, wireless[i], "org.freedesktop.DBus.Properties", "PropertiesChanged",
          [&scan, where](GVariant* parameters) {
            if (!g_variant_is_of_type(parameters, G_VARIANT_TYPE("(sa{sv}as)"))) return;
            Variant changed(g_variant_get_child_value(parameters, 1));
            try {
              auto now = Dictionary(kNetworkManager, changed.get(), where).get<std::int64_t>("LastScan");
              if (now && now != scan.lastScan) scan.done = true;
            } catch (const BusFailure& failure) {  // not across GLib's stack
              scan.malformed = failure.what();
              scan.done = true;
            }
          },
          kNmWireless));
    }
    for (std::size_t i = 0; i < wireless.size(); ++i) {
      try {
        bus.call(kNetworkManager, wireless[i], kNmWireless, "RequestScan",
                 g_variant_new_parsed("(@a{sv} {},)"), "()");
        if (!scans[i].lastScan) scans[i].done = true;  // nothing tells when it ends
      } catch (const BusFailure& refused) {
        logScanRefused(refused, "taking the access points NetworkManager has");
        scans[i].done = true;
      }
    }
    bus.wait(kNetworkManager,
             [&scans] {
               return std::all_of(scans.begin(), scans.end(), [](const Scan& s) { return s.done; });
             },
             kScanLimitMs, "finished scan (LastScan) of " + objectsWaitedFor(wireless));
    changes.clear();
    for (const Scan& scan : scans)
      if (!scan.malformed.empty()) throw BusFailure(scan.malformed);

    ServiceAnswer answer;
    for (const std::string& device : wireless) {
      Variant list = bus.call(kNetworkManager, device, kNmWireless, "GetAllAccessPoints", nullptr,
                              "(ao)");
      Variant paths(g_variant_get_child_value(list.get(), 0));
      for (const std::string& path : fromVariant<ObjectPaths>(paths.get())) {
        Variant all;
        try {
          all = bus.properties(kNetworkManager, path, "org.freedesktop.NetworkManager.AccessPoint");
        } catch (const BusFailure& failure) {
          if (BusSession::isGone(failure)) continue;
          throw;
        }
        const Dictionary properties(kNetworkManager, all.get(), "access point " + path);
        const auto address = properties.get<std::string>("HwAddress");
        if (!address) properties.fail("no HwAddress");
        const std::vector<unsigned char> bssid = parseHardwareAddress(*address);
        if (bssid.empty()) properties.fail("HwAddress \"" + *address + "\" is not a MAC address");
        auto ap = accessPoint(properties, bssid, properties.get<std::vector<unsigned char>>("Ssid"));
        if (auto percent = properties.get<std::uint8_t>("Strength"))
          ap->setRssi(std::min<std::uint8_t>(*percent, 100));
        answer.result.add(ap);
      }
    }
    return answer;
  }
};

class AutoWlan : public ServiceProtocol {
 public:
  std::vector<BusService> services() const override { return {kWpaSupplicant, kNetworkManager}; }

  std::string absentMessage() const override {
    return std::string("no WLAN source: neither wpa_supplicant (") + kWpaSupplicant.busName +
           ") nor NetworkManager (" + kNetworkManager.busName + ") is on the system bus";
  }

  ServiceAnswer measure(BusSession& bus) override {
    try {
      return wpaSupplicant_.measure(bus);
    } catch (const BusFailure& first) {
      try {
        return networkManager_.measure(bus);
      } catch (const BusFailure& second) {
        const std::string absent = "org.freedesktop.DBus.Error.NameHasNoOwner";
        if (first.errorName() == absent && second.errorName() == absent)
          throw BusFailure(absentMessage(), absent);
        throw BusFailure(std::string("no WLAN source answered: ") + first.what() + "; " +
                         second.what());
      }
    }
  }

 private:
  WpaSupplicant wpaSupplicant_;
  NetworkManager networkManager_;
};

}  // namespace

std::unique_ptr<ServiceProtocol> makeWpaSupplicantProtocol() {
  return std::make_unique<WpaSupplicant>();
}
std::unique_ptr<ServiceProtocol> makeNetworkManagerProtocol() {
  return std::make_unique<NetworkManager>();
}
std::unique_ptr<ServiceProtocol> makeAutoWlanProtocol() { return std::make_unique<AutoWlan>(); }

}  // namespace host
}  // namespace platform
}  // namespace lodestack
