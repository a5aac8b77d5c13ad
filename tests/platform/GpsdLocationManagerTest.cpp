// The location manager over gpsd, through its C interface: gpsd absent, and
// a fake gpsd on the loopback that says exactly what each case needs.
#include <algorithm>
#include <chrono>
#include <string>

#include "platform/GpsdTestSupport.h"

namespace lodestack {
namespace testing {
namespace {

using Clock = std::chrono::steady_clock;

const char kFullReport[] =
    "{\"class\":\"TPV\",\"mode\":3,\"time\":\"2024-05-06T07:08:09.000Z\",\"lat\":48.5,"
    "\"lon\":11.25,\"altHAE\":600.5,\"altMSL\":550.25,\"track\":84.5,\"speed\":10.0,"
    "\"climb\":0.5,\"eph\":12.5,\"epv\":20.0}\n";

std::string gpsdAt(int port) { return "gpsd:127.0.0.1:" + std::to_string(port); }

TEST(GpsdLocationManager, AbsentGpsdLeavesTheServiceDisabledUntilItStarts) {
  const int port = freePort(SOCK_STREAM);
  for (const std::string& env : {gpsdAt(port), std::string("gpsd:no-such-host.invalid")}) {
    SCOPED_TRACE(env);
    EnvScope gnss("LODESTACK_GNSS", env);
    const auto start = Clock::now();
    {
      StateLog log;
      EXPECT_TRUE(log.states.empty()) << "the state is reported from the loop, not from inside";
      ASSERT_TRUE(runUntil([&] { return !log.states.empty(); }, 2.0));
      EXPECT_EQ(log.states, std::vector<location_service_state_e>{LOCATION_SERVICE_DISABLED});
      EXPECT_EQ(log.location().result, LOCATION_ERROR_NO_POSITION);
      EXPECT_TRUE(log.onTestThread);
    }
    EXPECT_LT(core::testing::secondsSince(start), 1.5);
  }

  EnvScope gnss("LODESTACK_GNSS", gpsdAt(port));
  StateLog log;
  ASSERT_TRUE(runUntil([&] { return log.last(LOCATION_SERVICE_DISABLED); }, 2.0));
  runFor(0.5);  // ample for the first attempt to be refused
  FakeGpsd gpsd(port);
  gpsd.greeting = kFullReport;
  const auto started = Clock::now();
  ASSERT_TRUE(runUntil([&] { return log.last(LOCATION_SERVICE_ENABLED); }, 4.0));
  EXPECT_GT(core::testing::secondsSince(started), 1.0) << "the next attempt comes 2 s after";
  EXPECT_EQ(gpsd.accepted(), 1);
  EXPECT_EQ(log.location().result, LOCATION_ERROR_NONE);
}

TEST(GpsdLocationManager, HandsOverReportsAndFillsWhatGpsdLeavesOut) {
  FakeGpsd gpsd;
  EnvScope gnss("LODESTACK_GNSS", gpsdAt(gpsd.port()));
  StateLog log;
  ASSERT_TRUE(runUntil([&] { return gpsd.accepted() == 1 && !log.states.empty(); }, 2.0));
  EXPECT_TRUE(log.last(LOCATION_SERVICE_DISABLED)) << "connected, but no fix yet";
  EXPECT_EQ(log.location().result, LOCATION_ERROR_NO_POSITION);

  auto nextFix = [&](const std::string& lines, double latitude) {
    gpsd.send(lines);
    return runUntil([&] { return log.location().latitude == latitude; }, 2.0);
  };

  // Other messages, garbage and unusable coordinates change nothing.
  ASSERT_TRUE(nextFix(
      "{\"class\":\"VERSION\",\"release\":\"3.22\"}\n{\"class\":\"SKY\"}\nnot json\n{{{\n\n"
      "{\"class\":\"TPV\",\"mode\":3,\"lat\":1e300,\"lon\":0}\n"
      "{\"class\":\"TPV\",\"mode\":7,\"lat\":1,\"lon\":1}\n" +
          std::string(kFullReport),
      48.5));
  StateLog::Fix f = log.location();
  EXPECT_EQ(f.result, LOCATION_ERROR_NONE);
  EXPECT_DOUBLE_EQ(f.longitude, 11.25);
  EXPECT_DOUBLE_EQ(f.speed, 36.0) << "m/s are handed over as km/h";
  EXPECT_DOUBLE_EQ(f.horizontal, 12.5);
  EXPECT_DOUBLE_EQ(f.vertical, 20.0);
  EXPECT_DOUBLE_EQ(f.altitude, 550.25);
  EXPECT_DOUBLE_EQ(f.direction, 84.5);
  EXPECT_DOUBLE_EQ(f.climb, 0.5);
  EXPECT_EQ(f.level, LOCATION_ACCURACY_DETAILED);
  EXPECT_EQ(f.time, 1714979289);
  EXPECT_TRUE(log.last(LOCATION_SERVICE_ENABLED));

  // A 2D fix with no speed, time or error estimate: the documented stand-ins.
  ASSERT_TRUE(nextFix("{\"class\":\"TPV\",\"mode\":2,\"lat\":-33.75,\"lon\":180.0}\n", -33.75));
  f = log.location();
  EXPECT_DOUBLE_EQ(f.longitude, -180.0) << "180 east is 180 west";
  EXPECT_EQ(f.speed, 0.0);
  EXPECT_EQ(f.horizontal, 100.0);
  EXPECT_EQ(f.altitude, 0.0);
  EXPECT_EQ(f.vertical, 0.0);
  EXPECT_LE(std::abs(f.time - std::time(nullptr)), 2) << "the time of arrival";

  // Without eph, the larger of the two axis errors.
  ASSERT_TRUE(nextFix("{\"class\":\"TPV\",\"mode\":2,\"lat\":1.5,\"lon\":2.5,\"epx\":7.5,"
                      "\"epy\":9.0,\"speed\":-1}\n",
                      1.5));
  f = log.location();
  EXPECT_EQ(f.horizontal, 9.0);
  EXPECT_EQ(f.speed, 0.0) << "a negative speed is no speed";

  // Losing the fix disables at once; a new one enables again.
  gpsd.send("{\"class\":\"TPV\",\"mode\":1}\n");
  ASSERT_TRUE(runUntil([&] { return log.last(LOCATION_SERVICE_DISABLED); }, 2.0));
  EXPECT_EQ(log.location().result, LOCATION_ERROR_NO_POSITION);
  ASSERT_TRUE(nextFix(kFullReport, 48.5));
  EXPECT_EQ(log.states,
            (std::vector<location_service_state_e>{LOCATION_SERVICE_DISABLED, LOCATION_SERVICE_ENABLED,
                                                   LOCATION_SERVICE_DISABLED, LOCATION_SERVICE_ENABLED}));
  EXPECT_TRUE(log.onTestThread);
}

TEST(GpsdLocationManager, DisablesWhenFixesStopAndRecoversFromClosedOrOverflowingConnections) {
  FakeGpsd gpsd;
  gpsd.greeting = kFullReport;
  EnvScope gnss("LODESTACK_GNSS", gpsdAt(gpsd.port()));
  StateLog log;
  ASSERT_TRUE(runUntil([&] { return log.last(LOCATION_SERVICE_ENABLED); }, 2.0));
  const auto lastFix = Clock::now();
  ASSERT_TRUE(runUntil([&] { return log.last(LOCATION_SERVICE_DISABLED); }, 5.0));
  const double silent = core::testing::secondsSince(lastFix);
  EXPECT_GT(silent, 2.5);
  EXPECT_LT(silent, 4.0);
  EXPECT_EQ(log.location().result, LOCATION_ERROR_NO_POSITION);
  EXPECT_EQ(gpsd.accepted(), 1) << "a quiet gpsd keeps its connection";

  gpsd.send(kFullReport);
  ASSERT_TRUE(runUntil([&] { return log.last(LOCATION_SERVICE_ENABLED); }, 2.0));
  gpsd.dropClient();
  ASSERT_TRUE(runUntil([&] { return log.last(LOCATION_SERVICE_DISABLED); }, 1.0))
      << "a closed connection disables at once";
  ASSERT_TRUE(runUntil([&] { return log.last(LOCATION_SERVICE_ENABLED); }, 4.0));
  EXPECT_EQ(gpsd.accepted(), 2);

  // A message longer than any gpsd sends ends the connection too.
  gpsd.send("{\"class\":\"TPV\",\"device\":\"" + std::string(100000, 'x'));
  ASSERT_TRUE(runUntil([&] { return log.last(LOCATION_SERVICE_DISABLED); }, 1.0));
  ASSERT_TRUE(runUntil([&] { return log.last(LOCATION_SERVICE_ENABLED); }, 4.0));
  EXPECT_EQ(gpsd.accepted(), 3);

  // A reset is never handed over by the loop, yet it is noticed long before
  // the fix would time out, and without spinning until then.
  const std::clock_t cpuBefore = std::clock();
  gpsd.resetClient();
  ASSERT_TRUE(runUntil([&] { return log.last(LOCATION_SERVICE_DISABLED); }, 1.0))
      << "a reset connection disables at once";
  EXPECT_LT(static_cast<double>(std::clock() - cpuBefore) / CLOCKS_PER_SEC, 0.5);
  ASSERT_TRUE(runUntil([&] { return log.last(LOCATION_SERVICE_ENABLED); }, 4.0));
  EXPECT_EQ(gpsd.accepted(), 4);
  // The first report is disabled or, when the first fix came sooner, enabled.
  const std::vector<location_service_state_e> after(
      std::find(log.states.begin(), log.states.end(), LOCATION_SERVICE_ENABLED), log.states.end());
  EXPECT_EQ(after, (std::vector<location_service_state_e>{
                       LOCATION_SERVICE_ENABLED, LOCATION_SERVICE_DISABLED, LOCATION_SERVICE_ENABLED,
                       LOCATION_SERVICE_DISABLED, LOCATION_SERVICE_ENABLED, LOCATION_SERVICE_DISABLED,
                       LOCATION_SERVICE_ENABLED, LOCATION_SERVICE_DISABLED, LOCATION_SERVICE_ENABLED}));
  EXPECT_TRUE(log.onTestThread);
}

// Last: the hanging attempt holds up other attempts in this process until
// the listener closes.
TEST(GpsdLocationManager, DestroyingDuringAHangingConnectReturnsAtOnce) {
  FakeGpsd stalled(0, true);
  EnvScope gnss("LODESTACK_GNSS", gpsdAt(stalled.port()));
  const auto start = Clock::now();
  {
    StateLog log;
    ASSERT_TRUE(runUntil([&] { return log.last(LOCATION_SERVICE_DISABLED); }, 1.0));
    runFor(0.2);
    EXPECT_EQ(log.states.size(), 1u);
  }
  EXPECT_LT(core::testing::secondsSince(start), 1.0);
}

}  // namespace
}  // namespace testing
}  // namespace lodestack
