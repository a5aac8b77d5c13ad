// A platform adaptation for tests, over the real request engine, and the
// observers that record what reaches them. The platform answers requests the
// ways real ones do: later from its own timer, synchronously inside the start
// call, never, or by failing the start.
#ifndef LODESTACK_TESTS_RADIOADAPTATION_TESTPLATFORM_H
#define LODESTACK_TESTS_RADIOADAPTATION_TESTPLATFORM_H

#include <ctime>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include <lodestack/lodestack.h>

#include "core/CoreTestSupport.h"

namespace lodestack {
namespace testing {

using gom::GenericObject;
using gom::SharedPointer;
using radioadaptation::IRadioAdaptationObserver;
using radioadaptation::RadioAdaptationCommon;
using MeasurementType = radioadaptation::IRadioAdaptation::MeasurementType;

// A container with one measurement of `typeId` (2 GERAN, 3 UTRA-FDD, 4
// UTRA-TDD, 14 E-UTRA, 17 CDMA, 20 WLAN) per entry, each with a valid cell
// identity and no time stamp.
inline SharedPointer<GenericObject> containerOf(std::initializer_list<unsigned short> typeIds) {
  static const std::map<unsigned short, unsigned short> kCollection = {
      {2, 300}, {3, 301}, {4, 302}, {14, 310}, {17, 312}, {20, 314}};
  SharedPointer<schema::MeasurementContainer> c = schema::MeasurementContainer::create();
  for (unsigned short typeId : typeIds) {
    SharedPointer<GenericObject> m = GenericObject::create(typeId);
    SharedPointer<gom::ObjectBase> dn;
    switch (typeId) {
      case 2: dn = schema::GeranCellDn::create(244, 5, 100, 200); break;
      case 3:
      case 4: dn = schema::UtraCellDn::create(244, 5, 0x12345); break;
      case 14: dn = schema::EUtraCellDn::create(244, 5, 0x54321); break;
      case 17: dn = schema::CdmaCellDn::create(1, 2, 3); break;
      default: break;
    }
    if (dn) (void)m->setObjectProperty(200, dn);
    (void)c->addMeasurement(m, typeId, kCollection.at(typeId));
  }
  return c->wrappedObject();
}

// The measurements of collection `id` of a container.
inline std::vector<SharedPointer<GenericObject>> measurementsOf(const SharedPointer<GenericObject>& c,
                                                                unsigned short id) {
  std::vector<SharedPointer<GenericObject>> out;
  SharedPointer<gom::ValueCollection> collection;
  if (!c || c->getCollectionProperty(id, collection) != Ok) return out;
  for (gom::Variant* v : *collection) {
    SharedPointer<GenericObject> m;
    if (v->getGenericObjectValue(m) == Ok) out.push_back(m);
  }
  return out;
}

// Property `id` of every measurement of collection `collection`; -1 where absent.
inline std::vector<long long> stampsOf(const SharedPointer<GenericObject>& c,
                                       unsigned short collection, unsigned short id) {
  std::vector<long long> out;
  for (const SharedPointer<GenericObject>& m : measurementsOf(c, collection)) {
    unsigned int value;
    out.push_back(m->getUint32Property(id, value) == Ok ? static_cast<long long>(value) : -1);
  }
  return out;
}

class TestPlatform : public RadioAdaptationCommon {
 public:
  enum class Answer { Later, Sync, Never, FailStart };

  // A platform whose init() succeeded on this thread's dispatcher.
  static std::unique_ptr<TestPlatform> create() {
    std::unique_ptr<TestPlatform> p(new TestPlatform());
    return p->init() ? std::move(p) : nullptr;
  }
  ~TestPlatform() override {
    // The engine's destructor can no longer reach this class's hooks.
    cancelAllRequests();
  }

  Answer answer = Answer::Later;
  Status answerStatus = Ok;  // the status the platform reports
  Status startFailure = Failed;
  // The result of a finished measurement of a kind.
  std::function<SharedPointer<GenericObject>(MeasurementType)> makeResult =
      [](MeasurementType type) {
        return type == Wlan ? containerOf({20}) : containerOf({2, 3});
      };
  // "request <kind>", "cancel <kind>", "subscribe <kinds> <0|1>" in order.
  std::vector<std::string> calls;

  void onSubscriptionChanged(int types, bool subscribed) override {
    calls.push_back("subscribe " + std::to_string(types) + (subscribed ? " 1" : " 0"));
  }

  // The platform's view of the modem state.
  void setUnreliable(int flags, std::time_t since) {
    networkStatusFlags = flags;
    unreliableSince = since;
  }
  std::time_t unreliableSinceForTest() const { return unreliableSince; }
  void complete(MeasurementType type, const SharedPointer<GenericObject>& m, Status status,
                bool deliverAsync) {
    handleRequestComplete(type, m, status, deliverAsync);
  }

 protected:
  Status doRequest(MeasurementType type) override {
    calls.push_back("request " + std::to_string(type));
    if (type == Gnss) return NotSupported;
    switch (answer) {
      case Answer::FailStart:
        return startFailure;
      case Answer::Sync:
        handleRequestComplete(type, makeResult(type), answerStatus, true);
        return Ok;
      case Answer::Later:
        later(type).timer->start(5, 0, 0);
        return Ok;
      case Answer::Never:
        return Ok;
    }
    return Ok;
  }
  Status doCancelRequest(MeasurementType type) override {
    calls.push_back("cancel " + std::to_string(type));
    if (type != Gnss) later(type).timer->stop();
    return Ok;
  }

