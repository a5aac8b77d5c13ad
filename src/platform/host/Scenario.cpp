#include "platform/host/Scenario.h"

#include <algorithm>
#include <cctype>
#include <cmath>
#include <cstdlib>
#include <fstream>
#include <limits>
#include <map>
#include <mutex>
#include <sstream>

#include <nlohmann/json.hpp>

#include "lodestack/platform/HostPlatform.h"

namespace lodestack {
namespace platform {
namespace host {

using nlohmann::json;

namespace {

// One value of the document, with the path that names it in messages.
class Node {
 public:
  Node(const json& value, std::string path, const std::string& source)
      : value_(value), path_(std::move(path)), source_(source) {}

  [[noreturn]] void fail(const std::string& what) const {
    throw ScenarioError("scenario " + source_ + ": " + (path_.empty() ? "top level" : path_) +
                        ": " + what);
  }

  // An object whose keys are all among `allowed` ("comment" is always
  // allowed and ignored).
  const Node& object(std::initializer_list<const char*> allowed) const {
    if (!value_.is_object()) fail("expected an object, got " + describe());
    for (const auto& item : value_.items()) {
      if (item.key() == "comment") continue;
      if (std::none_of(allowed.begin(), allowed.end(),
                       [&](const char* k) { return item.key() == k; }))
        child(item.key()).fail("unknown field");
    }
    return *this;
  }
  bool isObject() const { return value_.is_object(); }
  bool has(const char* key) const { return value_.is_object() && value_.contains(key); }
  Node at(const char* key) const {
    if (!has(key)) fail(std::string("missing field \"") + key + "\"");
    return child(key);
  }
  std::optional<Node> get(const char* key) const {
    return has(key) ? std::optional<Node>(child(key)) : std::nullopt;
  }
  std::vector<Node> array() const {
    if (!value_.is_array()) fail("expected an array, got " + describe());
    std::vector<Node> items;
    for (std::size_t i = 0; i < value_.size(); ++i)
      items.emplace_back(value_[i], path_ + "[" + std::to_string(i) + "]", source_);
    return items;
  }

  long long integer(long long min, long long max) const {
    if (!value_.is_number_integer())
      fail("expected an integer from " + std::to_string(min) + " to " + std::to_string(max) +
           ", got " + describe());
    const long long v = value_.is_number_unsigned()
                            ? static_cast<long long>(std::min<unsigned long long>(
                                  value_.get<unsigned long long>(),
                                  static_cast<unsigned long long>(std::numeric_limits<long long>::max())))
                            : value_.get<long long>();
    if (v < min || v > max)
      fail("expected an integer from " + std::to_string(min) + " to " + std::to_string(max) +
           ", got " + std::to_string(v));
    return v;
  }
  template <class T>
  T integer() const {
    return static_cast<T>(integer(std::numeric_limits<T>::min(), std::numeric_limits<T>::max()));
  }
  double number(double min, double max) const {
    if (!value_.is_number()) fail("expected a number, got " + describe());
    const double v = value_.get<double>();
    if (!(v >= min && v <= max)) {
      std::ostringstream range;
      range << "expected a number from " << min << " to " << max << ", got " << v;
      fail(range.str());
    }
    return v;
  }
  bool boolean() const {
    if (!value_.is_boolean()) fail("expected true or false, got " + describe());
    return value_.get<bool>();
  }
  std::string string() const {
    if (!value_.is_string()) fail("expected a string, got " + describe());
    return value_.get<std::string>();
  }

 private:
  Node child(const std::string& key) const {
    return Node(value_[key], path_.empty() ? key : path_ + "." + key, source_);
  }
  std::string describe() const {
    std::string text = value_.dump();
    if (text.size() > 40) text = text.substr(0, 37) + "...";
    return std::string(value_.type_name()) + " " + text;
  }

