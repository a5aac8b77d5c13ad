// A private D-Bus bus for one test, never the machine's own: dbus-daemon
// with its own configuration and socket in a temporary folder, its address
// exported as DBUS_SYSTEM_BUS_ADDRESS while it runs; and services on it
// mocked by python3-dbusmock (Debian's, through /usr/bin/python3), started
// and stopped by the test and set up through the mock's
// org.freedesktop.DBus.Mock interface with arguments in GVariant text.
#ifndef LODESTACK_TESTS_PLATFORM_MOCKBUS_H
#define LODESTACK_TESTS_PLATFORM_MOCKBUS_H

#include <gio/gio.h>

#include <fstream>
#include <memory>
#include <string>
#include <vector>

#include "platform/PlatformTestSupport.h"
#include "support/TemporaryDirectory.h"

namespace lodestack {
namespace testing {

class PrivateBus {
 public:
  PrivateBus() {
    if (dir_.path().empty()) {
      error_ = "no temporary folder";
      return;
    }
    const std::string address = "unix:path=" + dir_.file("socket");
    std::ofstream(dir_.file("bus.conf"))
        << "<busconfig>\n"
           "  <listen>" << address << "</listen>\n"
           "  <auth>EXTERNAL</auth>\n"
           "  <policy context=\"default\">\n"
           "    <allow send_destination=\"*\" eavesdrop=\"true\"/>\n"
           "    <allow eavesdrop=\"true\"/>\n"
           "    <allow own=\"*\"/>\n"
           "  </policy>\n"
           "</busconfig>\n";
    daemon_.start({"/usr/bin/dbus-daemon", "--config-file=" + dir_.file("bus.conf"), "--nofork",
                   "--nopidfile"});
    GError* e = nullptr;  // why the last attempt to connect failed
    waitFor([&] {
      g_clear_error(&e);
      connection_ = g_dbus_connection_new_for_address_sync(
          address.c_str(),
          static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                            G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION),
          nullptr, nullptr, &e);
      return connection_ != nullptr;
    }, 5.0);
    if (!connection_) {
      error_ = std::string("cannot connect to the private bus (is the dbus-daemon package "
                           "installed?): ") + e->message;
      g_error_free(e);
      return;
    }
    address_ = std::make_unique<EnvScope>("DBUS_SYSTEM_BUS_ADDRESS", address);
  }
  ~PrivateBus() {
    if (connection_) {
      g_dbus_connection_close_sync(connection_, nullptr, nullptr);
      g_object_unref(connection_);
    }
  }

  // Empty when the bus runs; else why not.
  const std::string& error() const { return error_; }

  // Calls a method with `args`, GVariant text of the tuple type `argsType`;
  // empty when it succeeded, else why not. The answer goes to `reply` when
  // asked for; the caller unrefs it.
  std::string call(const std::string& name, const std::string& path, const std::string& iface,
                   const std::string& method, const std::string& argsType, const std::string& args,
                   GVariant** reply = nullptr) {
    GError* e = nullptr;
    GVariant* answer = nullptr;
    if (GVariant* parsed = g_variant_parse(G_VARIANT_TYPE(argsType.c_str()), args.c_str(),
                                           nullptr, nullptr, &e)) {
      answer = g_dbus_connection_call_sync(connection_, name.c_str(), path.c_str(), iface.c_str(),
                                           method.c_str(), parsed, nullptr, G_DBUS_CALL_FLAGS_NONE,
                                           10000, nullptr, &e);
      g_variant_unref(parsed);  // parsed values are not floating: the call keeps its own
    }
    if (!answer) {
      const std::string failure = e->message;
      g_error_free(e);
      return failure;
    }
    if (reply)
      *reply = answer;
    else
      g_variant_unref(answer);
    return "";
  }

  bool hasOwner(const std::string& name) {
    GVariant* reply = nullptr;
    gboolean owned = FALSE;
    if (call("org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
             "NameHasOwner", "(s)", "('" + name + "',)", &reply).empty()) {
      g_variant_get(reply, "(b)", &owned);
      g_variant_unref(reply);
    }
    return owned;
  }

 private:
  TemporaryDirectory dir_;  // first: outlives the daemon
  std::string error_;
  std::unique_ptr<EnvScope> address_;
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
    if (!process_.start(argv) || !waitFor([&] { return bus_.hasOwner(busName_); }, 15.0))
      error_ = busName_ + " did not appear (is python3-dbusmock installed?)";
  }
  MockService(const MockService&) = delete;
  MockService& operator=(const MockService&) = delete;

  // Empty when the service runs; else why not.
  const std::string& error() const { return error_; }

  // Calls a method of the mock's control interface on `path`, as
  // PrivateBus::call does.
  std::string mock(const std::string& path, const std::string& method, const std::string& argsType,
                   const std::string& args) {
    return bus_.call(busName_, path, "org.freedesktop.DBus.Mock", method, argsType, args);
  }

  // Ends the service and waits until its name is gone from the bus.
  void stop() {
    process_.stop();
    waitFor([&] { return !bus_.hasOwner(busName_); }, 5.0);
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
