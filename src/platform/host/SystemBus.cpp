// Blocking D-Bus calls with checked answers for the bus thread.
#include "platform/host/SystemBus.h"

namespace lodestack {
namespace platform {
namespace host {

namespace {

// Longer than either request time-out of the engine, which cancels first.
const int kCallTimeoutMs = 20000;

struct ErrorFree {
  void operator()(GError* e) const { g_error_free(e); }
};
using Error = std::unique_ptr<GError, ErrorFree>;

std::string typeOf(GVariant* v) { return g_variant_get_type_string(v); }

}  // namespace

template <> std::string fromVariant<std::string>(GVariant* v) { return g_variant_get_string(v, nullptr); }
template <> std::uint32_t fromVariant<std::uint32_t>(GVariant* v) { return g_variant_get_uint32(v); }
template <> std::int16_t fromVariant<std::int16_t>(GVariant* v) { return g_variant_get_int16(v); }
template <> std::uint8_t fromVariant<std::uint8_t>(GVariant* v) { return g_variant_get_byte(v); }
template <> std::int64_t fromVariant<std::int64_t>(GVariant* v) { return g_variant_get_int64(v); }
template <> double fromVariant<double>(GVariant* v) { return g_variant_get_double(v); }
template <> bool fromVariant<bool>(GVariant* v) { return g_variant_get_boolean(v); }

template <>
std::vector<unsigned char> fromVariant<std::vector<unsigned char>>(GVariant* v) {
  gsize n = 0;
  const auto* bytes = static_cast<const unsigned char*>(g_variant_get_fixed_array(v, &n, 1));
  return std::vector<unsigned char>(bytes, bytes + n);
}

template <>
ObjectPaths fromVariant<ObjectPaths>(GVariant* v) {
  ObjectPaths paths;
  const gsize n = g_variant_n_children(v);
  for (gsize i = 0; i < n; ++i) {
    Variant path(g_variant_get_child_value(v, i));
    paths.emplace_back(g_variant_get_string(path.get(), nullptr));
  }
  return paths;
}

Variant Dictionary::lookup(const char* key, const char* type) const {
  Variant v(g_variant_lookup_value(dict_, key, nullptr));
  if (v && !g_variant_is_of_type(v.get(), G_VARIANT_TYPE(type)))
    fail(std::string(key) + " has type " + typeOf(v.get()) + ", expected " + type);
  return v;
}

void Dictionary::fail(const std::string& what) const {
  throw BusFailure(std::string(service_.label) + ": " + where_ + ": " + what);
}

BusSubscription::BusSubscription(GDBusConnection* connection, const std::string& sender,
                                 const std::string& path, const char* iface, const char* member,
                                 const char* arg0, std::function<void(GVariant*)> handler)
    : connection_(connection), handler_(std::move(handler)) {
  id_ = g_dbus_connection_signal_subscribe(connection, sender.c_str(), iface, member,
                                           path.c_str(), arg0, G_DBUS_SIGNAL_FLAGS_NONE,
                                           &BusSubscription::dispatch, this, nullptr);
}

// GDBus checks at dispatch that a subscription still exists, so no call
// reaches this object after the unsubscription.
BusSubscription::~BusSubscription() { g_dbus_connection_signal_unsubscribe(connection_, id_); }

void BusSubscription::dispatch(GDBusConnection*, const gchar*, const gchar*, const gchar*,
                               const gchar*, GVariant* parameters, gpointer self) {
  static_cast<BusSubscription*>(self)->handler_(parameters);
}

const std::string& BusSession::owner(const BusService& service) {
  for (const auto& known : owners_)
    if (known.first == service.busName) return known.second;
  GError* raw = nullptr;
  GVariant* reply = g_dbus_connection_call_sync(
      connection_, "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
      "GetNameOwner", g_variant_new("(s)", service.busName), G_VARIANT_TYPE("(s)"),
      G_DBUS_CALL_FLAGS_NONE, kCallTimeoutMs, cancellable_, &raw);
  if (!reply) {
    Error error(raw);
    if (g_dbus_error_is_remote_error(error.get())) {
      throw BusFailure(std::string(service.label) + " (" + service.busName +
                           ") is not on the system bus",
                       "org.freedesktop.DBus.Error.NameHasNoOwner");
    }
    fail(service, "asking the bus for its owner", error.release());
  }
  Variant held(reply);
  const gchar* unique = nullptr;
  g_variant_get(reply, "(&s)", &unique);
  owners_.emplace_back(service.busName, unique);
  return owners_.back().second;
}

Variant BusSession::call(const BusService& service, const std::string& path, const char* iface,
                         const char* method, GVariant* args, const char* replyType) {
  Variant held(args ? g_variant_ref_sink(args) : nullptr);  // kept when owner() throws
  const std::string& to = owner(service);
  const std::string what = std::string(method) + " on " + path;
  host_.unfinished(std::string(service.label) + ": no answer to " + what +
                   " before the request ended");
  GError* error = nullptr;
  GVariant* reply =
      g_dbus_connection_call_sync(connection_, to.c_str(), path.c_str(), iface, method, held.get(),
                                  nullptr, G_DBUS_CALL_FLAGS_NO_AUTO_START, kCallTimeoutMs,
                                  cancellable_, &error);
  host_.unfinished(std::string());
  if (!reply) fail(service, what, error);
  Variant answer(reply);
  if (!g_variant_is_of_type(reply, G_VARIANT_TYPE(replyType)))
    throw BusFailure(std::string(service.label) + ": " + what + ": answer has type " +
                     typeOf(reply) + ", expected " + replyType);
  return answer;
}

Variant BusSession::propertyValue(const BusService& service, const std::string& path,
                                  const char* iface, const char* name, const char* type) {
  Variant reply = call(service, path, "org.freedesktop.DBus.Properties", "Get",
                       g_variant_new("(ss)", iface, name), "(v)");
  Variant boxed(g_variant_get_child_value(reply.get(), 0));
  Variant value(g_variant_get_variant(boxed.get()));
  if (!g_variant_is_of_type(value.get(), G_VARIANT_TYPE(type)))
    throw BusFailure(std::string(service.label) + ": property " + name + " of " + path +
                     " has type " + typeOf(value.get()) + ", expected " + type);
  return value;
}

Variant BusSession::properties(const BusService& service, const std::string& path,
                               const char* iface) {
  Variant reply = call(service, path, "org.freedesktop.DBus.Properties", "GetAll",
                       g_variant_new("(s)", iface), "(a{sv})");
  return Variant(g_variant_get_child_value(reply.get(), 0));
}

std::unique_ptr<BusSubscription> BusSession::subscribe(const BusService& service,
                                                       const std::string& path, const char* iface,
                                                       const char* member,
                                                       std::function<void(GVariant*)> handler,
                                                       const char* arg0) {
  return std::make_unique<BusSubscription>(connection_, owner(service), path, iface, member, arg0,
                                           std::move(handler));
}

void BusSession::wait(const BusService& service, const std::function<bool()>& done, int limitMs,
                      const std::string& what) {
  const std::string from = owner(service);
  GMainContext* context = g_main_context_get_thread_default();
  // Owner changes the bus announced before it answered owner() are queued
  // here already: heard first, so that the watch is not older than `from`.
  while (g_main_context_iteration(context, FALSE)) {
  }
  bool expired = false;
  GSource* limit = g_timeout_source_new(static_cast<guint>(limitMs));
  g_source_set_callback(
      limit,
      [](gpointer flag) {
        *static_cast<bool*>(flag) = true;
        return G_SOURCE_REMOVE;
      },
      &expired, nullptr);
  g_source_attach(limit, context);
  std::unique_ptr<GSource, void (*)(GSource*)> dropLimit(limit, [](GSource* s) {
    g_source_destroy(s);
    g_source_unref(s);
  });
  host_.unfinished(std::string(service.label) + ": no " + what + " before the request ended");
  struct Clear {
    BusSessionHost& host;
    ~Clear() { host.unfinished(std::string()); }
  } clear{host_};
  while (!done()) {
    if (g_cancellable_is_cancelled(cancellable_)) throw BusCancelled();
    if (host_.hasLeft(service.busName, from))
      throw BusFailure(std::string(service.label) + " (" + service.busName +
                       ") left the system bus while the measurement waited for " + what);
    if (expired)
      throw BusFailure(std::string(service.label) + ": no " + what + " within " +
                       std::to_string(limitMs / 1000) + " s");
    g_main_context_iteration(context, TRUE);
  }
}

bool BusSession::isGone(const BusFailure& failure) {
  return failure.errorName() == "org.freedesktop.DBus.Error.UnknownObject" ||
         failure.errorName() == "org.freedesktop.DBus.Error.UnknownMethod";
}

void BusSession::fail(const BusService& service, const std::string& what, GError* raw) {
  Error error(raw);
  if (g_error_matches(error.get(), G_IO_ERROR, G_IO_ERROR_CANCELLED)) throw BusCancelled();
  std::string name;
  if (gchar* remote = g_dbus_error_get_remote_error(error.get())) {
    name = remote;
    g_free(remote);
    g_dbus_error_strip_remote_error(error.get());
  }
  if (name == "org.freedesktop.DBus.Error.ServiceUnknown" ||
      name == "org.freedesktop.DBus.Error.NameHasNoOwner")
    throw BusFailure(std::string(service.label) + " (" + service.busName +
                         ") left the system bus during " + what,
                     name);
  throw BusFailure(std::string(service.label) + ": " + what + " failed: " +
                       (name.empty() ? std::string() : name + ": ") + error->message,
                   name);
}

}  // namespace host
}  // namespace platform
}  // namespace lodestack
