// gpsd as a location source, through libgps on the dispatcher's loop.
//
// The service counts as enabled while gpsd delivers 2D or 3D fixes. It turns
// disabled when a report drops below 2D, when no fix has come for
// kFixTimeoutMs, or when the connection to gpsd closes or cannot be made;
// while gpsd is away a new connection is tried every kReconnectMs.
// The loop never hands over input that comes with an error or hang-up (a
// connection gpsd reset), and such a descriptor keeps the loop awake, so
// while connected the socket is also looked at every kLivenessCheckMs.
//
// Resolving the host and connecting may block for long (a name server that
// does not answer, a host that drops packets), so each attempt runs on a
// thread of its own, which signals an eventfd when it is done; everything
// else, reading included, happens on the dispatcher's thread with the socket
// in non-blocking mode. gps_open is not reentrant (it looks the protocol up
// with getprotobyname), so attempts of all sources take turns.
#include <fcntl.h>
#include <gps.h>
#include <poll.h>
#include <sys/eventfd.h>
#include <unistd.h>

#include <cerrno>
#include <cmath>
#include <cstdint>
#include <atomic>
#include <memory>
#include <mutex>
#include <system_error>
#include <thread>

#include "lodestack/core/AsyncCallDispatcher.h"
#include "lodestack/core/ITimer.h"
#include "lodestack/core/LinAsyncCallDispatcher.h"
#include "lodestack/core/Status.h"
#include "lodestack/debug/Debug.h"
#include "lodestack/gom/SharedPointer.h"
#include "platform/host/LocationSource.h"
#include "platform/host/Scenario.h"

namespace lodestack {
namespace platform {
namespace host {

namespace {

using core::ITimer;
using core::LinAsyncCallDispatcher;
using gom::SharedPointer;

const long long kFixTimeoutMs = 3000;
const long long kReconnectMs = 2000;
const long long kLivenessCheckMs = 200;
// Handed over when gpsd gives no horizontal error estimate: deliberately
// pessimistic, so that such a fix weighs little.
const double kUnknownAccuracyM = 100.0;
const double kMaxAccuracyM = 4294967295.0;
const double kKmhPerMs = 3.6;
// Messages taken per readiness event; a peer flooding faster is read on the
// following turns, so that other work on the loop goes on.
const int kMaxMessagesPerEvent = 1024;

// One connection to gpsd, shared with the thread that opens it: whichever
// lets go last closes it.
struct Connection {
  gps_data_t data{};
  // Written by the opening thread before it signals doneFd.
  bool open = false;
  const char* failure = nullptr;  // why it could not connect or watch
  int doneFd = -1;
  std::atomic<bool> abandoned{false};  // its source is gone: do not start

