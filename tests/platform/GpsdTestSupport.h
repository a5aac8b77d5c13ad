// Helpers of the gpsd tests: free loopback ports, a fake gpsd that the test
// scripts line by line, the real gpsd as a child process, an NMEA feed for
// it, and a location manager whose state changes are kept. The fake, the
// feed and the location manager run on the test thread's dispatcher.
#ifndef LODESTACK_TESTS_PLATFORM_GPSDTESTSUPPORT_H
#define LODESTACK_TESTS_PLATFORM_GPSDTESTSUPPORT_H

#include <arpa/inet.h>
#include <netinet/in.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstdio>
#include <ctime>
#include <string>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include <lodestack/lodestack.h>

#include "core/CoreTestSupport.h"
#include "platform/PlatformTestSupport.h"

namespace lodestack {
namespace testing {

using gom::SharedPointer;

inline SharedPointer<core::IAsyncCallDispatcher> loop() {
  return core::AsyncCallDispatcher::openDispatcher(core::AsyncCallDispatcher::MainLoopDefault);
}

inline bool runUntil(const std::function<bool()>& done, double limitSeconds) {
  return core::testing::runUntil(*loop(), done, limitSeconds);
}

// Runs the loop for `seconds` whatever happens.
inline void runFor(double seconds) {
  runUntil([] { return false; }, seconds);
}

inline sockaddr_in loopbackAddress(int port) {
  sockaddr_in a{};
  a.sin_family = AF_INET;
  a.sin_port = htons(static_cast<unsigned short>(port));
  a.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
  return a;
}

// Binds `fd` to the loopback port `port` (0: any free one); returns the
// port, or -1.
inline int bindLoopback(int fd, int port = 0) {
  sockaddr_in a = loopbackAddress(port);
  socklen_t size = sizeof a;
  if (bind(fd, reinterpret_cast<sockaddr*>(&a), sizeof a) != 0 ||
      getsockname(fd, reinterpret_cast<sockaddr*>(&a), &size) != 0)
    return -1;
  return ntohs(a.sin_port);
}

// A loopback port of `type` that nobody used a moment ago.
inline int freePort(int type) {
  const int fd = socket(AF_INET, type, 0);
  const int port = bindLoopback(fd);
  close(fd);
  return port;
}

// Whether something accepts TCP connections on the loopback port.
inline bool accepting(int port) {
  const int fd = socket(AF_INET, SOCK_STREAM, 0);
  const sockaddr_in a = loopbackAddress(port);
  const bool ok = connect(fd, reinterpret_cast<const sockaddr*>(&a), sizeof a) == 0;
  close(fd);
  return ok;
}

// A TCP server on the loopback speaking for gpsd: it accepts one client at a
// time (a new one replaces the last), ignores what the client sends, and
// writes what the test says, with `greeting` right after each accept. A
// stalled one never accepts and its queue is full: connecting to it hangs
// until it closes.
class FakeGpsd : public core::IPollSink {
 public:
  explicit FakeGpsd(int port = 0, bool stalled = false)
      : dispatcher_(SharedPointer<core::LinAsyncCallDispatcher>::cast(loop())),
        listenFd_(socket(AF_INET, SOCK_STREAM | SOCK_NONBLOCK, 0)) {
    const int one = 1;
    setsockopt(listenFd_, SOL_SOCKET, SO_REUSEADDR, &one, sizeof one);
    port_ = bindLoopback(listenFd_, port);
    listen(listenFd_, stalled ? 0 : 4);
    if (!stalled) {
      dispatcher_->attachPollSink({listenFd_, POLLIN, 0}, this);
      return;
    }
    const sockaddr_in a = loopbackAddress(port_);
    for (int& c : queued_) {
      c = socket(AF_INET, SOCK_STREAM | SOCK_NONBLOCK, 0);
      (void)connect(c, reinterpret_cast<const sockaddr*>(&a), sizeof a);
    }
  }
  ~FakeGpsd() override {
    dropClient();
    for (int c : queued_)
      if (c >= 0) close(c);
    dispatcher_->detachPollSink({listenFd_, POLLIN, 0});
    close(listenFd_);
  }

  int port() const { return port_; }
  int accepted() const { return accepted_; }
  std::string greeting;

  // Writes `text` to the client; false when there is none or it left.
  bool send(const std::string& text) {
    for (std::size_t done = 0; done < text.size();) {
      const ssize_t n = ::send(clientFd_, text.data() + done, text.size() - done, MSG_NOSIGNAL);
      if (n <= 0) return false;
      done += static_cast<std::size_t>(n);
    }
    return true;
  }

  // Closes the connection. What the client sent is discarded first: a
  // close over unread input would reset the connection instead.
  void dropClient() {
    if (clientFd_ < 0) return;
    char discard[512];
    while (recv(clientFd_, discard, sizeof discard, MSG_DONTWAIT) > 0) {
    }
    close(clientFd_);
    clientFd_ = -1;
  }

  // Ends the connection with a reset, as a gpsd that dies does.
  void resetClient() {
    if (clientFd_ < 0) return;
    const linger abort{1, 0};
    setsockopt(clientFd_, SOL_SOCKET, SO_LINGER, &abort, sizeof abort);
    close(clientFd_);
    clientFd_ = -1;
  }

