#include "Locator.h"

#include <pthread.h>
#include <signal.h>

#include <chrono>
#include <system_error>
#include <utility>

namespace lodestack {
namespace scan {
namespace {

using schema::PositionEstimate;

// Queued from the exchange's thread: ends the loop's sleep at once, so the
// answer is printed as soon as it is in.
void wake(void*) {}

// Blocks SIGINT and SIGTERM on the calling thread while it lives, so that a
// thread started meanwhile leaves them to the loop's thread.
class SignalsBlocked {
 public:
  SignalsBlocked() {
    sigset_t signals;
    sigemptyset(&signals);
    sigaddset(&signals, SIGINT);
    sigaddset(&signals, SIGTERM);
    pthread_sigmask(SIG_BLOCK, &signals, &old_);
  }
  ~SignalsBlocked() { pthread_sigmask(SIG_SETMASK, &old_, nullptr); }
  SignalsBlocked(const SignalsBlocked&) = delete;
  SignalsBlocked& operator=(const SignalsBlocked&) = delete;

 private:
  sigset_t old_;
};

}  // namespace

Locator::Locator(const Options& options, std::ostream& out, std::ostream& err)
    : out_(out),
      err_(err),
      json_(options.json || options.geolocation),
      service_(options.locateUrl, options.locateKey, options.locateTimeoutS) {}

Locator::~Locator() {
  if (!worker_.joinable()) return;
  abandon_ = true;
  worker_.join();
}

void Locator::take(const Result& result) {
  round_.take(result);
  if (result.kind != IMeasurementsObserver::Gnss || !isUsable(result.status) ||
      !result.measurements) {
    return;
  }
  for (const Json& fix : measurementTree(result.measurements).value("gnss", Json::array())) {
    if (fix.contains("latitude") && fix.contains("longitude")) {
      lastFix_ = Fix{fix["latitude"].get<double>(), fix["longitude"].get<double>()};
    }
  }
}

void Locator::start(core::IAsyncCallDispatcher& dispatcher) {
  Json request;
  try {
    request = round_.request();
  } catch (Status) {
    request = Json();
  }
  round_.clear();
  roundFix_ = lastFix_;
  if (request.is_null()) return say("the round's results are not measurement trees");
  const std::string why = whyNotLocatable(request);
  if (!why.empty()) return say(why);

  technology_ = (request["cellTowers"].empty() ? 0u : PositionEstimate::TechnologyCellular) |
                (request["wifiAccessPoints"].empty() ? 0u : PositionEstimate::TechnologyWlan);
  abandon_ = false;
  std::promise<ServiceAnswer> promise;
  answer_ = promise.get_future();
  core::IAsyncCallDispatcher* loop = &dispatcher;  // queueing is allowed from any thread
  const SignalsBlocked blocked;
  try {
    worker_ =
        std::thread([this, loop, body = request.dump(), promise = std::move(promise)]() mutable {
          promise.set_value(service_.post(body, abandon_));
          loop->queueAsyncCall(&wake, nullptr);
        });
  } catch (const std::system_error&) {
    answer_ = std::future<ServiceAnswer>();
    say("the request could not be started");
  }
}

bool Locator::busy() const {
  return worker_.joinable() &&
         answer_.wait_for(std::chrono::seconds(0)) != std::future_status::ready;
}

void Locator::finish() {
  if (!worker_.joinable()) return;
  if (busy()) abandon_ = true;
  worker_.join();
  const ServiceAnswer answer = answer_.get();
  if (abandon_) return;
  if (!answer.failure.empty()) return say(answer.failure);
  Location location;
  std::string error;
  if (!readAnswer(answer.status, answer.body, location, error)) return say(error);
  location.position->setTechnology(technology_);
  if (json_) {
    out_ << locationJson(location, roundFix_).dump() << '\n';
  } else {
    out_ << locationText(location, roundFix_);
  }
  out_ << std::flush;
}

void Locator::say(const std::string& why) {
  err_ << "lodestack-scan: location: " << why << '\n' << std::flush;
}

}  // namespace scan
}  // namespace lodestack
