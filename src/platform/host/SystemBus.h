// Blocking D-Bus calls for the bus thread of a service source (see
// ServiceSource.h): one BusSession per measurement, on a connection and a
// main context of that thread. Every call may be cancelled from another
// thread through the session's GCancellable; answers are checked against
// the types the services document, so that malformed data ends in a
// BusFailure naming the service, the object and the field instead of a
// crash. Used on the bus thread only.
#ifndef LODESTACK_SRC_PLATFORM_HOST_SYSTEMBUS_H
#define LODESTACK_SRC_PLATFORM_HOST_SYSTEMBUS_H

#include <gio/gio.h>

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

namespace lodestack {
namespace platform {
namespace host {

// A measurement that failed; what() is the one-line message, beginning
// with the service's label.
class BusFailure : public std::runtime_error {
 public:
  explicit BusFailure(const std::string& message, std::string errorName = std::string())
      : std::runtime_error(message), errorName_(std::move(errorName)) {}
  // The D-Bus error behind it ("org.freedesktop.DBus.Error.AccessDenied"),
  // or empty.
  const std::string& errorName() const { return errorName_; }

 private:
  std::string errorName_;
};

// The measurement was cancelled: nothing to report.
struct BusCancelled {};

// A service: its name in messages and its well-known name on the bus.
struct BusService {
  const char* label;    // "wpa_supplicant"
  const char* busName;  // "fi.w1.wpa_supplicant1"
};

struct VariantUnref {
  void operator()(GVariant* v) const { g_variant_unref(v); }
};
using Variant = std::unique_ptr<GVariant, VariantUnref>;

// Object paths, as an "ao" value gives them.
using ObjectPaths = std::vector<std::string>;

// The value type each Dictionary::get / BusSession::property T stands for.
template <class T>
struct BusType;
template <> struct BusType<std::string> { static constexpr const char* signature = "s"; };
template <> struct BusType<std::uint32_t> { static constexpr const char* signature = "u"; };
template <> struct BusType<std::int16_t> { static constexpr const char* signature = "n"; };
template <> struct BusType<std::uint8_t> { static constexpr const char* signature = "y"; };
template <> struct BusType<std::int64_t> { static constexpr const char* signature = "x"; };
template <> struct BusType<double> { static constexpr const char* signature = "d"; };
template <> struct BusType<bool> { static constexpr const char* signature = "b"; };
template <> struct BusType<std::vector<unsigned char>> { static constexpr const char* signature = "ay"; };
template <> struct BusType<ObjectPaths> { static constexpr const char* signature = "ao"; };

// Extracts a value already checked to have BusType<T>::signature.
template <class T>
T fromVariant(GVariant* v);

// Reads the entries of an a{sv} dictionary with their types checked: a
// missing key gives nothing, a key of another type a BusFailure
// "<label>: <where>: <key> has type t, expected u".
class Dictionary {
 public:
  // `dict` must have type a{sv} and outlive the reader.
  Dictionary(const BusService& service, GVariant* dict, std::string where)
      : service_(service), dict_(dict), where_(std::move(where)) {}

  // T: std::string (s), std::uint32_t (u), std::int16_t (n), std::uint8_t
  // (y), std::int64_t (x), double (d), bool (b), std::vector<unsigned char>
  // (ay), ObjectPaths (ao).
  template <class T>
  std::optional<T> get(const char* key) const;

  // Throws BusFailure "<label>: <where>: <what>".
  [[noreturn]] void fail(const std::string& what) const;

 private:
  Variant lookup(const char* key, const char* type) const;

  const BusService& service_;
  GVariant* dict_;
  std::string where_;
};

// What the bus thread tells a session, and hears from it.
class BusSessionHost {
 public:
  virtual ~BusSessionHost() = default;
  // True when the thread's watch of `busName` knows that `owner` no longer
  // holds it.
  virtual bool hasLeft(const char* busName, const std::string& owner) = 0;
  // The message for a request that ends before the session's current wait
  // is over ("ModemManager: no answer to GetCellInfo on /path before the
  // request ended"); empty when the session waits for nothing.
  virtual void unfinished(const std::string& message) = 0;
};

// A signal subscription, dropped with this object.
class BusSubscription {
 public:
  BusSubscription(GDBusConnection* connection, const std::string& sender, const std::string& path,
                  const char* iface, const char* member, const char* arg0,
                  std::function<void(GVariant* parameters)> handler);
  ~BusSubscription();
  BusSubscription(const BusSubscription&) = delete;
  BusSubscription& operator=(const BusSubscription&) = delete;

 private:
  static void dispatch(GDBusConnection*, const gchar*, const gchar*, const gchar*, const gchar*,
                       GVariant* parameters, gpointer self);
  GDBusConnection* connection_;
  guint id_ = 0;
  std::function<void(GVariant*)> handler_;
};

// The calls of one measurement. Each service is addressed through the
// owner it had when the session first called it, so that a service that
// restarts in the middle fails the measurement instead of mixing two
// instances' answers.
class BusSession {
 public:
  BusSession(GDBusConnection* connection, GCancellable* cancellable, BusSessionHost& host)
      : connection_(connection), cancellable_(cancellable), host_(host) {}

  // The unique name owning the service's name; BusFailure "<label>
  // (<name>) is not on the system bus" when none.
  const std::string& owner(const BusService& service);

  // Calls `method` and returns the answer, which must have `replyType`
  // ("()" for none). `args` is a floating GVariant tuple or null.
  Variant call(const BusService& service, const std::string& path, const char* iface,
               const char* method, GVariant* args, const char* replyType);
  // A property's value, which must have the type T stands for (see
  // Dictionary::get).
  template <class T>
  T property(const BusService& service, const std::string& path, const char* iface,
             const char* name) {
    Variant v = propertyValue(service, path, iface, name, BusType<T>::signature);
    return fromVariant<T>(v.get());
  }
  // All properties of an interface: an a{sv} value.
  Variant properties(const BusService& service, const std::string& path, const char* iface);

  // Subscribes to a signal of the service; `handler` runs on this thread
  // while wait() turns the loop.
  std::unique_ptr<BusSubscription> subscribe(const BusService& service, const std::string& path,
                                             const char* iface, const char* member,
                                             std::function<void(GVariant*)> handler,
                                             const char* arg0 = nullptr);
  // Turns this thread's loop until done(). BusFailure when the service
  // leaves the bus or `limitMs` pass first; BusCancelled when cancelled.
  void wait(const BusService& service, const std::function<bool()>& done, int limitMs,
            const std::string& what);

  // True for the D-Bus errors of an object that no longer exists.
  static bool isGone(const BusFailure& failure);

 private:
  Variant propertyValue(const BusService& service, const std::string& path, const char* iface,
                        const char* name, const char* type);
  [[noreturn]] void fail(const BusService& service, const std::string& what, GError* error);

  GDBusConnection* connection_;
  GCancellable* cancellable_;
  BusSessionHost& host_;
  std::vector<std::pair<std::string, std::string>> owners_;  // bus name, unique name
};

template <class T>
std::optional<T> Dictionary::get(const char* key) const {
  Variant v = lookup(key, BusType<T>::signature);
  if (!v) return std::nullopt;
  return fromVariant<T>(v.get());
}

}  // namespace host
}  // namespace platform
}  // namespace lodestack

#endif  // LODESTACK_SRC_PLATFORM_HOST_SYSTEMBUS_H
