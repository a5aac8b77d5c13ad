#include "GeolocationService.h"

#include <cmath>
#include <cstdio>
#include <memory>

#include <curl/curl.h>

namespace lodestack {
namespace scan {
namespace {

constexpr std::size_t kLongestAnswer = 1 << 20;

struct Exchange {
  std::string body;
  bool tooLong = false;
  const std::atomic<bool>* abandon = nullptr;
};

extern "C" std::size_t onBody(char* data, std::size_t size, std::size_t count, void* user) {
  Exchange& exchange = *static_cast<Exchange*>(user);
  const std::size_t bytes = size * count;
  if (exchange.body.size() + bytes > kLongestAnswer) {
    exchange.tooLong = true;
    return 0;  // ends the transfer with a write error
  }
  exchange.body.append(data, bytes);
  return bytes;
}

extern "C" int onProgress(void* user, curl_off_t, curl_off_t, curl_off_t, curl_off_t) {
  return static_cast<Exchange*>(user)->abandon->load() ? 1 : 0;
}

struct EasyDeleter {
  void operator()(CURL* curl) const { curl_easy_cleanup(curl); }
};
struct ListDeleter {
  void operator()(curl_slist* list) const { curl_slist_free_all(list); }
};

std::string seconds(double value) {
  char text[32];
  std::snprintf(text, sizeof text, "%g", value);
  return text;
}

std::string failureOf(CURLcode code, const char* detail, const Exchange& exchange,
                      double timeoutSeconds) {
  const std::string why = *detail ? detail : curl_easy_strerror(code);
  switch (code) {
    case CURLE_OPERATION_TIMEDOUT:
      return "no answer within " + seconds(timeoutSeconds) + " s";
    case CURLE_COULDNT_CONNECT:
      return "could not connect to the service (" + why + ")";
    case CURLE_COULDNT_RESOLVE_HOST:
    case CURLE_COULDNT_RESOLVE_PROXY:
      return "could not find the service's host (" + why + ")";
    case CURLE_ABORTED_BY_CALLBACK:
      return "abandoned";
    case CURLE_WRITE_ERROR:
      if (exchange.tooLong) return "the answer is longer than 1 MiB";
      break;
    default:
      break;
  }
  return "the request failed (" + why + ")";
}

}  // namespace

GeolocationService::GeolocationService(const std::string& url, const std::string& key,
                                       double timeoutSeconds)
    : url_(serviceUrl(url, key)), timeoutSeconds_(timeoutSeconds) {
  curl_global_init(CURL_GLOBAL_DEFAULT);
}

GeolocationService::~GeolocationService() { curl_global_cleanup(); }

ServiceAnswer GeolocationService::post(const std::string& body,
                                       const std::atomic<bool>& abandon) const {
  ServiceAnswer answer;
  const std::unique_ptr<CURL, EasyDeleter> curl(curl_easy_init());
  curl_slist* headers = nullptr;
  for (const char* header : {"Content-Type: application/json", "Accept: application/json",
                             "Expect:"}) {  // no 100-continue round trip
    curl_slist* longer = curl_slist_append(headers, header);
    if (!longer) break;
    headers = longer;
  }
  const std::unique_ptr<curl_slist, ListDeleter> headerList(headers);
  if (!curl || !headers) {
    answer.failure = "the request could not be prepared";
    return answer;
  }
  Exchange exchange;
  exchange.abandon = &abandon;
  char detail[CURL_ERROR_SIZE] = {};
  CURL* c = curl.get();
  curl_easy_setopt(c, CURLOPT_URL, url_.c_str());
  curl_easy_setopt(c, CURLOPT_PROTOCOLS_STR, "http,https");
  curl_easy_setopt(c, CURLOPT_POST, 1L);
  curl_easy_setopt(c, CURLOPT_POSTFIELDS, body.data());
  curl_easy_setopt(c, CURLOPT_POSTFIELDSIZE_LARGE, static_cast<curl_off_t>(body.size()));
  curl_easy_setopt(c, CURLOPT_HTTPHEADER, headers);
  curl_easy_setopt(c, CURLOPT_USERAGENT, "lodestack-scan/" LODESTACK_VERSION);
  curl_easy_setopt(c, CURLOPT_TIMEOUT_MS, static_cast<long>(std::ceil(timeoutSeconds_ * 1000)));
  // The post may run off the main thread: no signals for time-outs.
  curl_easy_setopt(c, CURLOPT_NOSIGNAL, 1L);
  curl_easy_setopt(c, CURLOPT_WRITEFUNCTION, onBody);
  curl_easy_setopt(c, CURLOPT_WRITEDATA, &exchange);
  curl_easy_setopt(c, CURLOPT_XFERINFOFUNCTION, onProgress);
  curl_easy_setopt(c, CURLOPT_XFERINFODATA, &exchange);
  curl_easy_setopt(c, CURLOPT_NOPROGRESS, 0L);
  curl_easy_setopt(c, CURLOPT_ERRORBUFFER, detail);

  const CURLcode code = curl_easy_perform(c);
  if (code != CURLE_OK) {
    answer.abandoned = code == CURLE_ABORTED_BY_CALLBACK;
    answer.failure = failureOf(code, detail, exchange, timeoutSeconds_);
    return answer;
  }
  curl_easy_getinfo(c, CURLINFO_RESPONSE_CODE, &answer.status);
  answer.body = std::move(exchange.body);
  return answer;
}

std::string serviceUrl(const std::string& url, const std::string& key) {
  if (key.empty()) return url;
  static const char kHex[] = "0123456789ABCDEF";
  std::string text = url + (url.find('?') == std::string::npos ? "?key=" : "&key=");
  for (const unsigned char c : key) {
    const bool unreserved = (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') ||
                            (c >= '0' && c <= '9') || c == '-' || c == '.' || c == '_' || c == '~';
    if (unreserved) {
      text += static_cast<char>(c);
    } else {
      text += '%';
      text += kHex[c >> 4];
      text += kHex[c & 0xF];
    }
  }
  return text;
}

}  // namespace scan
}  // namespace lodestack
