// Locator: asks a geolocation web service (--locate) where each round's
// measurements were taken, and prints its answer compared with the round's
// GNSS fix.
//
// It is handed every result of the run. At the end of a round it builds the
// round's geolocation request (see GeolocationRequest.h) and, unless the
// request is one the services cannot answer, posts it once on a thread of
// its own while the caller keeps turning the event loop: GNSS fixes go on
// arriving and printing meanwhile, and a signal still ends the run at once.
// The round's fix is the last one received before the round ended.
//
// Output: a position line (locationText) or, with --json or
// --geolocation-request, one JSON object (locationJson) on `out`; anything
// that gave no position is one line "lodestack-scan: location: <why>" on
// `err`, and the run goes on. Used from the event loop's thread only.
#ifndef LODESTACK_SCAN_LOCATOR_H
#define LODESTACK_SCAN_LOCATOR_H

#include <atomic>
#include <future>
#include <optional>
#include <ostream>
#include <thread>

#include <lodestack/core/IAsyncCallDispatcher.h>

#include "GeolocationRequest.h"
#include "GeolocationService.h"
#include "Location.h"
#include "Options.h"

namespace lodestack {
namespace scan {

class Locator {
 public:
  Locator(const Options& options, std::ostream& out, std::ostream& err);
  // Abandons an exchange still running and waits for its thread.
  ~Locator();
  Locator(const Locator&) = delete;
  Locator& operator=(const Locator&) = delete;

  // Keeps what the round's request and its comparison need. Throws Status
  // WrongObjectType for a result that is not a measurement tree.
  void take(const Result& result);

  // Ends the round: starts posting its request, or says why none is sent.
  // `dispatcher` is woken when the answer is in; it must outlive finish().
  void start(core::IAsyncCallDispatcher& dispatcher);
  // Whether the round's exchange is still under way.
  bool busy() const;
  // Prints the round's answer. An exchange still under way (the run is
  // being interrupted) is abandoned and prints nothing.
  void finish();

 private:
  void say(const std::string& why);

  std::ostream& out_;
  std::ostream& err_;
  const bool json_;
  const GeolocationService service_;
  RoundMeasurements round_;
  unsigned int technology_ = 0;  // PositionEstimate::Technology of the request sent
  std::optional<Fix> lastFix_;
  std::optional<Fix> roundFix_;
  std::atomic<bool> abandon_{false};
  std::future<ServiceAnswer> answer_;
  std::thread worker_;
};

}  // namespace scan
}  // namespace lodestack

#endif  // LODESTACK_SCAN_LOCATOR_H
