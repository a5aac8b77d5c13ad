// The request engine on a real dispatcher (both kinds), driven by a test
// platform that answers the ways real platforms do.
#include "radioadaptation/TestPlatform.h"

namespace lodestack {
namespace testing {
namespace {

using Answer = TestPlatform::Answer;
const MeasurementType Cellular = IRadioAdaptationObserver::Cellular;
const MeasurementType Wlan = IRadioAdaptationObserver::Wlan;
const MeasurementType Gnss = IRadioAdaptationObserver::Gnss;

struct RadioRecorder : IRadioAdaptationObserver, DeliveryLog {
  SharedPointer<GenericObject> getRadioSimulationData() override { return {}; }
  void radioMeasurementsReady(unsigned int requestId, int type, SharedPointer<GenericObject> m,
                              Status status) override {
    record(requestId, type, m, status);
  }
};

class Engine : public DispatcherFixture {
 protected:
  void SetUp() override {
    platform = TestPlatform::create();
    ASSERT_TRUE(platform);
    ASSERT_EQ(platform->setObserver(&observer), Ok);
  }
  // requestMeasurements, noting that the observer must not run inside it.
  Status request(int types, unsigned int& id) {
    observer.inside = true;
    const Status status = platform->requestMeasurements(types, id);
    observer.inside = false;
    return status;
  }
  unsigned int requestOk(int types) {
    unsigned int id = 0;
    EXPECT_EQ(request(types, id), Ok);
    return id;
  }

