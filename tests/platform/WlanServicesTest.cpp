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

TEST_P(WlanServices, WpaSupplicantScansAndFallsBackToItsListWhenRefused) {
  auto wpa = startWpaSupplicant(bus);
  ASSERT_EQ(wpa->error(), "");
  ASSERT_EQ(setUpWpaSupplicant(*wpa, kScanThenScanDone,
                               {"{'BSSID': <[byte 0x00, 0x1a, 0x2b, 0x3c, 0x4d, 0x5e]>, "
                                "'SSID': <b'office'>, 'Signal': <int16 -51>}",
                                "{'BSSID': <[byte 0x00, 0x1a, 0x2b, 0x3c, 0x4d, 0x5f]>}"}),
            "");
  ASSERT_TRUE(openWith("wpa_supplicant", nullptr, kWlan)) << platform::lastError();

  Delivery d = requestAndWait(kWlan);
  ASSERT_EQ(d.status, Ok) << platform::lastError();
  std::vector<SharedPointer<WlanMeasurement>> aps = accessPoints(d);
  ASSERT_EQ(aps.size(), 2u);
  EXPECT_EQ(aps[0]->dn()->bssid(), 0x001A2BFFFF3C4D5Eull);
  EXPECT_EQ(aps[0]->wlanApMeasurement()->rxLevel(), -51);
  EXPECT_FALSE(aps[0]->wlanApMeasurement()->valueExists(WlanApMeasurement::Rssi));
  EXPECT_EQ(aps[1]->dn()->bssid(), 0x001A2BFFFF3C4D5Full);
  EXPECT_FALSE(aps[1]->wlanApMeasurement()->valueExists(WlanApMeasurement::RxLevel))
      << "no Signal: left unset";

  // Without permission to scan, the list wpa_supplicant has, well before
  // the WLAN time-out.
  ASSERT_EQ(replaceWpaScan(*wpa, kAccessDenied), "");
  d = requestAndWait(kWlan, 5.0);
  EXPECT_EQ(d.status, Ok) << platform::lastError();
  EXPECT_EQ(accessPoints(d).size(), 2u);
}

TEST_P(WlanServices, NetworkManagerScansWirelessDevicesOnly) {
  auto nm = startNetworkManager(bus);
  ASSERT_EQ(nm->error(), "");
  ASSERT_EQ(nm->mock("/org/freedesktop/NetworkManager", "AddEthernetDevice", "(ssu)",
                     "('eth0', 'eth0', 100)"),
            "");
  ASSERT_EQ(setUpNetworkManager(*nm, {{"ap1", "00:1A:2B:3C:4D:5E", 77},
                                      {"ap2", "0a:0b:0c:0d:0e:0f", 140}}),
            "");
  ASSERT_TRUE(openWith("networkmanager", nullptr, kWlan)) << platform::lastError();

  for (int round = 0; round < 2; ++round) {  // LastScan moves on each time
    const Delivery d = requestAndWait(kWlan);
    ASSERT_EQ(d.status, Ok) << platform::lastError();
    std::vector<SharedPointer<WlanMeasurement>> aps = accessPoints(d);
    ASSERT_EQ(aps.size(), 2u);
    EXPECT_EQ(aps[0]->dn()->bssid(), 0x001A2BFFFF3C4D5Eull);
    EXPECT_EQ(aps[0]->wlanApMeasurement()->rssi(), 77);
    EXPECT_FALSE(aps[0]->wlanApMeasurement()->valueExists(WlanApMeasurement::RxLevel))
        << "NetworkManager gives no dBm";
    EXPECT_EQ(aps[1]->dn()->bssid(), 0x0A0B0CFFFF0D0E0Full);
    EXPECT_EQ(aps[1]->wlanApMeasurement()->rssi(), 100) << "a percentage";
  }
}

TEST_P(WlanServices, AutoTakesWpaSupplicantThenNetworkManager) {
  auto wpa = startWpaSupplicant(bus);
  auto nm = startNetworkManager(bus);
  ASSERT_EQ(wpa->error() + nm->error(), "");
  ASSERT_EQ(setUpWpaSupplicant(*wpa, kScanThenScanDone,
                               {"{'BSSID': <[byte 1, 2, 3, 4, 5, 6]>, 'Signal': <int16 -60>}"}),
            "");
  ASSERT_EQ(setUpNetworkManager(*nm, {{"ap1", "06:05:04:03:02:01", 50}}), "");
  ASSERT_TRUE(openWith("auto", nullptr, kWlan)) << platform::lastError();

  std::vector<SharedPointer<WlanMeasurement>> aps = accessPoints(requestAndWait(kWlan));
  ASSERT_EQ(aps.size(), 1u);
  EXPECT_EQ(aps[0]->dn()->bssid(), 0x010203FFFF040506ull) << "wpa_supplicant first";

  wpa->stop();
  aps = accessPoints(requestAndWait(kWlan));
  ASSERT_EQ(aps.size(), 1u) << platform::lastError();
  EXPECT_EQ(aps[0]->dn()->bssid(), 0x060504FFFF030201ull) << "then NetworkManager";

  nm->stop();
  letWatchesSettle();
  unsigned int id = 99;
  EXPECT_EQ(request(kWlan, id), Failed) << "known to be absent: fails at once";
  EXPECT_EQ(platform::lastError(),
            "no WLAN source: neither wpa_supplicant (fi.w1.wpa_supplicant1) nor NetworkManager "
            "(org.freedesktop.NetworkManager) is on the system bus");
}

LODESTACK_ON_BOTH_LOOPS(WlanServices);

// Time-outs take the engine's 10 s: one dispatcher kind is enough.
using WlanServiceFailures = BusServiceFixture;

TEST_P(WlanServiceFailures, MalformedAnswersEndInTheTimeOut) {
  auto nm = startNetworkManager(bus);
  ASSERT_EQ(nm->error(), "");
  ASSERT_EQ(setUpNetworkManager(*nm, {{"ap1", "00:1A:2B:3C:4D:5E", 77}}), "");
  const std::string ap = "/org/freedesktop/NetworkManager/AccessPoint/ap1";
  ASSERT_EQ(nm->call(ap, "org.freedesktop.DBus.Properties", "Set", "(ssv)",
                     "('org.freedesktop.NetworkManager.AccessPoint', 'Strength', <'strong'>)"),
            "");
  ASSERT_TRUE(openWith("networkmanager", nullptr, kWlan));
  EXPECT_EQ(requestUntilTimedOut(kWlan), Timeout);
  EXPECT_EQ(platform::lastError(),
            "NetworkManager: access point " + ap + ": Strength has type s, expected y");
}

INSTANTIATE_TEST_SUITE_P(Loops, WlanServiceFailures,
                         ::testing::Values(core::AsyncCallDispatcher::MainLoopPoll), loopName);

}  // namespace
}  // namespace testing
}  // namespace lodestack
