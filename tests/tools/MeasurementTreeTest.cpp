// The measurement tree both printers render, and its text form.
#include <gtest/gtest.h>

#include <lodestack/lodestack.h>

#include "MeasurementTree.h"
#include "TextPrinter.h"
#include "schema/SampleRecords.h"

namespace lodestack {
namespace scan {
namespace {

using gom::GenericObject;
using gom::SharedPointer;
using namespace schema;

std::vector<std::string> keysOf(const Json& object) {
  std::vector<std::string> keys;
  for (const auto& member : object.items()) keys.push_back(member.key());
  return keys;
}

using Keys = std::vector<std::string>;

SharedPointer<GenericObject> wlanMeasurement(std::vector<unsigned char> bssid, signed char rxLevel) {
  SharedPointer<WlanDn> dn = WlanDn::create();
  EXPECT_EQ(Ok, dn->setBssid(bssid.data(), static_cast<unsigned int>(bssid.size())));
  SharedPointer<WlanMeasurement> m = WlanMeasurement::create(dn, 1700000000u);
  SharedPointer<WlanApMeasurement> ap = WlanApMeasurement::create();
  (void)ap->setRxLevel(rxLevel);
  m->setWlanApMeasurement(ap);
  return m->wrappedObject();
}

TEST(MeasurementTree, CellsShowEveryPresentValueByItsSchemaName) {
  const Json tree = measurementTree(sample::fullContainer()->wrappedObject());
  EXPECT_EQ(Keys({"geran", "utraFdd", "utraTdd", "eutra", "cdma", "wlan", "gnss"}), keysOf(tree));

  const Json& geran = tree["geran"][0];
  EXPECT_EQ(Keys({"mcc", "mnc", "lac", "cid", "timeStamp", "servingCellMeasurement",
                  "nwMeasurements"}),
            keysOf(geran));
  EXPECT_EQ("2023-11-14T22:13:20Z", geran["timeStamp"]);
  // The serving cell's own values and those of the network measurement it
  // holds, together.
  EXPECT_EQ(Keys({"timingAdvance", "frequency", "frequencyInfo", "lac", "cid", "rxLevel"}),
            keysOf(geran["servingCellMeasurement"]));
  ASSERT_EQ(3u, geran["nwMeasurements"].size());
  EXPECT_EQ(Keys({"frequencyInfo", "lac", "cid", "rxLevel"}), keysOf(geran["nwMeasurements"][2]));
  EXPECT_EQ(Keys({"bsic", "arfcn"}), keysOf(geran["nwMeasurements"][0]["frequencyInfo"]));

  const Json& fdd = tree["utraFdd"][0];
  EXPECT_EQ(Keys({"mcc", "mnc", "ucid", "timeStamp", "unreliableStateTimeStamp",
                  "servingCellMeasurement", "nwMeasurements"}),
            keysOf(fdd));
  EXPECT_EQ("2023-11-14T22:13:10Z", fdd["unreliableStateTimeStamp"]);
  EXPECT_EQ(Keys({"frequencyInfo", "uarfcnUl", "utraCarrierRssi", "ucid", "ecNo", "rscp",
                  "pathloss"}),
            keysOf(fdd["nwMeasurements"][0]));
  EXPECT_EQ(Keys({"uarfcnDl", "pcpich"}), keysOf(fdd["nwMeasurements"][0]["frequencyInfo"]));

  EXPECT_EQ(Keys({"mcc", "mnc", "ucid", "timeStamp", "servingCellMeasurement", "nwMeasurements"}),
            keysOf(tree["eutra"][0]));
  EXPECT_EQ(Keys({"timingAdvance", "frequencyInfo", "tac", "rsrp", "rsrq", "ucid"}),
            keysOf(tree["eutra"][0]["servingCellMeasurement"]));
  EXPECT_EQ(Keys({"sid", "nid", "bsid", "timeStamp", "servingCellMeasurement", "nwMeasurements"}),
            keysOf(tree["cdma"][0]));
  EXPECT_EQ(Json::object(), tree["cdma"][0]["nwMeasurements"][0]["frequencyInfo"]);
  EXPECT_EQ(Keys({"timeStamp"}), keysOf(tree["gnss"][0]));
}

TEST(MeasurementTree, WlanAndGnssValuesInReadableForm) {
  SharedPointer<MeasurementContainer> c = MeasurementContainer::create();
  ASSERT_EQ(Ok, c->addWlanMeasurement(wlanMeasurement({0x00, 0x1A, 0x2B, 0x3C, 0x4D, 0xEF}, -61)));
  SharedPointer<GenericObject> eightBytes =
      wlanMeasurement({0x01, 0x02, 0x03, 0x04, 0x05, 0x06, 0xA7, 0xB8}, -90);
  SharedPointer<WlanApMeasurement> located = WlanApMeasurement::create();
  (void)located->setApLatitude(Utility::latitude(60.1699));
  (void)located->setApLongitude(Utility::longitude(-24.5));
  WlanMeasurement::create(eightBytes)->setWlanApMeasurement(located);
  ASSERT_EQ(Ok, c->addWlanMeasurement(eightBytes));

  SharedPointer<PositionEstimate> fix = PositionEstimate::create(60.1699, 24.9384, 12.3, 1700000000u);
  ASSERT_EQ(Ok, fix->setSpeed(36 / 3.6));
  ASSERT_EQ(Ok, c->addGnssMeasurement(GnssMeasurement::create(*fix)->wrappedObject()));

  const Json tree = measurementTree(c->wrappedObject());
  EXPECT_EQ(Json::parse(R"({"bssid": "00:1a:2b:3c:4d:ef", "timeStamp": "2023-11-14T22:13:20Z",
                            "rxLevel": -61})"),
            tree["wlan"][0]);
  EXPECT_EQ(Json::parse(R"({"bssid": "01:02:03:04:05:06:a7:b8", "timeStamp": "2023-11-14T22:13:20Z",
                            "apLatitude": 60.1699, "apLongitude": -24.5})"),
            tree["wlan"][1]);
  // Degrees to 7 decimals, the float uncertainty as written, speed in m/s.
  EXPECT_EQ(Json::parse(R"({"timeStamp": "2023-11-14T22:13:20Z", "latitude": 60.1699,
                            "longitude": 24.9384, "horizontalCepUncertainty": 12.3,
                            "speed": 10.0})"),
            tree["gnss"][0]);
}

