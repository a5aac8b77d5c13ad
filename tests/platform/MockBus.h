// A private D-Bus bus for one test, never the machine's own: dbus-daemon
// with its own configuration and socket in a temporary folder, its address
// exported as DBUS_SYSTEM_BUS_ADDRESS while it runs; and services on it
// mocked by python3-dbusmock (Debian's, through /usr/bin/python3), started
// and stopped by the test and set up through the mock's
// org.freedesktop.DBus.Mock interface with arguments in GVariant text.
#ifndef LODESTACK_TESTS_PLATFORM_MOCKBUS_H
#define LODESTACK_TESTS_PLATFORM_MOCKBUS_H

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <stdlib.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <gio/gio.h>

#include <algorithm>
#include <chrono>
#include <filesystem>
#include <fstream>
#include <string>
#include <thread>
#include <vector>

namespace lodestack {
namespace testing {

// A child process; stopped (SIGTERM, then reaped) with this object, and
// killed by the kernel should the test die first.
class ChildProcess {
 public:
  // Runs argv (argv[0] searched on PATH); stdout goes to `stdoutFd` (-1:
  // /dev/null), stderr to the file `stderrPath` when given.
  bool start(const std::vector<std::string>& argv, int stdoutFd = -1,
             const std::string& stderrPath = std::string()) {
    const std::string program = find(argv[0]);
    std::vector<char*> args;
    for (const std::string& a : argv) args.push_back(const_cast<char*>(a.c_str()));
    args.push_back(nullptr);
    const pid_t parent = getpid();
    pid_ = fork();
    if (pid_ == 0) {  // only async-signal-safe calls until exec
      prctl(PR_SET_PDEATHSIG, SIGKILL);
      if (getppid() != parent) _exit(127);
      const int out = stdoutFd >= 0 ? stdoutFd : open("/dev/null", O_WRONLY);
      dup2(out, 1);
      if (!stderrPath.empty()) {
        const int err = open(stderrPath.c_str(), O_WRONLY | O_CREAT, 0600);
        dup2(err, 2);
      }
      execv(program.c_str(), args.data());
      _exit(127);
    }
    return pid_ > 0;
  }
  void stop() {
    if (pid_ <= 0) return;
    kill(pid_, SIGTERM);
    int status;
    waitpid(pid_, &status, 0);
    pid_ = -1;
  }
  ~ChildProcess() { stop(); }

 private:
  static std::string find(const std::string& name) {
    if (name.find('/') != std::string::npos) return name;
    const char* path = getenv("PATH");
    std::string dirs = path ? path : "/usr/bin:/bin";
    for (std::size_t from = 0; from <= dirs.size();) {
      const std::size_t to = std::min(dirs.find(':', from), dirs.size());
      const std::string candidate = dirs.substr(from, to - from) + "/" + name;
      if (access(candidate.c_str(), X_OK) == 0) return candidate;
      from = to + 1;
    }
    return name;
  }

  pid_t pid_ = -1;
};

class PrivateBus {
 public:
  PrivateBus() {
    const char* tmp = getenv("TMPDIR");
    std::string dir = std::string(tmp && *tmp ? tmp : "/tmp") + "/lodestack-bus-XXXXXX";
    if (!mkdtemp(&dir[0])) {
      error_ = "no temporary folder";
      return;
    }
    dir_ = dir;
    std::ofstream(dir_ + "/bus.conf")
        << "<!DOCTYPE busconfig PUBLIC \"-//freedesktop//DTD D-Bus Bus Configuration 1.0//EN\"\n"
           " \"http://www.freedesktop.org/standards/dbus/1.0/busconfig.dtd\">\n"
           "<busconfig>\n"
           "  <type>session</type>\n"
           "  <listen>unix:path=" << dir_ << "/socket</listen>\n"
           "  <auth>EXTERNAL</auth>\n"
           "  <policy context=\"default\">\n"
           "    <allow send_destination=\"*\" eavesdrop=\"true\"/>\n"
           "    <allow eavesdrop=\"true\"/>\n"
           "    <allow own=\"*\"/>\n"
           "  </policy>\n"
           "</busconfig>\n";
    int out[2];
    if (pipe2(out, O_CLOEXEC) != 0) {
      error_ = "no pipe";
      return;
    }
    const bool started = daemon_.start({"dbus-daemon", "--config-file=" + dir_ + "/bus.conf",
                                        "--nofork", "--nopidfile", "--print-address=1"},
                                       out[1], dir_ + "/daemon.log");
    close(out[1]);
    if (started) address_ = readLine(out[0], 5000);
    close(out[0]);
    if (address_.empty()) {
      error_ = "dbus-daemon did not start (is the dbus-daemon package installed?)";
      return;
    }
    const char* previous = getenv("DBUS_SYSTEM_BUS_ADDRESS");
    if (previous) previous_ = previous;
    hadPrevious_ = previous != nullptr;
    setenv("DBUS_SYSTEM_BUS_ADDRESS", address_.c_str(), 1);
    GError* e = nullptr;
    connection_ = g_dbus_connection_new_for_address_sync(
        address_.c_str(),
        static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                          G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION),
        nullptr, nullptr, &e);
    if (!connection_) {
      error_ = std::string("cannot connect to the private bus: ") + e->message;
      g_error_free(e);
    }
  }
  ~PrivateBus() {
    if (connection_) {
      g_dbus_connection_close_sync(connection_, nullptr, nullptr);
      g_object_unref(connection_);
    }
    daemon_.stop();
    if (!address_.empty()) {
      if (hadPrevious_)
        setenv("DBUS_SYSTEM_BUS_ADDRESS", previous_.c_str(), 1);
      else
        unsetenv("DBUS_SYSTEM_BUS_ADDRESS");
    }
    std::error_code ignored;
    if (!dir_.empty()) std::filesystem::remove_all(dir_, ignored);
  }
  PrivateBus(const PrivateBus&) = delete;
  PrivateBus& operator=(const PrivateBus&) = delete;