 private:
  // The platform's own timer answering one kind later.
  struct LaterAnswer : core::ITimerObserver {
    LaterAnswer(TestPlatform& owner, MeasurementType type) : owner(owner), type(type) {}
    void timeout(core::ITimer*) override {
      owner.handleRequestComplete(type, owner.makeResult(type), owner.answerStatus, false);
    }
    TestPlatform& owner;
    MeasurementType type;
    SharedPointer<core::ITimer> timer{core::ITimer::create(this)};
  };

  TestPlatform() = default;
  LaterAnswer& later(MeasurementType type) { return type == Wlan ? laterWlan_ : laterCellular_; }

  LaterAnswer laterCellular_{*this, Cellular};
  LaterAnswer laterWlan_{*this, Wlan};
};

// One call of an observer.
struct Delivery {
  unsigned int requestId;
  int type;
  SharedPointer<GenericObject> measurements;
  Status status;
  double atSeconds;  // since the observer was made
};

// What reached an observer, and whether anything came while `inside` (set
// by tests around requestMeasurements) held.
struct DeliveryLog {
  std::vector<Delivery> got;
  bool inside = false;
  bool calledInside = false;
  std::function<void()> onDelivery;  // runs inside each call
  std::chrono::steady_clock::time_point start = std::chrono::steady_clock::now();

  void record(unsigned int id, int types, const SharedPointer<GenericObject>& m, Status status) {
    calledInside = calledInside || inside;
    got.push_back({id, types, m, status, core::testing::secondsSince(start)});
    if (onDelivery) onDelivery();
  }
  std::size_t count(int types) const {
    std::size_t n = 0;
    for (const Delivery& d : got) n += d.type == types;
    return n;
  }
  const Delivery* last(int types) const {
    for (auto d = got.rbegin(); d != got.rend(); ++d)
      if (d->type == types) return &*d;
    return nullptr;
  }
};

// A service observer that records what reaches it.
struct Recorder : IMeasurementsObserver, DeliveryLog {
  void measurementsReady(unsigned int id, int types, SharedPointer<GenericObject> m,
                         Status status) override {
    record(id, types, m, status);
  }
};

// Chooses the thread's loop type for a test and gives its dispatcher.
class DispatcherFixture : public ::testing::TestWithParam<core::AsyncCallDispatcher::MainLoopType> {
 protected:
  DispatcherFixture()
      : scope_(GetParam()),
        dispatcher_(core::AsyncCallDispatcher::openDispatcher(
            core::AsyncCallDispatcher::MainLoopDefault)) {}

  // Turns of the loop until `done` or `seconds` pass; returns done().
  bool runUntil(const std::function<bool()>& done, double seconds = 20.0) {
    return core::testing::runUntil(*dispatcher_, done, seconds);
  }
  // Lets the loop handle whatever is ready, for about `ms`.
  void settle(int ms = 30) {
    const auto start = std::chrono::steady_clock::now();
    while (core::testing::secondsSince(start) * 1000 < ms) dispatcher_->sleep(5);
  }

 private:
  core::testing::LoopTypeScope scope_;
  SharedPointer<core::IAsyncCallDispatcher> dispatcher_;
};

// The factory's adaptation and a provider over it on the test thread, made
// from the host platform's environment as it stands; `observer` watches.
class AdaptationFixture : public DispatcherFixture {
 protected:
  bool open(int kinds) {
    radio.reset(radioadaptation::RadioAdaptationFactory::createRadioAdaptation());
    if (!radio) return false;
    provider.reset(MeasurementsProvider::create(*radio));
    if (!provider) return false;
    provider->addObserver(observer, kinds);
    return true;
  }
  void TearDown() override {
    provider.reset();
    radio.reset();
  }
  Status request(int kind, unsigned int& id) {
    observer.inside = true;
    const Status status = provider->requestMeasurements(kind, id);
    observer.inside = false;
    return status;
  }
  // Requests one kind and waits for its result.
  const Delivery& requestAndWait(int kind, double seconds = 5.0) {
    unsigned int id = 0;
    const std::size_t before = observer.count(kind);
    EXPECT_EQ(request(kind, id), Ok);
    EXPECT_TRUE(runUntil([&] { return observer.count(kind) > before; }, seconds));
    static const Delivery none{};
    const Delivery* d = observer.last(kind);
    return d ? *d : none;
  }

  static const int kCellular = IMeasurementsObserver::Cellular;
  static const int kWlan = IMeasurementsObserver::Wlan;
  static const int kGnss = IMeasurementsObserver::Gnss;

  Recorder observer;
  std::unique_ptr<radioadaptation::IRadioAdaptation> radio;
  std::unique_ptr<MeasurementsProvider> provider;
};

inline std::string loopName(
    const ::testing::TestParamInfo<core::AsyncCallDispatcher::MainLoopType>& info) {
  return info.param == core::AsyncCallDispatcher::MainLoopPoll ? "Poll" : "Glib";
}

#define LODESTACK_ON_BOTH_LOOPS(Fixture)                                                  \
  INSTANTIATE_TEST_SUITE_P(Loops, Fixture,                                                \
                           ::testing::Values(core::AsyncCallDispatcher::MainLoopPoll,     \
                                             core::AsyncCallDispatcher::MainLoopGlib),    \
                           ::lodestack::testing::loopName)

}  // namespace testing
}  // namespace lodestack

#endif  // LODESTACK_TESTS_RADIOADAPTATION_TESTPLATFORM_H