TEST(MeasurementTree, ResultTreeAndItsTextLeaveAbsentValuesOut) {
  Result timeout{IMeasurementsObserver::Wlan, 7, Timeout, nullptr};
  EXPECT_EQ(Json::parse(R"({"kind": "wlan", "requestId": 7, "status": "Timeout",
                            "measurements": null})"),
            resultTree(timeout));
  EXPECT_EQ("wlan request 7: Timeout\n", resultText(resultTree(timeout)));
  EXPECT_EQ(Json::object(), measurementTree(MeasurementContainer::create()->wrappedObject()));

  // A GSM cell of which the country, the cell id, a timing advance of 0 and
  // a neighbour are known.
  SharedPointer<GeranCellDn> dn = GeranCellDn::create();
  (void)dn->setMcc(244);
  (void)dn->setCid(21001);
  SharedPointer<GeranCellMeasurement> cell = GeranCellMeasurement::create();
  cell->setDn(dn);
  SharedPointer<GeranServingCellMeasurement> serving = GeranServingCellMeasurement::create();
  (void)serving->setTimingAdvance(0);
  cell->setServingCellMeasurement(serving);
  SharedPointer<GeranNwMeasurement> neighbour =
      GeranNwMeasurement::create(GeranFrequencyInfo::create(12, 62));
  (void)neighbour->setRxLevel(20);
  ASSERT_EQ(Ok, cell->addNwMeasurement(neighbour));
  SharedPointer<MeasurementContainer> c = MeasurementContainer::create();
  ASSERT_EQ(Ok, c->addGeranMeasurement(cell->wrappedObject()));
  ASSERT_EQ(Ok, c->addWlanMeasurement(wlanMeasurement({1, 2, 3, 4, 5, 6}, -61)));
  const Result result{IMeasurementsObserver::Cellular, 1, UnreliableMeasurement, c->wrappedObject()};
  const Json tree = resultTree(result);
  EXPECT_EQ(Json::parse(R"([{"mcc": 244, "cid": 21001, "servingCellMeasurement": {"timingAdvance": 0},
                             "nwMeasurements": [{"frequencyInfo": {"bsic": 12, "arfcn": 62},
                                                 "rxLevel": 20}]}])"),
            tree["measurements"]["geran"]);
  EXPECT_EQ(
      "cellular request 1: UnreliableMeasurement\n"
      "  geran[0]:\n"
      "    mcc: 244\n"
      "    cid: 21001\n"
      "    servingCellMeasurement: timingAdvance 0\n"
      "    nwMeasurements[0]: frequencyInfo (bsic 12, arfcn 62), rxLevel 20\n"
      "  wlan[0]: bssid 01:02:03:04:05:06, timeStamp 2023-11-14T22:13:20Z, rxLevel -61\n",
      resultText(tree));

  // An object that is no measurement container cannot be walked.
  const Result foreign{IMeasurementsObserver::Cellular, 1, Ok, GenericObject::create(20)};
  EXPECT_THROW(resultTree(foreign), Status);
}

}  // namespace
}  // namespace scan
}  // namespace lodestack
