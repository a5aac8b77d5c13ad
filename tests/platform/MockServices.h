// The mocked wpa_supplicant, NetworkManager and ModemManager of the bus
// service tests, on a PrivateBus: python3-dbusmock's NetworkManager
// template, and its generic mock set up as wpa_supplicant and ModemManager.
// Each set-up step returns empty, or why it failed.
#ifndef LODESTACK_TESTS_PLATFORM_MOCKSERVICES_H
#define LODESTACK_TESTS_PLATFORM_MOCKSERVICES_H

#include <memory>
#include <string>
#include <vector>

#include "platform/MockBus.h"

namespace lodestack {
namespace testing {

inline std::unique_ptr<MockService> startWpaSupplicant(PrivateBus& bus) {
  return std::make_unique<MockService>(
      bus, "fi.w1.wpa_supplicant1",
      std::vector<std::string>{"fi.w1.wpa_supplicant1", "/fi/w1/wpa_supplicant1",
                               "fi.w1.wpa_supplicant1"});
}

const char* const kWpaInterfacePath = "/fi/w1/wpa_supplicant1/Interfaces/0";

// One interface whose Scan is answered with ScanDone 50 ms later, and its
// BSS objects: the properties of each as GVariant text of an a{sv}.
inline std::string setUpWpaSupplicant(MockService& wpa, const std::vector<std::string>& bssProperties) {
  std::string paths;
  for (std::size_t i = 0; i < bssProperties.size(); ++i)
    paths += std::string(i ? ", " : "") + "'" + kWpaInterfacePath + "/BSSs/" + std::to_string(i) + "'";
  std::string failure = wpa.mock(
      "/fi/w1/wpa_supplicant1", "AddProperties", "(sa{sv})",
      std::string("('fi.w1.wpa_supplicant1', {'Interfaces': <@ao ['") + kWpaInterfacePath + "']>})");
  if (failure.empty())
    failure = wpa.mock(
        "/fi/w1/wpa_supplicant1", "AddObject", "(ssa{sv}a(ssss))",
        std::string("('") + kWpaInterfacePath +
            "', 'fi.w1.wpa_supplicant1.Interface', {'Ifname': <'wlan0'>, 'BSSs': <@ao [" + paths +
            "]>}, [('Scan', 'a{sv}', '', 'from gi.repository import GLib; GLib.timeout_add(50, "
            "lambda s=self: s.EmitSignal(\"fi.w1.wpa_supplicant1.Interface\", \"ScanDone\", "
            "\"b\", [True]) or False)')])");
  for (std::size_t i = 0; failure.empty() && i < bssProperties.size(); ++i)
    failure = wpa.mock("/fi/w1/wpa_supplicant1", "AddObject", "(ssa{sv}a(ssss))",
                       std::string("('") + kWpaInterfacePath + "/BSSs/" + std::to_string(i) +
                           "', 'fi.w1.wpa_supplicant1.BSS', " + bssProperties[i] + ", [])");
  return failure;
}

inline std::unique_ptr<MockService> startNetworkManager(PrivateBus& bus) {
  return std::make_unique<MockService>(bus, "org.freedesktop.NetworkManager",
                                       std::vector<std::string>{"-t", "networkmanager"});
}

const char* const kNmDevicePath = "/org/freedesktop/NetworkManager/Devices/wifi0";

// The template's Wi-Fi device, given the LastScan property and a
// RequestScan that moves it 50 ms later, and its access points: name,
// BSSID and strength each.
struct MockAccessPoint {
  const char* name;
  const char* bssid;
  unsigned int strength;
};
inline std::string setUpNetworkManager(MockService& nm, const std::vector<MockAccessPoint>& aps) {
  std::string failure = nm.mock("/org/freedesktop/NetworkManager", "AddWiFiDevice", "(ssu)",
                                "('wifi0', 'wlan0', 100)");
  for (std::size_t i = 0; failure.empty() && i < aps.size(); ++i)
    failure = nm.mock("/org/freedesktop/NetworkManager", "AddAccessPoint", "(ssssuuuyu)",
                      std::string("('") + kNmDevicePath + "', '" + aps[i].name + "', 'office', '" +
                          aps[i].bssid + "', 2, 2412, 54000, " + std::to_string(aps[i].strength) +
                          ", 1)");
  if (failure.empty())
    failure = nm.mock(kNmDevicePath, "AddProperty", "(ssv)",
                      "('org.freedesktop.NetworkManager.Device.Wireless', 'LastScan', <int64 -1>)");
  if (failure.empty())
    failure = nm.mock(
        kNmDevicePath, "AddMethod", "(sssss)",
        "('org.freedesktop.NetworkManager.Device.Wireless', 'RequestScan', 'a{sv}', '', "
        "'from gi.repository import GLib; GLib.timeout_add(50, lambda s=self: "
        "s.Set(\"org.freedesktop.NetworkManager.Device.Wireless\", \"LastScan\", "
        "dbus.Int64(time.monotonic_ns() // 1000000)) or False)')");
  return failure;
}

// The generic mock as an object manager, as ModemManager is.
inline std::unique_ptr<MockService> startModemManager(PrivateBus& bus) {
  return std::make_unique<MockService>(
      bus, "org.freedesktop.ModemManager1",
      std::vector<std::string>{"-m", "org.freedesktop.ModemManager1", "/org/freedesktop/ModemManager1",
                               "org.freedesktop.ModemManager1"});
}

const char* const kModemPath = "/org/freedesktop/ModemManager1/Modem/0";

// A modem whose GetCellInfo runs `code` (Python setting `ret` to a list of
// dictionaries, raising, or never returning).
inline std::string addModem(MockService& mm, const std::string& code) {
  return mm.mock("/org/freedesktop/ModemManager1", "AddObject", "(ssa{sv}a(ssss))",
                 std::string("('") + kModemPath +
                     "', 'org.freedesktop.ModemManager1.Modem', {'Model': <'mock'>}, "
                     "[('GetCellInfo', '', 'aa{sv}', '" + code + "')])");
}

inline std::string replaceCellInfo(MockService& mm, const std::string& code) {
  return mm.mock(kModemPath, "AddMethod", "(sssss)",
                 "('org.freedesktop.ModemManager1.Modem', 'GetCellInfo', '', 'aa{sv}', '" + code +
                     "')");
}

}  // namespace testing
}  // namespace lodestack

#endif  // LODESTACK_TESTS_PLATFORM_MOCKSERVICES_H
