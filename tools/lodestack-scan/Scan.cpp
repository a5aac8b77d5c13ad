#include "Scan.h"

#include <signal.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstring>
#include <csignal>
#include <cstdlib>
#include <memory>
#include <string>

#include <lodestack/core/AsyncCallDispatcher.h>
#include <lodestack/debug/DebugLinux.h>
#include <lodestack/measurements/MeasurementsProvider.h>
#include <lodestack/platform/HostPlatform.h>
#include <lodestack/radioadaptation/RadioAdaptationFactory.h>

#include "Locator.h"
#include "ResultPrinter.h"
#include "ResultsFile.h"

namespace lodestack {
namespace scan {
namespace {

using Clock = std::chrono::steady_clock;

// The longest the loop sleeps before it looks at the signal flag again. A
// signal also ends the dispatcher's poll at once (the handlers do not ask
// for restarted calls); this bounds the wait when it lands just before it.
constexpr int kSliceMs = 100;

volatile std::sig_atomic_t caughtSignal = 0;

extern "C" void onSignal(int signalNumber) { caughtSignal = signalNumber; }

// SIGINT and SIGTERM only set caughtSignal while a scan runs.
class SignalHandlers {
 public:
  SignalHandlers() {
    caughtSignal = 0;
    struct sigaction action {};
    action.sa_handler = onSignal;
    sigemptyset(&action.sa_mask);
    sigaction(SIGINT, &action, &oldInt_);
    sigaction(SIGTERM, &action, &oldTerm_);
  }
  ~SignalHandlers() {
    sigaction(SIGINT, &oldInt_, nullptr);
    sigaction(SIGTERM, &oldTerm_, nullptr);
  }
  SignalHandlers(const SignalHandlers&) = delete;
  SignalHandlers& operator=(const SignalHandlers&) = delete;

 private:
  struct sigaction oldInt_ {};
  struct sigaction oldTerm_ {};
};

// Receives every result, prints and records it, and tells when the round's
// requests are all answered.
class Session : public IMeasurementsObserver {
 public:
  Session(ResultPrinter& printer, ResultsWriter* writer, Locator* locator, std::ostream& err)
      : printer_(printer), writer_(writer), locator_(locator), err_(err) {}

  void measurementsReady(unsigned int requestId, int types,
                         gom::SharedPointer<gom::GenericObject> measurements,
                         Status status) override {
    report(Result{types, requestId, status, measurements});
    if (types == Cellular && isUsable(status)) noteSkippedCells(requestId);
    if (types != Gnss && !isUsable(status)) notePlatformError();
    // Request ids start at 1, so 0 never matches a pending request.
    if (types == Cellular && requestId == pendingCellular_) pendingCellular_ = 0;
    if (types == Wlan && requestId == pendingWlan_) pendingWlan_ = 0;
    if (types == Gnss) waitingForGnss_ = false;
  }

  void report(const Result& result) {
    try {
      printer_.print(result);
      if (locator_) locator_->take(result);
    } catch (Status) {
      const char* kind = kindName(result.kind);
      fail(std::string("a ") + (kind ? kind : "measurement") + " result is not a measurement tree");
    }
    std::string error;
    if (writer_ && !writer_->write(result, error)) fail(error);
  }

  void expect(int kind, unsigned int requestId) {
    (kind == Cellular ? pendingCellular_ : pendingWlan_) = requestId;
  }
  // A round without requests lasts until the next GNSS fix.
  void waitForGnss() { waitingForGnss_ = true; }
  bool roundDone() const { return !pendingCellular_ && !pendingWlan_ && !waitingForGnss_; }

  void endRound() {
    try {
      printer_.endRound();
    } catch (Status) {
      fail("the round's results are not measurement trees");
    }
  }

  bool failed() const { return failed_; }

  // Why the platform failed a request, once per reason: a service that is
  // absent, refuses or answers badly, or no WLAN source at all.
  void notePlatformError() {
    const std::string why = platform::lastError();
    if (why.empty() || why == lastNote_) return;
    err_ << "lodestack-scan: " << why << "\n";
    lastNote_ = why;
  }

 private:
  // Cells of the modem's answer that have no records (NR, CDMA), told when
  // their number changes.
  void noteSkippedCells(unsigned int requestId) {
    const platform::SkippedCells skipped = platform::lastSkippedCells();
    if (skipped.nr == skipped_.nr && skipped.cdma == skipped_.cdma) return;
    skipped_ = skipped;
    if (skipped.nr == 0 && skipped.cdma == 0) return;
    err_ << "lodestack-scan: cellular request " << requestId << ": skipped " << skipped.nr
         << " NR and " << skipped.cdma << " CDMA cell(s): lodestack has no records for them\n";
  }

  void fail(const std::string& error) {
    if (!failed_) err_ << "lodestack-scan: " << error << "\n";
    failed_ = true;
  }

  ResultPrinter& printer_;
  ResultsWriter* writer_;
  Locator* locator_;
  std::ostream& err_;
  unsigned int pendingCellular_ = 0;
  unsigned int pendingWlan_ = 0;
  bool waitingForGnss_ = false;
  bool failed_ = false;
  platform::SkippedCells skipped_;
  std::string lastNote_;
};

class Scanner {
 public:
  Scanner(const Options& options, core::IAsyncCallDispatcher& dispatcher,
          MeasurementsProvider& provider, Session& session, Locator* locator)
      : options_(options),
        dispatcher_(dispatcher),
        provider_(provider),
        session_(session),
        locator_(locator) {}

