// The provider over the real request engine and a test platform, on a real
// dispatcher of both kinds.
#include "radioadaptation/TestPlatform.h"

namespace lodestack {
namespace testing {
namespace {

using Answer = TestPlatform::Answer;
const int kCellular = IMeasurementsObserver::Cellular;
const int kWlan = IMeasurementsObserver::Wlan;
const int kGnss = IMeasurementsObserver::Gnss;

class Provider : public DispatcherFixture {
 protected:
  void SetUp() override {
    platform = TestPlatform::create();
    ASSERT_TRUE(platform);
    provider.reset(MeasurementsProvider::create(*platform));
    ASSERT_TRUE(provider);
  }
  void TearDown() override {
    provider.reset();
    platform.reset();
  }
  unsigned int requestOk(int types) {
    unsigned int id = 0;
    EXPECT_EQ(provider->requestMeasurements(types, id), Ok);
    return id;
  }
  // Completes a cellular measurement with `m` and `status` and runs the loop
  // until it was delivered to `observer`.
  void deliver(Recorder& observer, const SharedPointer<GenericObject>& m, Status status = Ok) {
    const std::size_t before = observer.got.size();
    platform->complete(IRadioAdaptationObserver::Cellular, m, status, true);
    ASSERT_TRUE(runUntil([&] { return observer.got.size() > before; }));
  }
  // Makes `observer` note its name in `log` on each call.
  void logAs(Recorder& observer, const std::string& name) {
    observer.onDelivery = [this, name] { log.push_back(name); };
  }

