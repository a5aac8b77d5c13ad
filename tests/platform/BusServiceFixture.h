// The adaptation over the bus services, end to end on a private bus: the
// factory's adaptation, a provider and an observer on the test thread, with
// LODESTACK_WLAN / LODESTACK_CELLS naming the services.
#ifndef LODESTACK_TESTS_PLATFORM_BUSSERVICEFIXTURE_H
#define LODESTACK_TESTS_PLATFORM_BUSSERVICEFIXTURE_H

#include <optional>

#include "platform/MockServices.h"
#include "radioadaptation/TestPlatform.h"

namespace lodestack {
namespace testing {

class BusServiceFixture : public AdaptationFixture {
 protected:
  void SetUp() override { ASSERT_EQ(bus.error(), ""); }
  // The adaptation with WLAN and cells from these sources (null: the scenario).
  bool openWith(const char* wlan, const char* cells, int kinds) {
    if (wlan) wlan_.emplace("LODESTACK_WLAN", wlan);
    if (cells) cells_.emplace("LODESTACK_CELLS", cells);
    return open(kinds);
  }
  // Lets the sources' bus threads hear of names that came or went.
  void letWatchesSettle() { settle(300); }

  // Requests one kind and waits past its time-out for the Timeout.
  Status requestUntilTimedOut(int kind) {
    const std::size_t before = observer.count(kind);
    unsigned int id = 0;
    EXPECT_EQ(request(kind, id), Ok);
    EXPECT_TRUE(runUntil([&] { return observer.count(kind) > before; }, 15.0));
    return observer.count(kind) > before ? observer.last(kind)->status : Ok;
  }

  PrivateBus bus;  // first: outlives the adaptation

 private:
  std::optional<EnvScope> wlan_, cells_;
};

}  // namespace testing
}  // namespace lodestack

#endif  // LODESTACK_TESTS_PLATFORM_BUSSERVICEFIXTURE_H
