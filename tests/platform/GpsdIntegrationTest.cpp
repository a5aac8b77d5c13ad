// GNSS fixes from a real gpsd on the loopback, fed NMEA by the test, reaching
// an observer through the factory's adaptation and the provider; the service
// follows the feed and gpsd going away and coming back.
#include <string>

#include "platform/GpsdTestSupport.h"
#include "radioadaptation/TestPlatform.h"

namespace lodestack {
namespace testing {
namespace {

SharedPointer<schema::PositionEstimate> positionOf(const Delivery& d) {
  SharedPointer<schema::MeasurementContainer> c = schema::MeasurementContainer::create(d.measurements);
  SharedPointer<schema::GnssMeasurement> gnss =
      c ? schema::GnssMeasurement::create(c->gnssMeasurement(0)) : nullptr;
  return gnss ? gnss->toPosition() : nullptr;
}

class GpsdIntegration : public AdaptationFixture {
 protected:
  void SetUp() override {
    if (!gpsdInstalled()) GTEST_SKIP() << kGpsd << " is missing: install Debian's gpsd package";
    ASSERT_TRUE(startGpsd(gpsd, port, feedPort)) << "gpsd did not start listening on port " << port;
  }

  const int port = freePort(SOCK_STREAM);
  const int feedPort = freePort(SOCK_DGRAM);
  ChildProcess gpsd;
  NmeaFeed feed{feedPort};
  EnvScope gnss{"LODESTACK_GNSS", "gpsd:127.0.0.1:" + std::to_string(port)};
};

TEST_P(GpsdIntegration, FixesFollowTheFeedAndGpsd) {
  ASSERT_TRUE(open(kGnss)) << platform::lastError();
  StateLog state;  // a second manager, to see the service's state

  auto fixesArrive = [&](std::size_t more) {
    const std::size_t want = observer.got.size() + more;
    return runUntil([&] { return observer.got.size() >= want; }, 5.0);
  };
  // Once the state says disabled, the listener (a moment behind, on its own
  // connection) stops too: nothing more arrives.
  auto fixesStop = [&] {
    if (!runUntil([&] { return state.last(LOCATION_SERVICE_DISABLED); }, 5.0)) return false;
    settle(300);
    const std::size_t before = observer.got.size();
    settle(1300);
    return observer.got.size() == before;
  };

  feed.start();
  ASSERT_TRUE(fixesArrive(2)) << "no GNSS results from gpsd";
  EXPECT_TRUE(state.last(LOCATION_SERVICE_ENABLED));

  feed.stop();
  EXPECT_TRUE(fixesStop()) << "fixes went on after the feed stopped";
  feed.start();
  EXPECT_TRUE(fixesArrive(1)) << "no fixes after the feed came back";
  EXPECT_TRUE(state.last(LOCATION_SERVICE_ENABLED));

  gpsd.stop();
  EXPECT_TRUE(fixesStop()) << "fixes went on after gpsd stopped";
  ASSERT_TRUE(startGpsd(gpsd, port, feedPort));
  EXPECT_TRUE(fixesArrive(1)) << "no fixes after gpsd came back";
  EXPECT_TRUE(state.last(LOCATION_SERVICE_ENABLED));
  EXPECT_TRUE(state.onTestThread);

  for (const Delivery& d : observer.got) {
    const SharedPointer<schema::PositionEstimate> p = positionOf(d);
    ASSERT_TRUE(d.requestId == 0 && d.type == kGnss && d.status == Ok && p)
        << "request " << d.requestId << ", kind " << d.type << ", status " << d.status;
    EXPECT_NEAR(p->latitude(), NmeaFeed::kLatitude, 1e-6);
    EXPECT_NEAR(p->longitude(), NmeaFeed::kLongitude, 1e-6);
    EXPECT_NEAR(p->speed(), 10.0, 0.01) << "19.44 knots";
  }
}

// One dispatcher kind is enough: the run takes seconds.
INSTANTIATE_TEST_SUITE_P(Loops, GpsdIntegration,
                         ::testing::Values(core::AsyncCallDispatcher::MainLoopGlib), loopName);

}  // namespace
}  // namespace testing
}  // namespace lodestack
