// The Linux adaptation end to end: factory, provider and observers on a real
// dispatcher, with the host platform replaying the sample scenarios of
// data/scenarios.
#include <cstdlib>
#include <fstream>

#include "radioadaptation/TestPlatform.h"

namespace lodestack {
namespace testing {
namespace {

using namespace schema;
using radioadaptation::FreeGnssListener;
using radioadaptation::IRadioAdaptation;
using radioadaptation::RadioAdaptationFactory;

std::string scenario(const std::string& name) {
  return std::string(LODESTACK_SCENARIO_DIR) + "/" + name + ".json";
}

// The adaptation and provider of one scenario, on the test thread.
class Adaptation : public AdaptationFixture {
 protected:
  bool open(const std::string& name, int kinds) {
    // Read again when GNSS is first subscribed: kept for the test.
    setenv("LODESTACK_SCENARIO", name.c_str(), 1);
    return AdaptationFixture::open(kinds);
  }
  void TearDown() override {
    AdaptationFixture::TearDown();
    unsetenv("LODESTACK_SCENARIO");
  }
};

TEST_P(Adaptation, EveryTechnologyIsConvertedWithItsFieldsAndGaps) {
  ASSERT_TRUE(open(scenario("all-technologies"), kCellular | kWlan));
  const Delivery cellular = requestAndWait(kCellular);
  ASSERT_EQ(cellular.status, Ok);
  SharedPointer<MeasurementContainer> c = MeasurementContainer::create(cellular.measurements);
  ASSERT_TRUE(c);

  // GERAN: the element's time, identity, serving values and neighbours; the
  // second GSM cell lacks what positioning needs only in its serving values.
  ASSERT_EQ(c->geranMeasurementCollection()->size(), 2u);
  SharedPointer<GeranCellMeasurement> gsm = GeranCellMeasurement::create(c->geranMeasurement(0));
  EXPECT_EQ(gsm->timeStamp(), 1700000000u);
  EXPECT_EQ(*gsm->dn(), GeranCellDn(244, 91, 4660, 23456));
  EXPECT_EQ(gsm->servingCellMeasurement()->rxLevel(), 40);
  EXPECT_EQ(gsm->servingCellMeasurement()->timingAdvance(), 3);
  ASSERT_EQ(gsm->nwMeasurementCollection()->size(), 2u);
  SharedPointer<gom::ObjectBase> record;
  ASSERT_EQ(gsm->nwMeasurementCollection()->item(1)->getObjectValue(record), Ok);
  SharedPointer<GeranNwMeasurement> bare = SharedPointer<GeranNwMeasurement>::cast(record);
  EXPECT_EQ(*bare->frequencyInfo(), GeranFrequencyInfo(21, 95));
  EXPECT_FALSE(bare->valueExists(2) || bare->valueExists(4) || bare->valueExists(8));
  SharedPointer<GeranCellMeasurement> gaps = GeranCellMeasurement::create(c->geranMeasurement(1));
  EXPECT_FALSE(gaps->servingCellMeasurement()->valueExists(1) ||
               gaps->servingCellMeasurement()->valueExists(2));
  EXPECT_GE(gaps->timeStamp(), 1700000000u) << "stamped when delivered";

  // UTRA-FDD: identity, serving lac, neighbour values; 255 stays absent.
  SharedPointer<UtraFddCellMeasurement> fdd = UtraFddCellMeasurement::create(c->utraFddMeasurement(0));
  EXPECT_EQ(*fdd->dn(), UtraCellDn(244, 5, 16846773));
  EXPECT_EQ(fdd->servingCellMeasurement()->lac(), 4097);
  ASSERT_EQ(fdd->nwMeasurementCollection()->size(), 2u);
  ASSERT_EQ(fdd->nwMeasurementCollection()->item(0)->getObjectValue(record), Ok);
  SharedPointer<UtraFddNwMeasurement> full = SharedPointer<UtraFddNwMeasurement>::cast(record);
  EXPECT_EQ(*full->frequencyInfo(), UtraFddFrequencyInfo(10763, 117));
  EXPECT_EQ(full->ucid(), 16846774u);
  EXPECT_EQ(full->ecNo(), 24);
  EXPECT_EQ(full->rscp(), -85);
  EXPECT_EQ(full->pathloss(), 121);
  ASSERT_EQ(fdd->nwMeasurementCollection()->item(1)->getObjectValue(record), Ok);
  EXPECT_FALSE(SharedPointer<UtraFddNwMeasurement>::cast(record)->valueExists(16 | 32 | 64));

  // UTRA-TDD: carrier RSSI in place of Ec/No.
  SharedPointer<UtraTddCellMeasurement> tdd = UtraTddCellMeasurement::create(c->utraTddMeasurement(0));
  EXPECT_EQ(*tdd->dn(), UtraCellDn(460, 0, 2228258));
  EXPECT_FALSE(tdd->servingCellMeasurement()->valueExists(1)) << "no lac given";
  ASSERT_EQ(tdd->nwMeasurementCollection()->item(0)->getObjectValue(record), Ok);
  SharedPointer<UtraTddNwMeasurement> tddNw = SharedPointer<UtraTddNwMeasurement>::cast(record);
  EXPECT_EQ(*tddNw->frequencyInfo(), UtraTddFrequencyInfo(10055, 44));
  EXPECT_EQ(tddNw->utraCarrierRssi(), 40);
  EXPECT_EQ(tddNw->rscp(), -90);

  // E-UTRA: the identity only. The element of unknown kind is skipped.
  SharedPointer<EUtraCellMeasurement> lte = EUtraCellMeasurement::create(c->eutraMeasurement(0));
  EXPECT_EQ(*lte->dn(), EUtraCellDn(244, 91, 18998019));
  EXPECT_FALSE(lte->servingCellMeasurement());
  EXPECT_FALSE(cellular.measurements->propertyExists(312));

  const Delivery wlan = requestAndWait(kWlan);
  ASSERT_EQ(wlan.status, Ok);
  c = MeasurementContainer::create(wlan.measurements);
  ASSERT_EQ(c->wlanMeasurementCollection()->size(), 3u);
  SharedPointer<WlanMeasurement> ap = WlanMeasurement::create(c->wlanMeasurement(0));
  EXPECT_EQ(ap->dn()->bssid(), 0x001A2BFFFF3C4D5Eull) << "6 bytes widened";
  EXPECT_EQ(ap->wlanApMeasurement()->rxLevel(), -51);
  EXPECT_EQ(ap->wlanApMeasurement()->txLevel(), 20);
  EXPECT_EQ(ap->wlanApMeasurement()->rssi(), 88);
  SharedPointer<gom::CharacterData> ssid;
  ASSERT_TRUE(ap->dn()->isExtended());
  ASSERT_EQ(ap->dn()->extensionReference()->getStringProperty(
                radioadaptation::ConverterOxel::kSsidProperty, ssid), Ok);
  EXPECT_EQ(std::string(ssid->data(), ssid->length()), "office");
  SharedPointer<WlanMeasurement> eight = WlanMeasurement::create(c->wlanMeasurement(1));
  EXPECT_EQ(eight->dn()->bssid(), 0x001A2B3C4D5E6F70ull);
  EXPECT_TRUE(eight->wlanApMeasurement()->valueExists(WlanApMeasurement::RxLevel));
  EXPECT_FALSE(eight->wlanApMeasurement()->valueExists(WlanApMeasurement::TxLevel |
                                                       WlanApMeasurement::Rssi));
}

TEST_P(Adaptation, UnreliableStatesMarkTheUtraMeasurements) {
  ASSERT_TRUE(open(scenario("unreliable"), kCellular));
  const std::time_t before = std::time(nullptr);
  Delivery d = requestAndWait(kCellular);
  const std::time_t after = std::time(nullptr);
  EXPECT_EQ(d.status, UnreliableMeasurement);
  ASSERT_TRUE(d.measurements);
  for (unsigned short collection : {301, 302}) {
    const std::vector<long long> since = stampsOf(d.measurements, collection, 207);
    ASSERT_EQ(since.size(), 1u) << collection;
    EXPECT_GE(since[0], before - 30) << "the request's time less the 30 s in the state";
    EXPECT_LE(since[0], after - 30);
  }
  EXPECT_TRUE(radio->networkStatus(0) & 0x1000);

  d = requestAndWait(kCellular);
  EXPECT_EQ(d.status, Ok);
  EXPECT_EQ(stampsOf(d.measurements, 301, 207), std::vector<long long>{-1});
  EXPECT_FALSE(radio->networkStatus(0) & 0x1000);

  d = requestAndWait(kCellular);
  EXPECT_EQ(stampsOf(d.measurements, 301, 207), std::vector<long long>{0}) << "start unknown";
}

// A library refusing to start (a technology change just made, or a throw)
// fails the request; nothing is left pending and the id is consumed.
TEST_P(Adaptation, FailedStartsAreNotLeftPending) {
  ASSERT_TRUE(open(scenario("technology-change"), kCellular));
  unsigned int id = 99;
  EXPECT_EQ(request(kCellular, id), Failed);
  EXPECT_EQ(id, 0u);
  EXPECT_EQ(request(kCellular, id), Failed) << "the failed request is not left pending";
  settle(1600);
  const Delivery d = requestAndWait(kCellular);
  EXPECT_EQ(d.requestId, 3u) << "failed requests consumed their ids";
  EXPECT_EQ(d.status, Ok);

  TearDown();
  ASSERT_TRUE(open(scenario("failing"), kCellular | kWlan));
  EXPECT_EQ(request(kWlan, id), Failed) << "a throwing start fails the request";
  EXPECT_EQ(request(kCellular, id), Failed);
  EXPECT_EQ(requestAndWait(kCellular).status, Ok) << "the next request tries again";
}

// A library answering inside its start call still reaches observers only
// from the loop; one that never answers ends in time-outs.
TEST_P(Adaptation, SynchronousAndSilentLibraries) {
  for (const char* name : {"synchronous", "silent"}) {
    SCOPED_TRACE(name);
    TearDown();
    observer.got.clear();
    ASSERT_TRUE(open(scenario(name), kCellular | kWlan));
    unsigned int cellular = 0, wlan = 0;
    EXPECT_EQ(request(kCellular, cellular), Ok);
    EXPECT_EQ(request(kWlan, wlan), Ok);
    ASSERT_TRUE(runUntil([&] { return observer.got.size() == 2; }, 15.0));
    EXPECT_FALSE(observer.calledInside);
    EXPECT_EQ(observer.got[0].requestId, cellular);
    EXPECT_EQ(observer.got[1].requestId, wlan);
    const Status expected = std::string(name) == "silent" ? Timeout : Ok;
    for (const Delivery& d : observer.got) EXPECT_EQ(d.status, expected);
  }
}

TEST_P(Adaptation, GnssFixesFollowTheSubscriptionAndTheService) {
  ASSERT_TRUE(open(scenario("gnss-outage"), kCellular));
  unsigned int id = 0;
  EXPECT_EQ(request(kGnss, id), NotSupported) << "GNSS is never requested";
  settle(300);
  EXPECT_EQ(observer.count(kGnss), 0u) << "no fixes before a Gnss subscription";

  provider->addObserver(observer, kGnss);
  ASSERT_TRUE(runUntil([&] { return observer.count(kGnss) >= 1; }, 2.0));
  const Delivery& first = *observer.last(kGnss);
  EXPECT_EQ(first.requestId, 0u);
  EXPECT_EQ(first.status, Ok);
  SharedPointer<MeasurementContainer> c = MeasurementContainer::create(first.measurements);
  SharedPointer<GnssMeasurement> fix = GnssMeasurement::create(c->gnssMeasurement(0));
  ASSERT_TRUE(fix);
  SharedPointer<GnssMeasurementData> data = fix->measurementData();
  ASSERT_TRUE(data);
  EXPECT_DOUBLE_EQ(data->speed(), 10.0) << "36 km/h is 10 m/s";
  EXPECT_EQ(fix->timeStamp(), 1700000000u);

  // The service goes off at 1.5 s and on again at 3 s: no fixes between.
  settle(2000);
  const std::size_t duringOutage = observer.count(kGnss);
  const double lastBefore = observer.last(kGnss)->atSeconds;
  EXPECT_LE(duringOutage, 3u);
  ASSERT_TRUE(runUntil([&] { return observer.count(kGnss) > duringOutage; }, 3.0));
  EXPECT_GT(observer.last(kGnss)->atSeconds - lastBefore, 1.3) << "fixes stopped while disabled";

  provider->removeObserver(observer, kGnss);
  const std::size_t unsubscribed = observer.count(kGnss);
  settle(1200);
  EXPECT_EQ(observer.count(kGnss), unsubscribed) << "no fixes after unsubscribing";
}

TEST_P(Adaptation, PushedLibraryResultsAreConverted) {
  ASSERT_TRUE(open(scenario("all-technologies"), kWlan));
  OxelMeasurements result;
  auto ap = std::make_shared<OxelElementWLAN>();
  const unsigned char bssid[] = {0x00, 0x11, 0x22, 0x33, 0x44, 0x55};
  ap->mac().setBytes(bssid, 6);
  ap->setPowerRx(-66);
  result.add(ap);
  EXPECT_EQ(provider->pushMeasurement(nullptr, 0, kWlan), InvalidArgument);
  EXPECT_EQ(provider->pushMeasurement(&result, 0, kWlan), Ok);
  ASSERT_TRUE(runUntil([&] { return observer.count(kWlan) == 1; }));
  SharedPointer<WlanMeasurement> m =
      WlanMeasurement::create(MeasurementContainer::create(observer.got[0].measurements)->wlanMeasurement(0));
  EXPECT_EQ(m->wlanApMeasurement()->rxLevel(), -66);
}

LODESTACK_ON_BOTH_LOOPS(Adaptation);

TEST(FreeGnssListener, UninstallingReleasesTheManager) {
  setenv("LODESTACK_SCENARIO", scenario("gnss-outage").c_str(), 1);
  struct Reports : FreeGnssListener::Observer {
    int count = 0;
    void handleFreeGnssReport(const SharedPointer<PositionEstimate>&, Status) override { ++count; }
  } reports;
  SharedPointer<core::IAsyncCallDispatcher> loop =
      core::AsyncCallDispatcher::openDispatcher(core::AsyncCallDispatcher::MainLoopDefault);
  FreeGnssListener listener;
  listener.setObserver(&reports);
  EXPECT_TRUE(listener.isInstalled());
  EXPECT_FALSE(listener.isListening()) << "reading waits for the service";
  ASSERT_TRUE(core::testing::runUntil(*loop, [&] { return reports.count > 0; }, 2.0));
  EXPECT_TRUE(listener.isListening());
  listener.setObserver(nullptr);
  EXPECT_FALSE(listener.isInstalled());
  EXPECT_FALSE(listener.isListening());
  const int count = reports.count;
  EXPECT_FALSE(core::testing::runUntil(*loop, [&] { return reports.count > count; }, 0.15));
  listener.setObserver(&reports);
  EXPECT_TRUE(listener.isInstalled()) << "a new manager for a new observer";
  unsetenv("LODESTACK_SCENARIO");
}

// Bad scenario files: one clear line naming the file and the field, and
// no adaptation.
TEST(Scenario, BadFilesAreRefusedWithTheirFault) {
  struct Case {
    const char* text;
    const char* expected;  // in the message, after the file name
  };
  const std::vector<Case> cases = {
      {"{\n  \"cellular\": {\n    \"results\": [ }\n}", "line 3"},
      {"{\"cellular\": {\"result\": []}}", "cellular.result: unknown field"},
      {"{\"cellular\": {\"results\": []}}", "cellular.results: expected at least one result"},
      {"{\"wlan\": {\"results\": [{\"elements\": [{\"type\": \"wlan\", \"bssid\": \"00:11:22\"}]}]}}",
       "wlan.results[0].elements[0].bssid: expected a BSSID"},
      {"{\"cellular\": {\"results\": [{\"elements\": [{\"type\": \"gsm\", \"mcc\": 244, \"mnc\": 1, "
       "\"rxLevel\": 300}]}]}}",
       "cellular.results[0].elements[0].rxLevel: expected an integer from 0 to 255, got 300"},
      {"{\"cellular\": {\"results\": [{\"elements\": [{\"type\": \"gsm\", \"mnc\": 1}]}]}}",
       "elements[0]: missing field \"mcc\""},
      {"{\"cellular\": {\"answer\": \"sometimes\", \"results\": [{}]}}", "cellular.answer: expected"},
      {"{\"gnss\": {\"fixes\": [{\"at\": 2, \"latitude\": 0, \"longitude\": 0, \"accuracy\": 1}, "
       "{\"at\": 1, \"latitude\": 0, \"longitude\": 0, \"accuracy\": 1}]}}",
       "gnss.fixes[1].at: fixes must be in time order"},
      {"{\"gnss\": {\"fixes\": [{\"at\": 0, \"latitude\": 91, \"longitude\": 0, \"accuracy\": 1}]}}",
       "gnss.fixes[0].latitude: expected a number from -90 to 90, got 91"},
      {"[1, 2]", "top level: expected an object"},
  };
  const std::string path = ::testing::TempDir() + "bad-scenario.json";
  SharedPointer<core::IAsyncCallDispatcher> loop =
      core::AsyncCallDispatcher::openDispatcher(core::AsyncCallDispatcher::MainLoopDefault);
  for (const Case& test : cases) {
    std::ofstream(path) << test.text;
    const std::string message = platform::checkScenarioFile(path);
    EXPECT_NE(message.find("scenario " + path + ": "), std::string::npos) << message;
    EXPECT_NE(message.find(test.expected), std::string::npos) << message;
    EXPECT_EQ(message.find('\n'), std::string::npos) << "one line: " << message;

    setenv("LODESTACK_SCENARIO", path.c_str(), 1);
    std::unique_ptr<IRadioAdaptation> radio(RadioAdaptationFactory::createRadioAdaptation());
    EXPECT_FALSE(radio) << test.text;
    EXPECT_EQ(platform::lastError(), message);
  }
  setenv("LODESTACK_SCENARIO", (path + ".missing").c_str(), 1);
  EXPECT_FALSE(std::unique_ptr<IRadioAdaptation>(RadioAdaptationFactory::createRadioAdaptation()));
  EXPECT_NE(platform::lastError().find("cannot be opened"), std::string::npos);
  unsetenv("LODESTACK_SCENARIO");

  // The street sample and the built-in street load; the other samples are
  // opened by the tests above.
  EXPECT_EQ(platform::checkScenarioFile(scenario("street")), "");
  EXPECT_EQ(platform::checkScenarioFile(""), "");
}

}  // namespace
}  // namespace testing
}  // namespace lodestack
