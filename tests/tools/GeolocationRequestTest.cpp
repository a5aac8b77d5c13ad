// The geolocation web-service request built from a round's results.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include <lodestack/lodestack.h>

#include "GeolocationRequest.h"

namespace lodestack {
namespace scan {
namespace {

using gom::SharedPointer;
using namespace schema;

SharedPointer<UtraFddNwMeasurement> wcdmaNeighbour(unsigned int ucid, signed char rscp) {
  SharedPointer<UtraFddNwMeasurement> n =
      UtraFddNwMeasurement::create(UtraFddFrequencyInfo::create(10700, 100));
  (void)n->setUcid(ucid);
  (void)n->setRscp(rscp);
  return n;
}

TEST(GeolocationRequest, CellTowersFromEachTechnology) {
  SharedPointer<MeasurementContainer> cells = MeasurementContainer::create();

  // A GSM cell without levels, and a neighbour of unknown area at the lowest
  // level.
  SharedPointer<GeranCellMeasurement> gsm =
      GeranCellMeasurement::create(GeranCellDn::create(244, 5, 4100, 21001), 1700000000u);
  SharedPointer<GeranNwMeasurement> neighbour =
      GeranNwMeasurement::create(GeranFrequencyInfo::create(7, 60));
  (void)neighbour->setCid(21003);
  (void)neighbour->setRxLevel(0);
  ASSERT_EQ(Ok, gsm->addNwMeasurement(neighbour));
  ASSERT_EQ(Ok, cells->addGeranMeasurement(gsm->wrappedObject()));

  // The serving cell's RSCP comes from its entry among the cells heard.
  SharedPointer<UtraFddCellMeasurement> wcdma =
      UtraFddCellMeasurement::create(UtraCellDn::create(244, 5, 0x12C0011), 1700000000u);
  SharedPointer<UtraFddServingCellMeasurement> wcdmaServing = UtraFddServingCellMeasurement::create();
  (void)wcdmaServing->setLac(4200);
  wcdma->setServingCellMeasurement(wcdmaServing);
  ASSERT_EQ(Ok, wcdma->addNwMeasurement(wcdmaNeighbour(0x12C0012, -95)));
  ASSERT_EQ(Ok, wcdma->addNwMeasurement(wcdmaNeighbour(0x12C0011, -80)));
  ASSERT_EQ(Ok, wcdma->addNwMeasurement(wcdmaNeighbour(0, -99)));  // id not read: no tower
  ASSERT_EQ(Ok, cells->addUtraFddMeasurement(wcdma->wrappedObject()));

  SharedPointer<EUtraCellMeasurement> lte =
      EUtraCellMeasurement::create(EUtraCellDn::create(244, 5, 0x1234501), 1700000000u);
  SharedPointer<EUtraServingCellMeasurement> lteServing = EUtraServingCellMeasurement::create();
  (void)lteServing->setTimingAdvance(12);
  SharedPointer<EUtraNwMeasurement> lteNw = EUtraNwMeasurement::create();
  (void)lteNw->setTac(300);
  (void)lteServing->setNwMeasurement(lteNw);
  lte->setServingCellMeasurement(lteServing);
  ASSERT_EQ(Ok, cells->addEUtraMeasurement(lte->wrappedObject()));

  // A GSM cell without a cell id gives nothing.
  SharedPointer<GeranCellDn> anonymous = GeranCellDn::create();
  (void)anonymous->setMcc(244);
  ASSERT_EQ(Ok, cells->addGeranMeasurement(
                    GeranCellMeasurement::create(anonymous, 1700000000u)->wrappedObject()));

  EXPECT_EQ(Json::parse(R"({"cellTowers": [
      {"radioType": "gsm", "mobileCountryCode": 244, "mobileNetworkCode": 5,
       "locationAreaCode": 4100, "cellId": 21001},
      {"radioType": "gsm", "mobileCountryCode": 244, "mobileNetworkCode": 5,
       "cellId": 21003, "signalStrength": -110},
      {"radioType": "wcdma", "mobileCountryCode": 244, "mobileNetworkCode": 5,
       "locationAreaCode": 4200, "cellId": 19660817, "signalStrength": -80},
      {"radioType": "wcdma", "mobileCountryCode": 244, "mobileNetworkCode": 5,
       "cellId": 19660818, "signalStrength": -95},
      {"radioType": "lte", "mobileCountryCode": 244, "mobileNetworkCode": 5,
       "locationAreaCode": 300, "cellId": 19088641, "timingAdvance": 12}],
      "wifiAccessPoints": []})"),
            geolocationRequest(cells, nullptr));
}

// An access point named `ssid` when it is not empty, heard at `level` dBm
// when it is not 0.
gom::SharedPointer<gom::GenericObject> accessPoint(const std::vector<unsigned char>& bssid,
                                                   const std::string& ssid, signed char level) {
  SharedPointer<WlanDn> dn = WlanDn::create();
  EXPECT_EQ(Ok, dn->setBssid(bssid.data(), static_cast<unsigned int>(bssid.size())));
  if (!ssid.empty()) {
    const SharedPointer<gom::CharacterData> name =
        gom::CharacterData::create(ssid.data(), static_cast<unsigned int>(ssid.size()));
    EXPECT_EQ(Ok, dn->extension()->setStringProperty(radioadaptation::ConverterOxel::kSsidProperty,
                                                     name));
  }
  SharedPointer<WlanMeasurement> m = WlanMeasurement::create(dn, 1700000000u);
  if (level) {
    SharedPointer<WlanApMeasurement> ap = WlanApMeasurement::create();
    (void)ap->setRxLevel(level);
    m->setWlanApMeasurement(ap);
  }
  return m->wrappedObject();
}

TEST(GeolocationRequest, AccessPointsLessTheOptedOutAndThoseWithoutAMacAddress) {
  struct Case {
    std::vector<unsigned char> bssid;
    const char* ssid;
    signed char level;
    bool sent;
  };
  const Case cases[] = {
      {{0x00, 0x1A, 0x2B, 0x00, 0x00, 0x01}, "home", -60, true},
      {{0x00, 0x1A, 0x2B, 0x00, 0x00, 0x02}, "cafe_nomap", -60, false},
      {{0x00, 0x1A, 0x2B, 0x00, 0x00, 0x03}, "_nomap", -60, false},
      {{0x00, 0x1A, 0x2B, 0x00, 0x00, 0x04}, "_nomap_guest", -60, true},  // not at the end
      {{0x00, 0x1A, 0x2B, 0x00, 0x00, 0x05}, "", -67, true},              // name unknown
      {{0x00, 0x1A, 0x2B, 0x00, 0x00, 0x06}, "", 0, true},                // level unknown
      {{0x02, 0x1A, 0x2B, 0x00, 0x00, 0x07}, "", -60, false},             // locally administered
      {{0xDE, 0x1A, 0x2B, 0x00, 0x00, 0x08}, "hotspot", -60, false},      // 0xDE has the bit too
      {{0xFC, 0x1A, 0x2B, 0x00, 0x00, 0x09}, "shop", -60, true},          // 0xFC has not
      {{0x00, 0x1A, 0x2B, 0x3C, 0x4D, 0x5E, 0x6F, 0x70}, "", -60, false}, // no MAC address
  };
  SharedPointer<MeasurementContainer> aps = MeasurementContainer::create();
  Json expected = Json::array();
  for (const Case& c : cases) {
    ASSERT_EQ(Ok, aps->addWlanMeasurement(accessPoint(c.bssid, c.ssid, c.level)));
    if (!c.sent) continue;
    expected.push_back({{"macAddress", bssidText(c.bssid.data(), 6)}});
    if (c.level) expected.back()["signalStrength"] = c.level;
  }
  const Json request = geolocationRequest(nullptr, aps);
  EXPECT_EQ(expected, request["wifiAccessPoints"]);
  EXPECT_EQ(Json::array(), request["cellTowers"]);
}

TEST(GeolocationRequest, WithoutACellTwoAccessPointsAreNeeded) {
  const auto request = [](std::size_t towers, std::size_t aps) {
    return Json{{"cellTowers", std::vector<Json>(towers, {{"radioType", "gsm"}, {"cellId", 1}})},
                {"wifiAccessPoints", std::vector<Json>(aps, {{"macAddress", "00:1a:2b:3c:4d:5e"}})}};
  };
  const char* why = "no request sent: fewer than two access points and no cell";
  EXPECT_EQ(why, whyNotLocatable(geolocationRequest(nullptr, nullptr)));
  EXPECT_EQ(why, whyNotLocatable(request(0, 1)));
  EXPECT_EQ("", whyNotLocatable(request(0, 2)));
  EXPECT_EQ("", whyNotLocatable(request(1, 0)));
}

}  // namespace
}  // namespace scan
}  // namespace lodestack
