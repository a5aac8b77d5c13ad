// The bus thread of a service source: a thread with its own GMainContext
// and its own connection to the system bus, on which the protocol's
// measurements run one at a time with blocking calls, and which watches
// the protocol's bus names meanwhile.
//
// The public operations are for the source's (dispatcher's) thread and
// never wait on the bus; `report` is called on the bus thread with each
// finished measurement, tagged with the generation it was asked for.
#ifndef LODESTACK_SRC_PLATFORM_HOST_BUSWORKER_H
#define LODESTACK_SRC_PLATFORM_HOST_BUSWORKER_H

#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include "platform/host/ServiceSource.h"

namespace lodestack {
namespace platform {
namespace host {

class BusWorker : private BusSessionHost {
 public:
  // A finished measurement: the answer, or the failure's message.
  using Report =
      std::function<void(unsigned generation, std::optional<ServiceAnswer>, std::string failure)>;

  // Starts the thread, which connects and watches the protocol's names.
  // Throws std::system_error when no thread can be started.
  BusWorker(ServiceProtocol& protocol, Report report);
  // Ends a running measurement without a report and joins the thread.
  ~BusWorker() override;
  BusWorker(const BusWorker&) = delete;
  BusWorker& operator=(const BusWorker&) = delete;

  // Measures for `generation` next, ending a running measurement.
  void measure(unsigned generation);
  // Ends a running or pending measurement without a report.
  void cancel();
  // Connects again when the connection is down.
  void reconnect();
  // Why a measurement cannot succeed now (no system bus, none of the
  // protocol's services on it), as far as the thread knows, or, before its
  // first connection, as the system bus's socket file shows; else empty.
  std::string knownFailure() const;
  // The message for the running measurement if it ended now; empty when it
  // waits for nothing.
  std::string unfinishedMessage() const;

 private:
  enum class Presence { Unknown, Present, Absent };
  struct Watch {
    BusWorker* worker;
    std::string name;
    Presence presence = Presence::Unknown;
    std::string owner;
    guint id = 0;
    bool active = true;  // false once the connection it belongs to is dropped
  };

  void run();
  void connect();
  void disconnect();
  void runMeasurement(unsigned generation, GCancellable* cancellable);
  void wake();
  static void appeared(GDBusConnection*, const gchar* name, const gchar* owner, gpointer watch);
  static void vanished(GDBusConnection*, const gchar* name, gpointer watch);
  static void closed(GDBusConnection*, gboolean, GError* error, gpointer self);

  bool hasLeft(const char* busName, const std::string& owner) override;
  void unfinished(const std::string& message) override;

  ServiceProtocol& protocol_;
  Report report_;
  const std::string absentMessage_;
  GMainContext* context_;
  GCancellable* stopping_;  // cancelled by the destructor
  GDBusConnection* connection_ = nullptr;  // bus thread only

  mutable std::mutex mutex_;  // guards what follows
  unsigned wanted_ = 0;       // generation to measure next; 0 none
  GCancellable* running_ = nullptr;
  bool reconnect_ = false;
  bool stop_ = false;
  std::string busError_;  // why there is no connection
  bool connected_ = false;  // a connection was made at least once
  std::vector<std::unique_ptr<Watch>> watches_;  // kept until the thread ends
  std::string unfinished_;

  std::thread thread_;  // last: started once everything above exists
};

}  // namespace host
}  // namespace platform
}  // namespace lodestack

#endif  // LODESTACK_SRC_PLATFORM_HOST_BUSWORKER_H