  // Empty when the bus runs; else why not.
  const std::string& error() const { return error_; }

  // Calls a method; `args` in GVariant text of tuple type `argsType`.
  // Returns the answer, or null with the reason in `failure`.
  GVariant* call(const std::string& name, const std::string& path, const std::string& iface,
                 const std::string& method, const std::string& argsType, const std::string& args,
                 std::string& failure) {
    GError* e = nullptr;
    GVariant* parsed = nullptr;
    if (!args.empty()) {
      parsed = g_variant_parse(G_VARIANT_TYPE(argsType.c_str()), args.c_str(), nullptr, nullptr, &e);
      if (!parsed) {
        failure = std::string("bad arguments: ") + e->message;
        g_error_free(e);
        return nullptr;
      }
    }
    GVariant* reply = g_dbus_connection_call_sync(connection_, name.c_str(), path.c_str(),
                                                  iface.c_str(), method.c_str(), parsed, nullptr,
                                                  G_DBUS_CALL_FLAGS_NONE, 10000, nullptr, &e);
    if (!reply) {
      failure = e->message;
      g_error_free(e);
    }
    return reply;
  }

  bool hasOwner(const std::string& name) {
    std::string failure;
    GVariant* reply = call("org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
                           "NameHasOwner", "(s)", "('" + name + "',)", failure);
    if (!reply) return false;
    gboolean owned = FALSE;
    g_variant_get(reply, "(b)", &owned);
    g_variant_unref(reply);
    return owned;
  }

 private:
  static std::string readLine(int fd, int timeoutMs) {
    std::string line;
    const auto until = std::chrono::steady_clock::now() + std::chrono::milliseconds(timeoutMs);
    while (std::chrono::steady_clock::now() < until) {
      pollfd p{fd, POLLIN, 0};
      if (poll(&p, 1, 100) <= 0) continue;
      char c;
      if (read(fd, &c, 1) != 1) break;
      if (c == '\n') return line;
      line += c;
    }
    return std::string();
  }

  std::string dir_;
  std::string address_;
  std::string error_;
  std::string previous_;
  bool hadPrevious_ = false;
  ChildProcess daemon_;
  GDBusConnection* connection_ = nullptr;
};

// A python3-dbusmock service on a private bus.
class MockService {
 public:
  // `mockArgs`: dbusmock's arguments after --system ("-t", "networkmanager"
  // or NAME PATH INTERFACE). Waits until `busName` is owned.
  MockService(PrivateBus& bus, std::string busName, const std::vector<std::string>& mockArgs)
      : bus_(bus), busName_(std::move(busName)) {
    std::vector<std::string> argv = {"/usr/bin/python3", "-m", "dbusmock", "--system"};
    argv.insert(argv.end(), mockArgs.begin(), mockArgs.end());
    if (!process_.start(argv)) {
      error_ = "python3-dbusmock did not start";
      return;
    }
    const auto until = std::chrono::steady_clock::now() + std::chrono::seconds(15);
    while (!bus_.hasOwner(busName_)) {
      if (std::chrono::steady_clock::now() > until) {
        error_ = busName_ + " did not appear (is python3-dbusmock installed?)";
        return;
      }
      std::this_thread::sleep_for(std::chrono::milliseconds(20));
    }
  }
  MockService(const MockService&) = delete;
  MockService& operator=(const MockService&) = delete;

  // Empty when the service runs; else why not.
  const std::string& error() const { return error_; }

  // Calls `method` of `iface` on `path`; empty when it succeeded, else why not.
  std::string call(const std::string& path, const std::string& iface, const std::string& method,
                   const std::string& argsType, const std::string& args) {
    std::string failure;
    GVariant* reply = bus_.call(busName_, path, iface, method, argsType, args, failure);
    if (reply) g_variant_unref(reply);
    return failure;
  }
  // A method of the mock's control interface.
  std::string mock(const std::string& path, const std::string& method, const std::string& argsType,
                   const std::string& args) {
    return call(path, "org.freedesktop.DBus.Mock", method, argsType, args);
  }

  // Ends the service and waits until its name is gone from the bus.
  void stop() {
    process_.stop();
    while (bus_.hasOwner(busName_)) std::this_thread::sleep_for(std::chrono::milliseconds(10));
  }

 private:
  PrivateBus& bus_;
  std::string busName_;
  std::string error_;
  ChildProcess process_;
};

}  // namespace testing
}  // namespace lodestack

#endif  // LODESTACK_TESTS_PLATFORM_MOCKBUS_H
