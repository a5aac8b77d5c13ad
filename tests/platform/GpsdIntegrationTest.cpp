// GNSS fixes from a real gpsd on the loopback, fed NMEA by the test, reaching
// an observer through the factory's adaptation and the provider; the service
// follows the feed and gpsd going away and coming back.
#include <memory>
#include <string>

#include "platform/GpsdTestSupport.h"

namespace lodestack {
namespace testing {
namespace {

// Keeps the position of every GNSS result.
struct GnssObserver : IMeasurementsObserver {
  std::vector<SharedPointer<schema::PositionEstimate>> fixes;
  int others = 0;

  void measurementsReady(unsigned int requestId, int types, SharedPointer<gom::GenericObject> m,
                         Status status) override {
    SharedPointer<schema::MeasurementContainer> c = schema::MeasurementContainer::create(m);
    SharedPointer<schema::GnssMeasurement> gnss =
        c ? schema::GnssMeasurement::create(c->gnssMeasurement(0)) : nullptr;
    SharedPointer<schema::PositionEstimate> p = gnss ? gnss->toPosition() : nullptr;
    if (requestId == 0 && types == Gnss && status == Ok && p)
      fixes.push_back(p);
    else
      ++others;
  }
};

class GpsdIntegration : public ::testing::Test {
 protected:
  void SetUp() override {
    if (!gpsdInstalled()) GTEST_SKIP() << kGpsd << " is missing: install Debian's gpsd package";
    port = freePort(SOCK_STREAM);
    feedPort = freePort(SOCK_DGRAM);
    gpsd = std::make_unique<GpsdProcess>(port, feedPort);
    ASSERT_TRUE(gpsd->start()) << "gpsd did not start listening on port " << port;
    feed = std::make_unique<NmeaFeed>(feedPort);
  }

  int port = -1, feedPort = -1;
  std::unique_ptr<GpsdProcess> gpsd;
  std::unique_ptr<NmeaFeed> feed;
};

TEST_F(GpsdIntegration, FixesFollowTheFeedAndGpsd) {
  EnvScope gnss("LODESTACK_GNSS", "gpsd:127.0.0.1:" + std::to_string(port));
  std::unique_ptr<radioadaptation::IRadioAdaptation> radio(
      radioadaptation::RadioAdaptationFactory::createRadioAdaptation());
  ASSERT_TRUE(radio) << platform::lastError();
  std::unique_ptr<MeasurementsProvider> provider(MeasurementsProvider::create(*radio));
  ASSERT_TRUE(provider && provider->initialize());
  GnssObserver observer;
  provider->addObserver(observer, IMeasurementsObserver::Gnss);
  StateLog state;  // a second manager, to see the service's state

  auto fixesArrive = [&](std::size_t more) {
    const std::size_t want = observer.fixes.size() + more;
    return runUntil([&] { return observer.fixes.size() >= want; }, 5.0);
  };
  // Once the state says disabled, the listener (a moment behind, on its own
  // connection) stops too: nothing more arrives.
  auto fixesStop = [&] {
    if (!runUntil([&] { return state.last(LOCATION_SERVICE_DISABLED); }, 5.0)) return false;
    runFor(0.3);
    const std::size_t before = observer.fixes.size();
    runFor(1.3);
    return observer.fixes.size() == before;
  };

  feed->start();
  ASSERT_TRUE(fixesArrive(2)) << "no GNSS results from gpsd";
  for (const SharedPointer<schema::PositionEstimate>& p : observer.fixes) {
    EXPECT_NEAR(p->latitude(), NmeaFeed::kLatitude, 1e-6);
    EXPECT_NEAR(p->longitude(), NmeaFeed::kLongitude, 1e-6);
    EXPECT_NEAR(p->speed(), 10.0, 0.01) << "19.44 knots";
  }
  EXPECT_EQ(observer.others, 0);
  EXPECT_TRUE(state.last(LOCATION_SERVICE_ENABLED));

  feed->stop();
  EXPECT_TRUE(fixesStop()) << "fixes went on after the feed stopped";
  feed->start();
  EXPECT_TRUE(fixesArrive(1)) << "no fixes after the feed came back";
  EXPECT_TRUE(state.last(LOCATION_SERVICE_ENABLED));

  gpsd->stop();
  EXPECT_TRUE(fixesStop()) << "fixes went on after gpsd stopped";
  ASSERT_TRUE(gpsd->start());
  EXPECT_TRUE(fixesArrive(1)) << "no fixes after gpsd came back";
  EXPECT_TRUE(state.last(LOCATION_SERVICE_ENABLED));
  EXPECT_TRUE(state.onTestThread);

  provider.reset();
  radio.reset();
}

}  // namespace
}  // namespace testing
}  // namespace lodestack
