// The bus thread of a service source.
#include "platform/host/BusWorker.h"

#include <algorithm>

namespace lodestack {
namespace platform {
namespace host {

BusWorker::BusWorker(ServiceProtocol& protocol, Report report)
    : protocol_(protocol),
      report_(std::move(report)),
      absentMessage_(protocol.absentMessage()),
      context_(g_main_context_new()),
      stopping_(g_cancellable_new()) {
  for (const BusService& service : protocol_.services()) {
    watches_.push_back(std::make_unique<Watch>());
    watches_.back()->worker = this;
    watches_.back()->name = service.busName;
  }
  try {
    thread_ = std::thread(&BusWorker::run, this);
  } catch (...) {
    g_object_unref(stopping_);
    g_main_context_unref(context_);
    throw;
  }
}

BusWorker::~BusWorker() {
  GCancellable* running = nullptr;
  {
    std::lock_guard<std::mutex> lock(mutex_);
    stop_ = true;
    if (running_) running = G_CANCELLABLE(g_object_ref(running_));
  }
  if (running) {
    g_cancellable_cancel(running);
    g_object_unref(running);
  }
  g_cancellable_cancel(stopping_);  // a connection being made
  wake();
  thread_.join();
  g_object_unref(stopping_);
  g_main_context_unref(context_);
}

void BusWorker::measure(unsigned generation) {
  GCancellable* running = nullptr;
  {
    std::lock_guard<std::mutex> lock(mutex_);
    wanted_ = generation;
    if (running_) running = G_CANCELLABLE(g_object_ref(running_));
  }
  // Cancelled outside the lock: GLib runs the cancellable's handlers here.
  if (running) {
    g_cancellable_cancel(running);
    g_object_unref(running);
  }
  wake();
}

void BusWorker::cancel() { measure(0); }

void BusWorker::reconnect() {
  {
    std::lock_guard<std::mutex> lock(mutex_);
    reconnect_ = true;
  }
  wake();
}

namespace {

// Without talking to the bus: when every address of the system bus is a
// socket file that does not exist, why there is no bus; else empty.
std::string missingSystemBusSocket() {
  gchar* found = g_dbus_address_get_for_bus_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr);
  if (!found) return std::string();
  const std::string address = found;
  g_free(found);
  std::size_t start = 0;
  while (start <= address.size()) {
    const std::size_t end = std::min(address.find(';', start), address.size());
    const std::string entry = address.substr(start, end - start);
    const std::string prefix = "unix:path=";
    if (entry.rfind(prefix, 0) != 0) return std::string();  // another transport: try it
    const std::string path = entry.substr(prefix.size(), entry.find(',') - prefix.size());
    if (g_file_test(path.c_str(), G_FILE_TEST_EXISTS)) return std::string();
    start = end + 1;
  }
  return "no system bus at " + address + ": No such file or directory";
}

}  // namespace

std::string BusWorker::knownFailure() const {
  std::lock_guard<std::mutex> lock(mutex_);
  // The services' absence says what is missing; the bus's error why.
  if (!busError_.empty()) return absentMessage_ + ": " + busError_;
  if (!connected_) {
    const std::string missing = missingSystemBusSocket();
    if (!missing.empty()) return absentMessage_ + ": " + missing;
  }
  for (const auto& watch : watches_)
    if (watch->active && watch->presence != Presence::Absent) return std::string();
  return absentMessage_;
}

std::string BusWorker::unfinishedMessage() const {
  std::lock_guard<std::mutex> lock(mutex_);
  return unfinished_;
}

// The thread's loop waits in g_main_context_iteration; GLib's wakeup stays
// signalled until the next poll, so a wake between the check of the
// requests and the wait is not lost.
void BusWorker::wake() { g_main_context_wakeup(context_); }

void BusWorker::run() {
  g_main_context_push_thread_default(context_);
  connect();
  for (;;) {
    unsigned generation = 0;
    bool reconnect = false;
    GCancellable* cancellable = nullptr;
    {
      std::lock_guard<std::mutex> lock(mutex_);
      if (stop_) break;
      std::swap(reconnect, reconnect_);
      if (wanted_) {
        generation = wanted_;
        wanted_ = 0;
        cancellable = running_ = g_cancellable_new();
      }
    }
    if (reconnect && (!connection_ || g_dbus_connection_is_closed(connection_))) connect();
    if (generation) {
      runMeasurement(generation, cancellable);
      std::lock_guard<std::mutex> lock(mutex_);
      running_ = nullptr;
      g_object_unref(cancellable);
    } else if (!reconnect) {
      g_main_context_iteration(context_, TRUE);
    }
  }
  disconnect();
  // Unsubscriptions and cancelled calls leave idle work behind.
  while (g_main_context_iteration(context_, FALSE)) {
  }
  g_main_context_pop_thread_default(context_);
}

void BusWorker::connect() {
  disconnect();
  GError* error = nullptr;
  gchar* address = g_dbus_address_get_for_bus_sync(G_BUS_TYPE_SYSTEM, stopping_, &error);
  const std::string where = address ? address : "its default address";
  if (address) {
    connection_ = g_dbus_connection_new_for_address_sync(
        address,
        static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                          G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION),
        nullptr, stopping_, &error);
    g_free(address);
  }
  std::lock_guard<std::mutex> lock(mutex_);
  if (!connection_) {
    busError_ = "no system bus at " + where + ": " + (error ? error->message : "unknown error");
    if (error) g_error_free(error);
    return;
  }
  busError_.clear();
  connected_ = true;
  g_signal_connect(connection_, "closed", G_CALLBACK(&BusWorker::closed), this);
  for (auto& watch : watches_) {
    if (!watch->active) continue;
    watch->presence = Presence::Unknown;
    watch->id = g_bus_watch_name_on_connection(connection_, watch->name.c_str(),
                                               G_BUS_NAME_WATCHER_FLAGS_NONE, &BusWorker::appeared,
                                               &BusWorker::vanished, watch.get(), nullptr);
  }
}

void BusWorker::disconnect() {
  if (!connection_) return;
  std::vector<std::unique_ptr<Watch>> fresh;
  {
    std::lock_guard<std::mutex> lock(mutex_);
    // The old watches stay allocated (inactive) until the thread ends:
    // GLib may still hold their pointers in queued callbacks.
    for (auto& watch : watches_) {
      if (!watch->active) continue;
      g_bus_unwatch_name(watch->id);
      watch->active = false;
      fresh.push_back(std::make_unique<Watch>());
      fresh.back()->worker = this;
      fresh.back()->name = watch->name;
      fresh.back()->presence = Presence::Absent;
    }
    for (auto& watch : fresh) watches_.push_back(std::move(watch));
  }
  g_signal_handlers_disconnect_by_data(connection_, this);
  g_dbus_connection_close(connection_, nullptr, nullptr, nullptr);
  g_object_unref(connection_);
  connection_ = nullptr;
}

void BusWorker::runMeasurement(unsigned generation, GCancellable* cancellable) {
  try {
    if (!connection_ || g_dbus_connection_is_closed(connection_)) connect();
    if (!connection_) throw BusFailure(knownFailure());
    BusSession session(connection_, cancellable, *this);
    ServiceAnswer answer = protocol_.measure(session);
    report_(generation, std::move(answer), std::string());
  } catch (const BusFailure& failure) {
    report_(generation, std::nullopt, failure.what());
  } catch (const BusCancelled&) {
  } catch (const std::exception& e) {
    report_(generation, std::nullopt, std::string(protocol_.services().front().label) + ": " + e.what());
  }
}

void BusWorker::appeared(GDBusConnection*, const gchar*, const gchar* owner, gpointer data) {
  auto* watch = static_cast<Watch*>(data);
  std::lock_guard<std::mutex> lock(watch->worker->mutex_);
  if (!watch->active) return;
  watch->presence = Presence::Present;
  watch->owner = owner;
}

void BusWorker::vanished(GDBusConnection*, const gchar*, gpointer data) {
  auto* watch = static_cast<Watch*>(data);
  std::lock_guard<std::mutex> lock(watch->worker->mutex_);
  if (!watch->active) return;
  watch->presence = Presence::Absent;
  watch->owner.clear();
}

void BusWorker::closed(GDBusConnection*, gboolean, GError* error, gpointer self) {
  auto* worker = static_cast<BusWorker*>(self);
  std::lock_guard<std::mutex> lock(worker->mutex_);
  worker->busError_ = std::string("the system bus connection closed") +
                      (error ? std::string(": ") + error->message : std::string());
}

bool BusWorker::hasLeft(const char* busName, const std::string& owner) {
  std::lock_guard<std::mutex> lock(mutex_);
  for (const auto& watch : watches_) {
    if (!watch->active || watch->name != busName) continue;
    return watch->presence == Presence::Absent ||
           (watch->presence == Presence::Present && watch->owner != owner);
  }
  return false;
}

void BusWorker::unfinished(const std::string& message) {
  std::lock_guard<std::mutex> lock(mutex_);
  unfinished_ = message;
}

}  // namespace host
}  // namespace platform
}  // namespace lodestack