  void run() {
    for (int round = 1; going(); ++round) {
      request(IMeasurementsObserver::Cellular);
      request(IMeasurementsObserver::Wlan);
      if (!(options_.kinds & (IMeasurementsObserver::Cellular | IMeasurementsObserver::Wlan))) {
        session_.waitForGnss();
      }
      while (going() && !session_.roundDone()) dispatcher_.sleep(kSliceMs);
      if (!going()) return;
      session_.endRound();
      if (locator_) locate(*locator_);
      if (!going()) return;
      if (options_.rounds != 0 && round >= options_.rounds) return;
      pause(std::chrono::milliseconds(options_.intervalMs));
    }
  }

 private:
  bool going() const { return !caughtSignal && !session_.failed(); }

  void request(int kind) {
    if (!(options_.kinds & kind)) return;
    unsigned int requestId = 0;
    const Status status = provider_.requestMeasurements(kind, requestId);
    if (status == Ok) {
      session_.expect(kind, requestId);
    } else {
      // No result will come; the refusal stands in for it.
      session_.report(Result{kind, 0, status, gom::SharedPointer<gom::GenericObject>()});
      session_.notePlatformError();
    }
  }

  // The round's request to the geolocation service; the loop keeps turning
  // until its answer, bounded by the service's time-out.
  void locate(Locator& locator) {
    locator.start(dispatcher_);
    while (going() && locator.busy()) dispatcher_.sleep(kSliceMs);
    locator.finish();
  }

  // Keeps the loop turning (GNSS fixes arrive meanwhile) for `duration`.
  void pause(std::chrono::milliseconds duration) {
    const Clock::time_point end = Clock::now() + duration;
    for (Clock::time_point now = Clock::now(); going() && now < end; now = Clock::now()) {
      const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(end - now).count();
      dispatcher_.sleep(static_cast<int>(std::min<long long>(std::max<long long>(left, 1),
                                                             kSliceMs)));
    }
  }

  const Options& options_;
  core::IAsyncCallDispatcher& dispatcher_;
  MeasurementsProvider& provider_;
  Session& session_;
  Locator* locator_;
};

}  // namespace

// The library logs only while a logger is installed: --log-config installs
// one for the run and takes it down at the end.
class LogScope {
 public:
  ~LogScope() {
    if (installed_) Debug::release();
  }
  // Empty when installed with `path`'s settings; otherwise why not.
  std::string install(const std::string& path) {
    std::FILE* file = std::fopen(path.c_str(), "r");
    if (!file) return path + ": " + std::strerror(errno);
    std::fclose(file);
    const Status status = DebugLinux::install(path.c_str(), nullptr);
    installed_ = status == Ok || status == FileError;
    if (status == Ok) return std::string();
    if (status == FileError)
      return path + ": the log configuration cannot be read or names a log file that cannot be written";
    return path + ": the debug log could not be started (" + statusName(status) + ")";
  }

 private:
  bool installed_ = false;
};

int runScan(const Options& options, std::ostream& out, std::ostream& err) {
  const auto failWith = [&](const std::string& error) {
    err << "lodestack-scan: " << error << "\n";
    return ExitFailure;
  };
  LogScope log;
  if (!options.logConfig.empty()) {
    const std::string why = log.install(options.logConfig);
    if (!why.empty()) return failWith(why);
  }
  // The host platform reads its configuration from the environment when the
  // adaptation is made.
  if (!options.scenario.empty()) {
    const std::string why = platform::checkScenarioFile(options.scenario);
    if (!why.empty()) return failWith(why);
    setenv("LODESTACK_SCENARIO", options.scenario.c_str(), 1);
  }
  if (!options.gnss.empty()) setenv("LODESTACK_GNSS", options.gnss.c_str(), 1);
  if (!options.wlan.empty()) setenv("LODESTACK_WLAN", options.wlan.c_str(), 1);
  if (!options.cells.empty()) setenv("LODESTACK_CELLS", options.cells.c_str(), 1);

  ResultsWriter writer;
  std::string error;
  if (!options.out.empty() && !writer.open(options.out, options.store, error))
    return failWith(error);
  const std::unique_ptr<ResultPrinter> printer = makePrinter(options, out);
  const SignalHandlers signals;

  // The poll-driven loop: the tool has no GLib main loop of its own, and
  // the loop below drives the dispatcher with sleep().
  try {
    core::AsyncCallDispatcher::setMainLoopType(core::AsyncCallDispatcher::MainLoopPoll);
  } catch (Status) {
    // The thread chose its kind before; keep it.
  }
  const gom::SharedPointer<core::IAsyncCallDispatcher> dispatcher =
      core::AsyncCallDispatcher::openDispatcher(core::AsyncCallDispatcher::MainLoopDefault);
  if (!dispatcher) return failWith("the event loop could not be opened");

  const std::unique_ptr<radioadaptation::IRadioAdaptation> radio(
      radioadaptation::RadioAdaptationFactory::createRadioAdaptation());
  if (!radio) {
    const std::string why = platform::lastError();
    return failWith(why.empty() ? "the radio adaptation could not be made" : why);
  }
  const std::unique_ptr<Locator> locator(
      options.locateUrl.empty() ? nullptr : new Locator(options, out, err));
  Session session(*printer, options.out.empty() ? nullptr : &writer, locator.get(), err);
  {
    // Destroyed before the adaptation: unsubscribes and cancels what is
    // pending.
    const std::unique_ptr<MeasurementsProvider> provider(MeasurementsProvider::create(*radio));
    if (!provider) return failWith("the measurements provider could not be made");
    provider->addObserver(session, options.kinds);
    Scanner(options, *dispatcher, *provider, session, locator.get()).run();
  }
  writer.close();
  if (caughtSignal) return 128 + caughtSignal;
  return session.failed() ? ExitFailure : ExitOk;
}

}  // namespace scan
}  // namespace lodestack