  ~Connection() {
    if (open) gps_close(&data);
    if (doneFd >= 0) close(doneFd);
  }
};

void openConnection(const std::shared_ptr<Connection>& c, const std::string& host,
                    const std::string& port) {
  static std::mutex turns;
  std::unique_lock<std::mutex> turn(turns);
  if (c->abandoned) {
    c->failure = "abandoned";
  } else if (gps_open(host.c_str(), port.c_str(), &c->data) != 0) {
    // gps_open leaves a negative libgps code in errno; its texts are static.
    c->failure = errno < 0 ? gps_errstr(errno) : "cannot connect";
  } else {
    c->open = true;
    const int flags = c->data.gps_fd > 0 ? fcntl(c->data.gps_fd, F_GETFL) : -1;
    if (flags < 0 || gps_stream(&c->data, WATCH_ENABLE | WATCH_JSON, nullptr) != 0 ||
        fcntl(c->data.gps_fd, F_SETFL, flags | O_NONBLOCK) < 0)
      c->failure = "cannot ask for fixes";
  }
  turn.unlock();
  const std::uint64_t one = 1;
  (void)!write(c->doneFd, &one, sizeof one);
}

double finiteOr(double value, double fallback) { return std::isfinite(value) ? value : fallback; }

bool usableAccuracy(double metres) { return metres > 0 && metres <= kMaxAccuracyM; }

// The position of a 2D or 3D fix; false when its coordinates are unusable.
// What gpsd leaves unknown is handed over as 0, except the horizontal
// accuracy (kUnknownAccuracyM) and the time (now).
bool toPosition(const gps_fix_t& fix, Position& out) {
  if (fix.mode != MODE_2D && fix.mode != MODE_3D) return false;
  if (!(fix.latitude >= -90 && fix.latitude <= 90) ||
      !(fix.longitude >= -180 && fix.longitude <= 180))
    return false;
  out.latitude = fix.latitude;
  out.longitude = fix.longitude == 180 ? -180 : fix.longitude;
  if (usableAccuracy(fix.eph))
    out.horizontal = fix.eph;
  else if (usableAccuracy(std::fmax(fix.epx, fix.epy)))  // fmax skips a NaN
    out.horizontal = std::fmax(fix.epx, fix.epy);
  else
    out.horizontal = kUnknownAccuracyM;
  const double kmh = fix.speed * kKmhPerMs;
  out.speedKmh = std::isfinite(kmh) && kmh >= 0 ? kmh : 0;
  out.altitude = finiteOr(fix.altMSL, finiteOr(fix.altHAE, 0));
  out.climb = finiteOr(fix.climb, 0);
  out.direction = finiteOr(fix.track, 0);
  out.vertical = usableAccuracy(fix.epv) ? fix.epv : 0;
  out.level = LOCATION_ACCURACY_DETAILED;
  out.time = fix.time.tv_sec > 0 ? static_cast<std::time_t>(fix.time.tv_sec) : std::time(nullptr);
  return true;
}

class GpsdLocationSource : public LocationSource,
                           public core::ITimerObserver,
                           public core::IPollSink {
 public:
  GpsdLocationSource(std::string host, std::string port)
      : host_(std::move(host)), port_(std::move(port)) {}

  ~GpsdLocationSource() override {
    for (ITimer* t : {reportTimer_.get(), reconnectTimer_.get(), fixTimer_.get(),
                      livenessTimer_.get()})
      if (t) t->stop();
    closeConnection();
  }

  bool start(std::function<void(bool)> changed) override {
    changed_ = std::move(changed);
    dispatcher_ = SharedPointer<LinAsyncCallDispatcher>::cast(
        core::AsyncCallDispatcher::openDispatcher(core::AsyncCallDispatcher::MainLoopDefault));
    reportTimer_ = SharedPointer<ITimer>(ITimer::create(this));
    reconnectTimer_ = SharedPointer<ITimer>(ITimer::create(this));
    fixTimer_ = SharedPointer<ITimer>(ITimer::create(this));
    livenessTimer_ = SharedPointer<ITimer>(ITimer::create(this));
    if (!dispatcher_ || !reportTimer_ || !reconnectTimer_ || !fixTimer_ || !livenessTimer_) {
      setLastError("location manager: no Linux dispatcher with timers on this thread");
      return false;
    }
    // The state current now is reported from the loop, at once.
    if (reportTimer_->start(1, 0, 0) != Ok) {
      setLastError("location manager: cannot start a timer");
      return false;
    }
    connect();
    return true;
  }

  bool enabled() const override { return enabled_; }

  bool position(Position& out) const override {
    if (!hasFix_) return false;
    out = fix_;
    return true;
  }

  void timeout(ITimer* timer) override {
    if (timer == reportTimer_.get()) {
      reported_ = true;
      if (changed_) changed_(enabled_);
    } else if (timer == reconnectTimer_.get()) {
      connect();
    } else if (timer == fixTimer_.get()) {
      loseFix();
    } else if (timer == livenessTimer_.get()) {
      checkConnection();
    }
  }

  void handlePollEvent(const pollfd& p) override {
    if (!connection_) return;
    if (opening_) {
      if (p.fd == connection_->doneFd) opened();
    } else if (p.fd == connection_->data.gps_fd) {
      readMessages();
    }
  }

 private:
  // Starts an attempt; on failure to start one, tries again later.
  void connect() {
    auto c = std::make_shared<Connection>();
    c->doneFd = eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
    if (c->doneFd < 0 || !dispatcher_->attachPollSink({c->doneFd, POLLIN, 0}, this)) {
      failed("cannot wait for a connection");
      return;
    }
    try {
      opener_ = std::thread(openConnection, c, host_, port_);
    } catch (const std::system_error&) {
      dispatcher_->detachPollSink({c->doneFd, POLLIN, 0});
      failed("cannot start a thread to connect");
      return;
    }
    connection_ = std::move(c);
    opening_ = true;
  }

  // The opening thread has finished: watch the connection, or retry later.
  void opened() {
    dispatcher_->detachPollSink({connection_->doneFd, POLLIN, 0});
    opener_.join();
    opening_ = false;
    std::shared_ptr<Connection> c = std::move(connection_);
    if (c->failure) {
      failed(c->failure);
      return;
    }
    if (!dispatcher_->attachPollSink({c->data.gps_fd, POLLIN, 0}, this)) {
      failed("cannot watch the connection");
      return;
    }
    connection_ = std::move(c);
    complained_ = false;
    livenessTimer_->start(kLivenessCheckMs, kLivenessCheckMs, 0);
  }

  // A reset connection: what came before the end still counts, then the
  // connection ends as a closed one does.
  void checkConnection() {
    if (!connection_ || opening_) return;
    pollfd p{connection_->data.gps_fd, POLLIN, 0};
    if (poll(&p, 1, 0) != 1 || !(p.revents & (POLLERR | POLLHUP))) return;
    readMessages();
    if (connection_ && !opening_) failed("connection reset");
  }

  // Reads the complete messages gpsd has sent; a closed connection, a read
  // error or a message too long for libgps's buffer ends the connection.
  void readMessages() {
    gps_data_t& data = connection_->data;
    for (int i = 0; i < kMaxMessagesPerEvent; ++i) {
      data.set = 0;
      const int n = gps_read(&data, nullptr, 0);
      if (n < 0) {
        failed("connection closed");
        return;
      }
      if (n == 0) return;
      // Only reports of position (TPV) carry a mode; everything else,
      // garbage included, leaves `set` without MODE_SET.
      if (data.set & MODE_SET) handleReport(data.fix);
    }
  }

  void handleReport(const gps_fix_t& fix) {
    if (fix.mode < MODE_2D) {
      loseFix();
      return;
    }
    Position p;
    if (!toPosition(fix, p)) return;  // unusable values: as if not sent
    fix_ = p;
    hasFix_ = true;
    fixTimer_->start(kFixTimeoutMs, 0, 0);
    setEnabled(true);
  }

  void loseFix() {
    fixTimer_->stop();
    hasFix_ = false;
    setEnabled(false);
  }

  // gpsd cannot be reached or went away: disabled, and retried later.
  void failed(const char* why) {
    closeConnection();
    if (!complained_)
      Debug::log2(Debug::Level1, "location manager: gpsd at %s:%s: %s; retrying every %lld ms\n",
                  host_.c_str(), port_.c_str(), why, kReconnectMs);
    complained_ = true;
    reconnectTimer_->start(kReconnectMs, 0, 0);
    loseFix();
  }

  void closeConnection() {
    if (!connection_) return;
    if (opening_) {
      // The thread keeps its share and closes what it opened when done.
      dispatcher_->detachPollSink({connection_->doneFd, POLLIN, 0});
      connection_->abandoned = true;
      opener_.detach();
      opening_ = false;
    } else {
      dispatcher_->detachPollSink({connection_->data.gps_fd, POLLIN, 0});
      livenessTimer_->stop();
    }
    connection_.reset();
  }

  void setEnabled(bool enabled) {
    if (enabled == enabled_) return;
    enabled_ = enabled;
    if (reported_ && changed_) changed_(enabled);
  }

  const std::string host_, port_;
  std::function<void(bool)> changed_;
  SharedPointer<LinAsyncCallDispatcher> dispatcher_;
  SharedPointer<ITimer> reportTimer_;     // the first report, from the loop
  SharedPointer<ITimer> reconnectTimer_;  // armed while gpsd is away
  SharedPointer<ITimer> fixTimer_;        // armed while a fix is current
  SharedPointer<ITimer> livenessTimer_;   // armed while connected
  std::shared_ptr<Connection> connection_;
  std::thread opener_;
  bool opening_ = false;     // opener_ runs for connection_
  bool complained_ = false;  // the outage is logged once
  bool reported_ = false;    // the first state went out
  bool enabled_ = false;
  bool hasFix_ = false;
  Position fix_;
};

}  // namespace

std::unique_ptr<LocationSource> makeGpsdLocationSource(const std::string& host,
                                                       const std::string& port, std::string&) {
  return std::make_unique<GpsdLocationSource>(host, port);
}

}  // namespace host
}  // namespace platform
}  // namespace lodestack