  void handlePollEvent(const pollfd&) override {
    const int fd = accept(listenFd_, nullptr, nullptr);
    if (fd < 0) return;
    dropClient();
    clientFd_ = fd;
    ++accepted_;
    send(greeting);
  }

 private:
  SharedPointer<core::LinAsyncCallDispatcher> dispatcher_;
  int listenFd_, clientFd_ = -1, port_ = -1, accepted_ = 0;
  int queued_[3] = {-1, -1, -1};  // a stalled one's
};

// A location manager made from the current LODESTACK_GNSS, keeping every
// state its callback reported and whether all came on the test thread.
class StateLog {
 public:
  StateLog() {
    EXPECT_EQ(location_manager_create(LOCATION_METHOD_GNSS, &manager), LOCATION_ERROR_NONE);
    EXPECT_EQ(location_manager_set_service_state_changed_cb(manager, &changed, this),
              LOCATION_ERROR_NONE);
  }
  ~StateLog() {
    if (manager) location_manager_destroy(manager);
  }

  // The position, or the error code in `result`.
  struct Fix {
    int result = 0;
    double altitude = 0, latitude = 0, longitude = 0, climb = 0, direction = 0, speed = 0;
    double horizontal = 0, vertical = 0;
    location_accuracy_level_e level = LOCATION_ACCURACY_NONE;
    time_t time = 0;
  };
  Fix location() const {
    Fix f;
    f.result = location_manager_get_location(manager, &f.altitude, &f.latitude, &f.longitude,
                                             &f.climb, &f.direction, &f.speed, &f.level,
                                             &f.horizontal, &f.vertical, &f.time);
    return f;
  }
  bool last(location_service_state_e state) const { return !states.empty() && states.back() == state; }

  location_manager_h manager = nullptr;
  std::vector<location_service_state_e> states;
  bool onTestThread = true;

 private:
  static void changed(location_service_state_e state, void* self) {
    StateLog* log = static_cast<StateLog*>(self);
    log->onTestThread = log->onTestThread && std::this_thread::get_id() == log->owner_;
    log->states.push_back(state);
  }
  std::thread::id owner_ = std::this_thread::get_id();
};

// Where Debian's gpsd package puts the daemon.
const char kGpsd[] = "/usr/sbin/gpsd";
inline bool gpsdInstalled() { return access(kGpsd, X_OK) == 0; }

// Starts gpsd in `shell` on loopback port `port`, reading NMEA datagrams
// sent to the loopback UDP port `feedPort`, and waits until it accepts
// connections. The shell ends gpsd when ended itself: gpsd, started as root,
// drops its privileges and with them the signal asked for on the test's
// death.
inline bool startGpsd(ChildProcess& shell, int port, int feedPort) {
  const std::string script = "trap 'kill $p; wait $p' TERM; " + std::string(kGpsd) + " -N -n -S " +
                             std::to_string(port) + " udp://127.0.0.1:" + std::to_string(feedPort) +
                             " & p=$!; wait $p";
  return shell.start({"/bin/sh", "-c", script}) && waitFor([&] { return accepting(port); }, 5.0);
}

// Sends a GGA and an RMC sentence for a fixed point, moving at 19.44 knots
// (10 m/s), to a loopback UDP port every 200 ms while running.
class NmeaFeed : public core::ITimerObserver {
 public:
  static constexpr double kLatitude = 48.1173;             // 4807.038 N
  static constexpr double kLongitude = 11.516666666666667;  // 01131.000 E

  explicit NmeaFeed(int port)
      : fd_(socket(AF_INET, SOCK_DGRAM, 0)), to_(loopbackAddress(port)),
        timer_(core::ITimer::create(this)) {}
  ~NmeaFeed() override {
    timer_->stop();
    close(fd_);
  }
  void start() { timer_->start(1, 200, 0); }
  void stop() { timer_->stop(); }

  void timeout(core::ITimer*) override {
    const std::time_t now = std::time(nullptr);
    std::tm utc{};
    gmtime_r(&now, &utc);
    char hms[16], dmy[16];
    std::strftime(hms, sizeof hms, "%H%M%S.00", &utc);
    std::strftime(dmy, sizeof dmy, "%d%m%y", &utc);
    const std::string text =
        sentence(std::string("GPGGA,") + hms + ",4807.038,N,01131.000,E,1,08,0.9,545.4,M,46.9,M,,") +
        sentence(std::string("GPRMC,") + hms + ",A,4807.038,N,01131.000,E,19.44,084.4," + dmy +
                 ",003.1,W,A");
    (void)sendto(fd_, text.data(), text.size(), 0, reinterpret_cast<const sockaddr*>(&to_), sizeof to_);
  }

 private:
  static std::string sentence(const std::string& body) {
    unsigned char sum = 0;
    for (char c : body) sum ^= static_cast<unsigned char>(c);
    char tail[8];
    std::snprintf(tail, sizeof tail, "*%02X\r\n", sum);
    return "$" + body + tail;
  }

  int fd_;
  sockaddr_in to_;
  SharedPointer<core::ITimer> timer_;
};

}  // namespace testing
}  // namespace lodestack

#endif  // LODESTACK_TESTS_PLATFORM_GPSDTESTSUPPORT_H