  std::vector<std::string> log;
  std::unique_ptr<TestPlatform> platform;
  std::unique_ptr<MeasurementsProvider> provider;
};

TEST_P(Provider, SubscriptionsFollowTheUnionOfMasks) {
  Recorder a, b;
  provider->addObserver(a, kCellular);
  provider->addObserver(b, kCellular | kWlan);
  provider->addObserver(b, kWlan);
  provider->removeObserver(b, kCellular);
  provider->removeObserver(a, kCellular);
  provider->removeObserver(a, kCellular);  // no longer registered: nothing
  provider->addObserver(a, kGnss);
  platform->answer = Answer::Never;
  requestOk(kWlan);
  provider.reset();
  EXPECT_EQ(platform->calls,
            (std::vector<std::string>{"subscribe 1 1", "subscribe 2 1", "subscribe 1 0",
                                      "subscribe 4 1", "request 2",
                                      "subscribe 2147483647 0", "cancel 2"}));
}

TEST_P(Provider, RequestsNameOneKind) {
  unsigned int id = 77;
  EXPECT_EQ(provider->requestMeasurements(8, id), InvalidArgument);
  EXPECT_EQ(id, 77u) << "a mask with no kind leaves the id alone";
  EXPECT_EQ(provider->requestMeasurements(kCellular | 8, id), InvalidArgument)
      << "the mask reaches the adaptation unchanged";
  EXPECT_EQ(id, 0u);
  EXPECT_EQ(provider->requestMeasurements(kCellular, id), Ok);
  EXPECT_EQ(provider->cancelRequest(id), Ok);
  EXPECT_EQ(provider->cancelRequest(id), NotFound);
}

TEST_P(Provider, ResultsFanOutInRegistrationOrder) {
  Recorder cellular, wlan, both, thrower;
  logAs(cellular, "cellular");
  logAs(wlan, "wlan");
  logAs(both, "both");
  thrower.onDelivery = [this] {
    log.push_back("thrower");
    throw std::runtime_error("observer failure");
  };
  provider->addObserver(cellular, kCellular);
  provider->addObserver(thrower, kCellular);
  provider->addObserver(wlan, kWlan);
  provider->addObserver(both, kWlan | kCellular);
  EXPECT_FALSE(provider->getLastMeasurements());

  platform->answer = Answer::Sync;
  const unsigned int id = requestOk(kCellular);
  ASSERT_TRUE(runUntil([&] { return both.got.size() == 1; }));
  EXPECT_EQ(log, (std::vector<std::string>{"cellular", "thrower", "both"}));
  for (const Recorder* o : {&cellular, &thrower, &both}) {
    ASSERT_EQ(o->got.size(), 1u);
    EXPECT_EQ(o->got[0].requestId, id);
    EXPECT_EQ(o->got[0].type, kCellular);
    EXPECT_EQ(o->got[0].status, Ok);
    EXPECT_EQ(o->got[0].measurements.get(), cellular.got[0].measurements.get()) << "one tree";
  }
  SharedPointer<schema::MeasurementContainer> last = provider->getLastMeasurements();
  ASSERT_TRUE(last);
  EXPECT_EQ(last->wrappedObject().get(), both.got[0].measurements.get());

  // Unreliable results are usable; a usable status without an object is not.
  deliver(both, containerOf({3}), UnreliableMeasurement);
  EXPECT_EQ(both.got.back().status, UnreliableMeasurement);
  EXPECT_TRUE(both.got.back().measurements);
  last = provider->getLastMeasurements();
  deliver(both, SharedPointer<GenericObject>(), Ok);
  EXPECT_EQ(both.got.back().status, NotFound);
  deliver(both, SharedPointer<GenericObject>(), Failed);
  EXPECT_EQ(both.got.back().status, Failed);
  EXPECT_EQ(provider->getLastMeasurements()->wrappedObject().get(), last->wrappedObject().get())
      << "a result without an object keeps the last one";
  EXPECT_TRUE(wlan.got.empty());
}

TEST_P(Provider, ObserversSeeValidatedContainers) {
  Recorder o;
  provider->addObserver(o, kCellular);
  // A GERAN measurement without its identity goes; a valid one stays. An
  // empty E-UTRA collection is removed.
  SharedPointer<GenericObject> m = containerOf({2, 2});
  measurementsOf(m, 300)[1]->removeProperty(200);
  (void)m->setCollectionProperty(310, gom::ValueCollection::create());
  deliver(o, m);
  EXPECT_EQ(measurementsOf(o.got[0].measurements, 300).size(), 1u);
  EXPECT_FALSE(o.got[0].measurements->propertyExists(310));
}

TEST_P(Provider, ObserversMayChangeRegistrationsWhileAResultIsDelivered) {
  Recorder first, second, late;
  logAs(second, "second");
  logAs(late, "late");
  provider->addObserver(first, kCellular);
  provider->addObserver(second, kCellular);
  first.onDelivery = [&] {
    provider->removeObserver(second, kCellular);
    provider->addObserver(late, kCellular);
  };
  deliver(first, containerOf({2}));
  first.onDelivery = nullptr;
  deliver(first, containerOf({2}));
  EXPECT_EQ(log, std::vector<std::string>{"late"})
      << "a removed observer is not called, an added one waits for the next result";
}

TEST_P(Provider, PushedDataReachesObserversOfItsKind) {
  Recorder gnss, cellular;
  provider->addObserver(gnss, kGnss);
  provider->addObserver(cellular, kCellular);
  SharedPointer<schema::MeasurementContainer> fix = schema::MeasurementContainer::create();
  (void)fix->addGnssMeasurement(GenericObject::create(21));
  SharedPointer<GenericObject> object = fix->wrappedObject();
  EXPECT_EQ(provider->pushMeasurement(&object, 0, kGnss | 8), Ok);
  ASSERT_TRUE(runUntil([&] { return gnss.got.size() == 1; }));
  EXPECT_EQ(gnss.got[0].requestId, 0u);
  EXPECT_EQ(gnss.got[0].type, kGnss);
  EXPECT_TRUE(cellular.got.empty());

  const int word = 5;
  EXPECT_EQ(provider->pushNetworkStatus(&word, 0, IMeasurementsObserver::Wlan), Ok);
  EXPECT_EQ(platform->wifiStatus(0), 5);
}

TEST_P(Provider, ShutDownWithResultsStillQueued) {
  Recorder o;
  provider->addObserver(o, kCellular | kWlan);
  platform->answer = Answer::Sync;
  requestOk(kCellular);
  requestOk(kWlan);
  provider.reset();
  settle();
  EXPECT_TRUE(o.got.empty());
}

LODESTACK_ON_BOTH_LOOPS(Provider);

}  // namespace
}  // namespace testing
}  // namespace lodestack
