// GeolocationService: posts geolocation requests to a web service over HTTP
// with libcurl and hands back what it answered.
//
// Each post is one exchange, never retried or redirected:
//   POST <url>?key=KEY (&key=KEY when the URL has a query already; no key
//   part without a key), Content-Type: application/json,
//   User-Agent: lodestack-scan/<version>, the request as the body.
// The whole exchange, connecting included, is bounded by the time-out. The
// environment's proxy settings (http_proxy, no_proxy, ...) apply as libcurl
// reads them.
//
// One post at a time per object; the post may run on any thread (the tool
// runs it off the event loop's thread). Make and destroy the object on one
// thread while no other thread uses libcurl's global state.
#ifndef LODESTACK_SCAN_GEOLOCATIONSERVICE_H
#define LODESTACK_SCAN_GEOLOCATIONSERVICE_H

#include <atomic>
#include <string>

namespace lodestack {
namespace scan {

struct ServiceAnswer {
  // Why no answer came, one line ("no answer within 10 s", "could not
  // connect to the service (...)", ...); empty when the service answered.
  std::string failure;
  bool abandoned = false;  // the caller gave up; failure says so
  long status = 0;         // the HTTP status of the answer
  std::string body;
};

class GeolocationService {
 public:
  // `url` starts with http:// or https://; `key` may be empty.
  GeolocationService(const std::string& url, const std::string& key, double timeoutSeconds);
  ~GeolocationService();
  GeolocationService(const GeolocationService&) = delete;
  GeolocationService& operator=(const GeolocationService&) = delete;

  // Posts `body` and blocks until the answer, the time-out, or `abandon`
  // reading true (looked at once a second or more often), whichever comes
  // first. An answer longer than 1 MiB is a failure.
  ServiceAnswer post(const std::string& body, const std::atomic<bool>& abandon) const;

 private:
  std::string url_;
  double timeoutSeconds_;
};

// `url` with the key appended as the services expect: "?key=" or, when the
// URL has a query already, "&key=", the key percent-encoded. `url` itself
// when `key` is empty.
std::string serviceUrl(const std::string& url, const std::string& key);

}  // namespace scan
}  // namespace lodestack

#endif  // LODESTACK_SCAN_GEOLOCATIONSERVICE_H