  const json& value_;
  std::string path_;
  const std::string& source_;
};

const double kForever = std::numeric_limits<double>::infinity();
const unsigned int kMaxUint32 = std::numeric_limits<unsigned int>::max();

// A BSSID of 6 or 8 bytes written as hex pairs separated by ':' or '-'.
void parseBssid(const Node& node, OxelMacAddress& mac) {
  const std::string text = node.string();
  unsigned char bytes[8];
  unsigned int count = 0;
  std::size_t i = 0;
  while (i < text.size() && count < 8) {
    if (i + 2 > text.size() || !std::isxdigit(static_cast<unsigned char>(text[i])) ||
        !std::isxdigit(static_cast<unsigned char>(text[i + 1])))
      break;
    bytes[count++] = static_cast<unsigned char>(std::stoul(text.substr(i, 2), nullptr, 16));
    i += 2;
    if (i == text.size()) break;
    if (text[i] != ':' && text[i] != '-') break;
    ++i;
  }
  if (i != text.size() || (count != 6 && count != 8))
    node.fail("expected a BSSID of 6 or 8 hex bytes like \"00:1a:2b:3c:4d:5e\", got \"" + text + "\"");
  mac.setBytes(bytes, count);
}

template <class E>
void parseCellIdentity(const Node& node, E& e) {
  e.setCountryCode(node.at("mcc").integer(0, 999));
  e.setNetworkId(node.at("mnc").integer(0, 999));
}

void parseGsmNeighbour(const Node& node, OxelGsmNeighbourCell& n) {
  node.object({"bsic", "arfcn", "lac", "cid", "rxLevel"});
  n.setColor(node.at("bsic").integer<unsigned char>());
  n.setFrequency(node.at("arfcn").integer<unsigned short>());
  if (auto v = node.get("lac")) n.setLocationAreaCode(v->integer<unsigned short>());
  if (auto v = node.get("cid")) n.setCellId(v->integer<unsigned short>());
  if (auto v = node.get("rxLevel")) n.setPowerRx(v->integer<unsigned char>());
}

// RSCP in dBm; absent is "not available" (255).
int parseRscp(const Node& node) {
  auto v = node.get("rscp");
  return v ? static_cast<int>(v->integer(-128, 127)) : 255;
}

void parseWcdmaNeighbour(const Node& node, OxelWcdmaNeighbourCell& n) {
  node.object({"uarfcnDl", "psc", "ucid", "ecNo", "rscp", "pathloss"});
  n.setFrequencyDl(node.at("uarfcnDl").integer<unsigned short>());
  n.setScramblingCode(node.at("psc").integer<unsigned short>());
  if (auto v = node.get("ucid")) n.setUcId(static_cast<unsigned int>(v->integer(0, kMaxUint32)));
  if (auto v = node.get("ecNo")) n.setEcNo(v->integer<unsigned char>());
  n.setRscp(parseRscp(node));
  if (auto v = node.get("pathloss")) n.setPathloss(v->integer<unsigned char>());
}

void parseTdscdmaNeighbour(const Node& node, OxelTdscdmaNeighbourCell& n) {
  node.object({"uarfcn", "cellParameterId", "ucid", "carrierRssi", "rscp", "pathloss"});
  n.setFrequency(node.at("uarfcn").integer<unsigned short>());
  n.setCellParameterId(node.at("cellParameterId").integer<unsigned char>());
  if (auto v = node.get("ucid")) n.setUcId(static_cast<unsigned int>(v->integer(0, kMaxUint32)));
  if (auto v = node.get("carrierRssi")) n.setCarrierRssi(v->integer<unsigned char>());
  n.setRscp(parseRscp(node));
  if (auto v = node.get("pathloss")) n.setPathloss(v->integer<unsigned char>());
}

template <class E, class ParseNeighbour>
void parseUmts(const Node& node, E& e, ParseNeighbour parseNeighbour) {
  node.object({"type", "timestamp", "mcc", "mnc", "ucid", "lac", "neighbours"});
  parseCellIdentity(node, e);
  e.setUcId(static_cast<unsigned int>(node.at("ucid").integer(0, kMaxUint32)));
  if (auto v = node.get("lac")) e.setLocationAreaCode(v->integer<unsigned short>());
  if (auto list = node.get("neighbours")) {
    for (const Node& item : list->array()) {
      typename E::NeighbourCell n;
      parseNeighbour(item, n);
      e.addNeighbourCell(n);
    }
  }
}

ElementValue parseElementValue(const Node& node, const std::string& type) {
  if (type == "gsm") {
    node.object({"type", "timestamp", "mcc", "mnc", "lac", "cid", "rxLevel", "timingAdvance",
                 "neighbours"});
    OxelElementGSM e;
    parseCellIdentity(node, e);
    if (auto v = node.get("lac")) e.setLocationAreaCode(v->integer<unsigned short>());
    if (auto v = node.get("cid")) e.setCellId(v->integer<unsigned short>());
    if (auto v = node.get("rxLevel")) e.setPowerRx(v->integer<unsigned char>());
    if (auto v = node.get("timingAdvance")) e.setTimingAdvance(v->integer<unsigned char>());
    if (auto list = node.get("neighbours")) {
      for (const Node& item : list->array()) {
        OxelGsmNeighbourCell n;
        parseGsmNeighbour(item, n);
        e.addNeighbourCell(n);
      }
    }
    return e;
  }
  if (type == "wcdma") {
    OxelElementWCDMA e;
    parseUmts(node, e, parseWcdmaNeighbour);
    return e;
  }
  if (type == "tdscdma") {
    OxelElementTDSCDMA e;
    parseUmts(node, e, parseTdscdmaNeighbour);
    return e;
  }
  if (type == "lte") {
    node.object({"type", "timestamp", "mcc", "mnc", "eci"});
    OxelElementLTE e;
    parseCellIdentity(node, e);
    e.setCellId(static_cast<unsigned int>(node.at("eci").integer(0, kMaxUint32)));
    return e;
  }
  if (type == "wlan") {
    node.object({"type", "timestamp", "bssid", "rxLevel", "txLevel", "rssi", "ssid"});
    OxelElementWLAN e;
    parseBssid(node.at("bssid"), e.mac());
    if (auto v = node.get("rxLevel")) e.setPowerRx(v->integer<signed char>());
    if (auto v = node.get("txLevel")) e.setPowerTx(v->integer<signed char>());
    if (auto v = node.get("rssi")) e.setRssi(static_cast<unsigned char>(v->integer(0, 100)));
    if (auto v = node.get("ssid")) e.setSsid(v->string());
    return e;
  }
  if (type == "other") {
    node.object({"type", "timestamp", "elementId"});
    return OxelObservationElement(static_cast<int>(node.at("elementId").integer(5, 1000)));
  }
  node.at("type").fail("expected \"gsm\", \"wcdma\", \"tdscdma\", \"lte\", \"wlan\" or \"other\", got \"" +
                       type + "\"");
}

ElementTemplate parseElement(const Node& node) {
  if (!node.isObject()) node.fail("expected an element object");
  ElementTemplate t{parseElementValue(node, node.at("type").string()), false};
  if (auto v = node.get("timestamp")) {
    const unsigned int time = static_cast<unsigned int>(v->integer(0, kMaxUint32));
    std::visit([time](OxelObservationElement& e) { e.setTimestamp(time); }, t.value);
    t.hasTimestamp = true;
  }
  return t;
}

// "answer" and "delayMs" of a kind or a result.
std::optional<Answer> parseAnswer(const Node& node, const Answer& base) {
  if (!node.has("answer") && !node.has("delayMs")) return std::nullopt;
  Answer answer = base;
  if (auto v = node.get("answer")) {
    static const std::map<std::string, Answer::Mode> kModes = {{"delayed", Answer::Delayed},
                                                               {"synchronous", Answer::Synchronous},
                                                               {"never", Answer::Never},
                                                               {"throw", Answer::Throw}};
    auto mode = kModes.find(v->string());
    if (mode == kModes.end())
      v->fail("expected \"delayed\", \"synchronous\", \"never\" or \"throw\", got \"" + v->string() + "\"");
    answer.mode = mode->second;
  }
  if (auto v = node.get("delayMs")) answer.delayMs = static_cast<int>(v->integer(0, 3600 * 1000));
  return answer;
}

Result parseResult(const Node& node, bool cellular, const Answer& kindAnswer) {
  if (cellular)
    node.object({"answer", "delayMs", "unreliable", "dchTimestamp", "dchStateDuration", "elements"});
  else
    node.object({"answer", "delayMs", "elements"});
  Result r;
  r.answer = parseAnswer(node, kindAnswer);
  if (auto v = node.get("unreliable")) r.unreliableState = v->boolean() ? 1 : 0;
  if (auto v = node.get("dchTimestamp")) r.dchTimestamp = static_cast<long>(v->integer(-1, kMaxUint32));
  if (auto v = node.get("dchStateDuration"))
    r.dchStateDuration = static_cast<int>(v->integer(-2, 10 * 365 * 86400));
  if (auto list = node.get("elements"))
    for (const Node& item : list->array()) r.elements.push_back(parseElement(item));
  return r;
}

Kind parseKind(const std::optional<Node>& node, bool cellular) {
  Kind kind;
  if (!node) {
    kind.results.emplace_back();  // answers with an empty result
    return kind;
  }
  if (cellular)
    node->object({"answer", "delayMs", "results", "techChange"});
  else
    node->object({"answer", "delayMs", "results"});
  if (auto answer = parseAnswer(*node, kind.answer)) kind.answer = *answer;
  const std::vector<Node> results = node->at("results").array();
  if (results.empty()) node->at("results").fail("expected at least one result");
  for (const Node& item : results) kind.results.push_back(parseResult(item, cellular, kind.answer));
  return kind;
}

void parseGnss(const Node& node, Scenario& s) {
  node.object({"service", "fixes", "loop"});
  if (auto list = node.get("service")) {
    for (const Node& item : list->array()) {
      item.object({"from", "enabled"});
      const double from = item.at("from").number(0, kForever);
      if (!s.gnssService.empty() && from < s.gnssService.back().from)
        item.at("from").fail("periods must be in time order");
      s.gnssService.push_back({from, item.at("enabled").boolean()});
    }
  }
  if (auto list = node.get("fixes")) {
    for (const Node& item : list->array()) {
      item.object({"at", "latitude", "longitude", "altitude", "accuracy", "verticalAccuracy",
                   "speedKmh", "direction", "climb", "time"});
      Fix f;
      f.at = item.at("at").number(0, kForever);
      if (!s.fixes.empty() && f.at < s.fixes.back().at)
        item.at("at").fail("fixes must be in time order");
      f.latitude = item.at("latitude").number(-90, 90);
      f.longitude = item.at("longitude").number(-180, 180);
      if (auto v = item.get("altitude")) f.altitude = v->number(-1000, 100000);
      f.accuracy = item.at("accuracy").number(0, 1e7);
      if (auto v = item.get("verticalAccuracy")) f.verticalAccuracy = v->number(0, 1e7);
      if (auto v = item.get("speedKmh")) f.speedKmh = v->number(0, 100000);
      if (auto v = item.get("direction")) f.direction = v->number(0, 360);
      if (auto v = item.get("climb")) f.climb = v->number(-1000, 1000);
      if (auto v = item.get("time")) f.time = static_cast<std::time_t>(v->integer(0, kMaxUint32));
      s.fixes.push_back(f);
    }
  }
  if (auto v = node.get("loop")) s.loopTrack = v->boolean();
}

std::string readFile(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  if (!in) throw ScenarioError("scenario " + path + ": cannot be opened");
  std::ostringstream text;
  text << in.rdbuf();
  if (in.bad()) throw ScenarioError("scenario " + path + ": cannot be read");
  return text.str();
}

std::mutex gMutex;
std::string gLastError;

}  // namespace

OxelMeasurements Result::build(std::time_t started, std::time_t now) const {
  OxelMeasurements m;
  m.setCellUnreliableState(unreliableState);
  if (dchTimestamp)
    m.setCellDchTimestamp(*dchTimestamp);
  else if (dchStateDuration == -2)
    m.setCellDchTimestamp(0);
  else if (dchStateDuration == -1)
    m.setCellDchTimestamp(-1);
  else
    m.setCellDchTimestamp(static_cast<long>(started) - dchStateDuration);
  for (const ElementTemplate& t : elements) {
    std::shared_ptr<OxelObservationElement> e = std::visit(
        [](const auto& value) -> std::shared_ptr<OxelObservationElement> {
          return std::make_shared<std::decay_t<decltype(value)>>(value);
        },
        t.value);
    if (!t.hasTimestamp) e->setTimestamp(static_cast<unsigned int>(now));
    m.add(std::move(e));
  }
  return m;
}

double Scenario::elapsed() const {
  return std::chrono::duration<double>(std::chrono::steady_clock::now() - loaded).count();
}

bool Scenario::inTechChange(double t) const {
  return std::any_of(techChange.begin(), techChange.end(),
                     [t](const Window& w) { return t >= w.from && t < w.until; });
}

bool Scenario::serviceEnabled(double t) const {
  bool enabled = true;
  for (const ServicePeriod& p : gnssService)
    if (p.from <= t) enabled = p.enabled;
  return enabled;
}

double Scenario::nextServiceChange(double t) const {
  bool current = serviceEnabled(t);
  for (const ServicePeriod& p : gnssService)
    if (p.from > t && p.enabled != current) return p.from;
  return -1;
}

const Fix* Scenario::fixAt(double t) const {
  if (fixes.empty()) return nullptr;
  if (loopTrack && t > fixes.back().at) {
    // One more second after the last fix before the track starts again.
    const double period = fixes.back().at + 1.0;
    t = std::fmod(t, period);
  }
  const Fix* found = nullptr;
  for (const Fix& f : fixes)
    if (f.at <= t) found = &f;
  return found;
}

std::shared_ptr<const Scenario> parseScenario(const std::string& text, const std::string& source) {
  json document;
  try {
    document = json::parse(text);
  } catch (const json::parse_error& e) {
    // "[json.exception.parse_error.101] parse error at line 3, column 5: ..."
    std::string what = e.what();
    const std::size_t start = what.find("] ");
    throw ScenarioError("scenario " + source + ": " +
                        (start == std::string::npos ? what : what.substr(start + 2)));
  }
  auto s = std::make_shared<Scenario>();
  s->source = source;
  const Node root(document, "", source);
  root.object({"name", "cellular", "wlan", "gnss"});
  if (auto v = root.get("name")) s->name = v->string();
  s->cellular = parseKind(root.get("cellular"), true);
  s->wlan = parseKind(root.get("wlan"), false);
  if (auto cellular = root.get("cellular")) {
    if (auto list = cellular->get("techChange")) {
      for (const Node& item : list->array()) {
        item.object({"from", "until"});
        Window w{item.at("from").number(0, kForever), item.at("until").number(0, kForever)};
        if (w.until < w.from) item.at("until").fail("ends before it starts");
        s->techChange.push_back(w);
      }
    }
  }
  if (auto gnss = root.get("gnss")) parseGnss(*gnss, *s);
  return s;
}

std::shared_ptr<const Scenario> loadScenario(const std::string& path) {
  if (path.empty()) return parseScenario(kDefaultScenario, "built-in street");
  return parseScenario(readFile(path), path);
}

std::shared_ptr<const Scenario> acquireScenario() {
  static std::mutex mutex;
  static std::map<std::string, std::weak_ptr<const Scenario>> loaded;
  const char* env = std::getenv("LODESTACK_SCENARIO");
  const std::string path = env ? env : "";
  std::lock_guard<std::mutex> lock(mutex);
  if (std::shared_ptr<const Scenario> shared = loaded[path].lock()) return shared;
  try {
    std::shared_ptr<const Scenario> s = loadScenario(path);
    loaded[path] = s;
    return s;
  } catch (const ScenarioError& e) {
    setLastError(e.what());
    throw;
  }
}

void setLastError(const std::string& message) {
  std::lock_guard<std::mutex> lock(gMutex);
  gLastError = message;
}

}  // namespace host

std::string lastError() {
  std::lock_guard<std::mutex> lock(host::gMutex);
  return host::gLastError;
}

std::string checkScenarioFile(const std::string& path) {
  try {
    host::loadScenario(path);
    return std::string();
  } catch (const host::ScenarioError& e) {
    return e.what();
  }
}

}  // namespace platform
}  // namespace lodestack
