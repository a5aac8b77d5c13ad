// WLAN scans from wpa_supplicant and NetworkManager, mocked on a private
// bus, reaching observers through the factory's adaptation and a provider.
#include "platform/BusServiceFixture.h"

namespace lodestack {
namespace testing {
namespace {

using namespace schema;

using WlanServices = BusServiceFixture;

// The access points of a result. A 6-byte BSSID is kept widened to 8
// bytes, FF FF between its halves.
std::vector<SharedPointer<WlanMeasurement>> accessPoints(const Delivery& d) {
  std::vector<SharedPointer<WlanMeasurement>> aps;
  SharedPointer<MeasurementContainer> c = MeasurementContainer::create(d.measurements);
  if (!c || !c->wlanMeasurementCollection()) return aps;
  for (unsigned int i = 0; i < c->wlanMeasurementCollection()->size(); ++i)
    aps.push_back(WlanMeasurement::create(c->wlanMeasurement(i)));
  return aps;
}

// Auto takes wpa_supplicant while it is there, then NetworkManager; once
// neither is, every choice fails at once, naming what it looked for.
TEST_P(WlanServices, EachServiceInTurnThenNone) {
  auto wpa = startWpaSupplicant(bus);
  auto nm = startNetworkManager(bus);
  ASSERT_EQ(wpa->error() + nm->error(), "");
  ASSERT_EQ(setUpWpaSupplicant(*wpa, {"{'BSSID': <[byte 0x00, 0x1a, 0x2b, 0x3c, 0x4d, 0x5e]>, "
                                      "'SSID': <b'office'>, 'Signal': <int16 -51>}",
                                      "{'BSSID': <[byte 0x00, 0x1a, 0x2b, 0x3c, 0x4d, 0x5f]>}"}),
            "");
  ASSERT_EQ(nm->mock("/org/freedesktop/NetworkManager", "AddEthernetDevice", "(ssu)",
                     "('eth0', 'eth0', 100)"),
            "");
  ASSERT_EQ(setUpNetworkManager(*nm, {{"ap1", "06:05:04:03:02:01", 77},
                                      {"ap2", "0a:0b:0c:0d:0e:0f", 140}}),
            "");
  ASSERT_TRUE(openWith("auto", nullptr, kWlan)) << platform::lastError();

  Delivery d = requestAndWait(kWlan);
  ASSERT_EQ(d.status, Ok) << platform::lastError();
  std::vector<SharedPointer<WlanMeasurement>> aps = accessPoints(d);
  ASSERT_EQ(aps.size(), 2u);
  EXPECT_EQ(aps[0]->dn()->bssid(), 0x001A2BFFFF3C4D5Eull) << "wpa_supplicant first";
  EXPECT_EQ(aps[0]->wlanApMeasurement()->rxLevel(), -51);
  EXPECT_FALSE(aps[0]->wlanApMeasurement()->valueExists(WlanApMeasurement::Rssi));
  EXPECT_EQ(aps[1]->dn()->bssid(), 0x001A2BFFFF3C4D5Full);
  EXPECT_FALSE(aps[1]->wlanApMeasurement()->valueExists(WlanApMeasurement::RxLevel))
      << "no Signal: left unset";

  // Without permission to scan, the list wpa_supplicant has, well before
  // the WLAN time-out.
  ASSERT_EQ(wpa->mock(kWpaInterfacePath, "AddMethod", "(sssss)",
                      "('fi.w1.wpa_supplicant1.Interface', 'Scan', 'a{sv}', '', "
                      "'raise dbus.exceptions.DBusException(\"not allowed\", "
                      "name=\"org.freedesktop.DBus.Error.AccessDenied\")')"),
            "");
  d = requestAndWait(kWlan, 5.0);
  EXPECT_EQ(d.status, Ok) << platform::lastError();
  EXPECT_EQ(accessPoints(d).size(), 2u);

  wpa->stop();
  for (int round = 0; round < 2; ++round) {  // LastScan moves on each time
    d = requestAndWait(kWlan);
    ASSERT_EQ(d.status, Ok) << platform::lastError();
    aps = accessPoints(d);
    ASSERT_EQ(aps.size(), 2u) << "the wireless device's only";
    EXPECT_EQ(aps[0]->dn()->bssid(), 0x060504FFFF030201ull) << "then NetworkManager";
    EXPECT_EQ(aps[0]->wlanApMeasurement()->rssi(), 77);
    EXPECT_FALSE(aps[0]->wlanApMeasurement()->valueExists(WlanApMeasurement::RxLevel))
        << "NetworkManager gives no dBm";
    EXPECT_EQ(aps[1]->dn()->bssid(), 0x0A0B0CFFFF0D0E0Full);
    EXPECT_EQ(aps[1]->wlanApMeasurement()->rssi(), 100) << "a percentage";
  }

  nm->stop();
  const std::pair<const char*, const char*> absent[] = {
      {"auto", "no WLAN source: neither wpa_supplicant (fi.w1.wpa_supplicant1) nor NetworkManager "
               "(org.freedesktop.NetworkManager) is on the system bus"},
      {"wpa_supplicant", "wpa_supplicant (fi.w1.wpa_supplicant1) is not on the system bus"},
      {"networkmanager", "NetworkManager (org.freedesktop.NetworkManager) is not on the system bus"}};
  for (const auto& [choice, message] : absent) {
    SCOPED_TRACE(choice);
    provider.reset();  // before the adaptation it uses
    ASSERT_TRUE(openWith(choice, nullptr, kWlan));
    letWatchesSettle();
    unsigned int id = 99;
    EXPECT_EQ(request(kWlan, id), Failed);
    EXPECT_EQ(id, 0u);
    EXPECT_EQ(platform::lastError(), message);
  }
}

LODESTACK_ON_BOTH_LOOPS(WlanServices);

}  // namespace
}  // namespace testing
}  // namespace lodestack