  RadioRecorder observer;
  std::unique_ptr<TestPlatform> platform;
};

TEST_P(Engine, IdsRefusalsAndCancellation) {
  platform->answer = Answer::Never;
  unsigned int id = 99;

  ASSERT_EQ(platform->setObserver(nullptr), Ok);
  EXPECT_EQ(request(Cellular, id), Refused) << "no observer is checked before the kind";
  EXPECT_EQ(request(0, id), Refused);
  EXPECT_EQ(id, 0u);
  ASSERT_EQ(platform->setObserver(&observer), Ok);

  for (int bad : {0, Cellular | Wlan, 8, -1}) {
    id = 99;
    EXPECT_EQ(request(bad, id), InvalidArgument) << "types " << bad;
    EXPECT_EQ(id, 0u);
  }
  EXPECT_EQ(request(Gnss, id), NotSupported);
  EXPECT_EQ(id, 0u);

  // Ids are shared by the kinds and consumed by the refused GNSS request.
  EXPECT_EQ(requestOk(Cellular), 2u);
  EXPECT_EQ(request(Cellular, id), AlreadyPending);
  EXPECT_EQ(id, 2u) << "the pending request's id comes back";
  EXPECT_EQ(requestOk(Wlan), 3u);
  EXPECT_EQ(request(Wlan, id), AlreadyPending);
  EXPECT_EQ(id, 3u);

  EXPECT_EQ(platform->cancelRequest(0), InvalidArgument);
  EXPECT_EQ(platform->cancelRequest(77), NotFound);
  EXPECT_EQ(platform->cancelRequest(2), Ok);
  EXPECT_EQ(platform->cancelRequest(2), NotFound);
  EXPECT_EQ(requestOk(Cellular), 4u) << "a cancelled kind can be requested again";

  // Clearing the observer cancels what is pending, without notification.
  ASSERT_EQ(platform->setObserver(nullptr), Ok);
  EXPECT_EQ(platform->calls,
            (std::vector<std::string>{"request 4", "cancel 4", "request 1", "request 2",
                                      "cancel 1", "request 1", "cancel 1", "cancel 2"}));
  settle();
  EXPECT_TRUE(observer.got.empty());
}

TEST_P(Engine, FailedStartIsRolledBack) {
  platform->answer = Answer::FailStart;
  unsigned int id = 99;
  EXPECT_EQ(request(Cellular, id), Failed);
  EXPECT_EQ(id, 0u);
  EXPECT_EQ(platform->calls, (std::vector<std::string>{"request 1", "cancel 1"}));

  // The platform saying its measurement is running already is success.
  platform->startFailure = AlreadyPending;
  EXPECT_EQ(requestOk(Cellular), 2u) << "the failed request consumed id 1 and left nothing pending";
  EXPECT_EQ(platform->cancelRequest(2), Ok);
}

TEST_P(Engine, LaterAnswersAndTheirStatus) {
  // A result measured in an unreliable state keeps its data.
  platform->answerStatus = UnreliableMeasurement;
  requestOk(Cellular);
  ASSERT_TRUE(runUntil([&] { return observer.got.size() == 1; }));
  EXPECT_EQ(observer.got[0].status, UnreliableMeasurement);
  EXPECT_TRUE(observer.got[0].measurements);

  // A failed measurement reaches the requester without its object.
  platform->answerStatus = Failed;
  const unsigned int id = requestOk(Wlan);
  ASSERT_TRUE(runUntil([&] { return observer.got.size() == 2; }));
  EXPECT_EQ(observer.got[1].requestId, id);
  EXPECT_EQ(observer.got[1].type, Wlan);
  EXPECT_EQ(observer.got[1].status, Failed);
  EXPECT_FALSE(observer.got[1].measurements);

  // An object that is not a container is refused by a throw.
  EXPECT_THROW(platform->complete(Cellular, GenericObject::create(2), Ok, false), Status);
}

// Synchronous answers and pushes share one queue: delivered from the loop,
// never inside the call, one result per turn, oldest first.
TEST_P(Engine, QueuedResultsArriveOnePerTurnInCompletionOrder) {
  platform->answer = Answer::Sync;
  SharedPointer<GenericObject> pushed = containerOf({2});
  EXPECT_EQ(platform->pushMeasurement(&pushed, 0, Cellular), Ok);
  EXPECT_EQ(requestOk(Wlan), 1u);
  EXPECT_EQ(requestOk(Wlan), 2u) << "the answered request is no longer pending";
  EXPECT_TRUE(observer.got.empty());

  for (std::size_t n = 1; n <= 3; ++n) {
    ASSERT_TRUE(runUntil([&] { return observer.got.size() >= n; }));
    EXPECT_EQ(observer.got.size(), n) << "more than one result in one turn";
  }
  EXPECT_FALSE(observer.calledInside);
  EXPECT_EQ(observer.got[0].measurements.get(), pushed.get());
  EXPECT_EQ(observer.got[0].requestId, 0u);
  EXPECT_EQ(observer.got[1].requestId, 1u);
  EXPECT_EQ(observer.got[1].type, Wlan);
  EXPECT_EQ(observer.got[2].requestId, 2u);
}

TEST_P(Engine, CancelledRequestIsSilentButAQueuedResultStillArrives) {
  const unsigned int silent = requestOk(Cellular);
  EXPECT_EQ(platform->cancelRequest(silent), Ok);
  settle(50);
  EXPECT_TRUE(observer.got.empty());

  platform->answer = Answer::Sync;
  const unsigned int queued = requestOk(Cellular);
  EXPECT_EQ(platform->cancelRequest(queued), NotFound) << "already answered, only queued";
  ASSERT_TRUE(runUntil([&] { return observer.got.size() == 1; }));
  EXPECT_EQ(observer.got[0].requestId, queued);
  EXPECT_EQ(observer.got[0].status, Ok);
}

TEST_P(Engine, RequestsThatAreNeverAnsweredTimeOut) {
  platform->answer = Answer::Never;
  requestOk(Cellular);
  requestOk(Wlan);
  ASSERT_TRUE(runUntil([&] { return observer.got.size() == 2; }, 15.0));
  const double expectedSeconds[] = {3.0, 10.0};
  for (unsigned int i = 0; i < 2; ++i) {
    SCOPED_TRACE(i);
    EXPECT_EQ(observer.got[i].requestId, i + 1);
    EXPECT_EQ(observer.got[i].type, i == 0 ? Cellular : Wlan);
    EXPECT_EQ(observer.got[i].status, Timeout);
    EXPECT_FALSE(observer.got[i].measurements);
    EXPECT_NEAR(observer.got[i].atSeconds, expectedSeconds[i], 0.5);
  }
  // The platform was told to stop each measurement before the time-out.
  EXPECT_EQ(platform->calls,
            (std::vector<std::string>{"request 1", "request 2", "cancel 1", "cancel 2"}));
  EXPECT_EQ(requestOk(Cellular), 3u) << "a timed-out request is no longer pending";
}

TEST_P(Engine, TimeStampsAndTheUnreliableState) {
  platform->answer = Answer::Sync;
  // A pushed status word with bit 0x1000 starts the unreliable state; a
  // later one keeps the time it began.
  const int unreliable = RadioAdaptationCommon::kUnreliableMeasurementsFlag | 0x3;
  const std::time_t before = std::time(nullptr);
  EXPECT_EQ(platform->pushNetworkStatus(&unreliable, 0, Cellular), Ok);
  EXPECT_EQ(platform->networkStatus(0), unreliable);
  EXPECT_GE(platform->unreliableSinceForTest(), before);
  platform->setUnreliable(unreliable, 1234);
  EXPECT_EQ(platform->pushNetworkStatus(&unreliable, 0, Cellular), Ok);
  EXPECT_EQ(platform->unreliableSinceForTest(), 1234);

  // 205 on every cellular collection, 207 on the two UTRA ones only; stamps
  // already set are kept.
  platform->makeResult = [](MeasurementType) {
    SharedPointer<GenericObject> c = containerOf({2, 3, 4, 14, 17});
    (void)measurementsOf(c, 301)[0]->setUint32Property(205, 42);
    return c;
  };
  requestOk(Cellular);
  ASSERT_TRUE(runUntil([&] { return observer.got.size() == 1; }));
  const std::time_t after = std::time(nullptr);
  const SharedPointer<GenericObject>& m = observer.got[0].measurements;
  EXPECT_EQ(stampsOf(m, 301, 205), std::vector<long long>{42});
  for (unsigned short collection : {300, 302, 310, 312}) {
    SCOPED_TRACE(collection);
    EXPECT_GE(stampsOf(m, collection, 205).at(0), before);
    EXPECT_LE(stampsOf(m, collection, 205).at(0), after);
    const long long since = collection == 302 ? 1234 : -1;
    EXPECT_EQ(stampsOf(m, collection, 207), std::vector<long long>{since});
  }
  EXPECT_EQ(stampsOf(m, 301, 207), std::vector<long long>{1234});

  // A word without the bit ends the state.
  const int reliable = 0x3;
  EXPECT_EQ(platform->pushNetworkStatus(&reliable, 0, Cellular), Ok);
  EXPECT_EQ(platform->unreliableSinceForTest(), 0);
  // An empty collection ends the stamping walk: the collections after it
  // stay unstamped.
  platform->makeResult = [](MeasurementType) {
    SharedPointer<GenericObject> c = containerOf({3});
    (void)c->setCollectionProperty(300, gom::ValueCollection::create());
    return c;
  };
  requestOk(Cellular);
  ASSERT_TRUE(runUntil([&] { return observer.got.size() == 2; }));
  EXPECT_EQ(stampsOf(observer.got[1].measurements, 301, 205), std::vector<long long>{-1});
}

TEST_P(Engine, PushedMeasurementsAndStatusWords) {
  platform->answer = Answer::Never;
  const unsigned int pending = requestOk(Cellular);
  SharedPointer<GenericObject> container = containerOf({2});
  SharedPointer<GenericObject> notAContainer = GenericObject::create(2);

  EXPECT_EQ(platform->pushMeasurement(nullptr, 0, Cellular), InvalidArgument);
  for (int bad : {0, Cellular | Wlan, 16})
    EXPECT_EQ(platform->pushMeasurement(&container, 0, bad), InvalidArgument) << bad;
  EXPECT_EQ(platform->pushMeasurement(&notAContainer, 0, Cellular), Failed);
  EXPECT_EQ(platform->pushMeasurement(&container, 0, Cellular), Ok);
  ASSERT_TRUE(runUntil([&] { return observer.got.size() == 1; }));
  EXPECT_EQ(observer.got[0].requestId, 0u);
  EXPECT_EQ(observer.got[0].type, Cellular);
  EXPECT_GE(stampsOf(container, 300, 205).at(0), 1);
  unsigned int id = 0;
  EXPECT_EQ(request(Cellular, id), AlreadyPending) << "a push leaves the request alone";
  EXPECT_EQ(id, pending);

  const int wifi = 7, gnss = 9, cellular = 0x1000;
  EXPECT_EQ(platform->pushNetworkStatus(&cellular, 1, Cellular), NotSupported);
  EXPECT_EQ(platform->networkStatus(0), 0) << "only the default subscription is kept";
  EXPECT_EQ(platform->pushNetworkStatus(&wifi, 0, Wlan), Ok);
  EXPECT_EQ(platform->pushNetworkStatus(&gnss, -1, Gnss), Ok);
  EXPECT_EQ(platform->wifiStatus(3), 7);
  EXPECT_EQ(platform->gnssStatus(0), 9);
  EXPECT_EQ(platform->pushNetworkStatus(&wifi, 0, static_cast<MeasurementType>(8)), NotSupported);
  EXPECT_EQ(platform->pushNetworkStatus(nullptr, 0, Wlan), InvalidArgument);
}

TEST_P(Engine, DestructionDropsQueuedResults) {
  platform->answer = Answer::Sync;
  requestOk(Cellular);
  SharedPointer<GenericObject> pushed = containerOf({20});
  EXPECT_EQ(platform->pushMeasurement(&pushed, 0, Wlan), Ok);
  platform->answer = Answer::Never;
  requestOk(Wlan);
  platform.reset();
  settle();
  EXPECT_TRUE(observer.got.empty());
}

TEST_P(Engine, ObserverMayDestroyTheEngineWhileResultsWait) {
  platform->answer = Answer::Sync;
  requestOk(Cellular);
  requestOk(Wlan);
  observer.onDelivery = [&] { platform.reset(); };
  ASSERT_TRUE(runUntil([&] { return !platform; }));
  settle();
  EXPECT_EQ(observer.got.size(), 1u);
}

LODESTACK_ON_BOTH_LOOPS(Engine);

}  // namespace
}  // namespace testing
}  // namespace lodestack
