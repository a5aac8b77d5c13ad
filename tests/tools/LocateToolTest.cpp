// lodestack-scan --locate end to end: the built program posts to a stand-in
// geolocation service on 127.0.0.1 (tests/tools/geolocation_server.py),
// which logs every request it gets. Nothing leaves the machine.
#include <gtest/gtest.h>

#include <arpa/inet.h>
#include <netinet/in.h>
#include <sys/socket.h>

#include <cctype>
#include <cmath>
#include <string>
#include <vector>

#include "ToolProcess.h"

namespace {

using namespace tooltest;

const std::string kTestDir = LODESTACK_TOOL_TEST_DIR;
const std::string kScenario = kTestDir + "/locate.json";

// The stand-in service, running while the object lives.
class Service {
 public:
  // `answer` is "LAT,LNG,ACCURACY", what a normal answer holds.
  Service(const std::string& log, const std::string& answer) : log_(log) {
    int out[2];
    if (pipe2(out, O_CLOEXEC) != 0) return;
    pid_ = fork();
    if (pid_ == 0) {
      dup2(out[1], 1);
      const std::string script = kTestDir + "/geolocation_server.py";
      execl("/usr/bin/python3", "python3", script.c_str(), log.c_str(), "--answer", answer.c_str(),
            static_cast<char*>(nullptr));
      _exit(127);
    }
    close(out[1]);
    // Its first line is the port it listens on.
    std::string line;
    pollfd p = {out[0], POLLIN, 0};
    char c = 0;
    while (line.find('\n') == std::string::npos && poll(&p, 1, 10000) == 1 &&
           read(out[0], &c, 1) == 1) {
      line += c;
    }
    close(out[0]);
    port_ = std::atoi(line.c_str());
  }
  ~Service() {
    if (pid_ <= 0) return;
    kill(pid_, SIGTERM);
    waitpid(pid_, nullptr, 0);
  }
  Service(const Service&) = delete;
  Service& operator=(const Service&) = delete;

  bool running() const { return port_ > 0; }
  std::string url(const std::string& path = "/v1/geolocate") const {
    return "http://127.0.0.1:" + std::to_string(port_) + path;
  }
  // The requests it got, in order: {"method", "path", "headers", "body"}.
  std::vector<Json> requests() const {
    std::vector<Json> all;
    for (const std::string& line : linesOf(readFile(log_))) all.push_back(Json::parse(line));
    return all;
  }

 private:
  std::string log_;
  pid_t pid_ = -1;
  int port_ = 0;
};

// Great-circle distance by the haversine formula on the sphere the
// library's geodesy uses.
double haversineMetres(double lat1, double lon1, double lat2, double lon2) {
  constexpr double kRadius = 6371010.0;
  const double rad = M_PI / 180;
  const double a =
      std::pow(std::sin((lat2 - lat1) * rad / 2), 2) +
      std::cos(lat1 * rad) * std::cos(lat2 * rad) * std::pow(std::sin((lon2 - lon1) * rad / 2), 2);
  return 2 * kRadius * std::asin(std::sqrt(a));
}

class LocateToolTest : public ToolTest {
 protected:
  Json scenario_ = Json::parse(readFile(kScenario));
  const Json& fix_ = scenario_["gnss"]["fixes"][0];

  std::vector<Json> linesOfKind(const std::string& out, const std::string& kind) {
    std::vector<Json> found;
    for (const std::string& line : linesOf(out)) {
      const Json object = Json::parse(line);
      if (object.value("kind", "") == kind) found.push_back(object);
    }
    return found;
  }
};

// What the services expect of an access point of the scenario: sent unless
// its name ends in "_nomap", its address is locally administered, or it is
// no 6-byte MAC address.
bool expectedToBeSent(const Json& ap) {
  const std::string ssid = ap.value("ssid", "");
  const std::string bssid = ap["bssid"];
  const bool noMap = ssid.size() >= 6 && ssid.compare(ssid.size() - 6, 6, "_nomap") == 0;
  const bool local = (std::stoi(bssid.substr(0, 2), nullptr, 16) & 0x02) != 0;
  return !noMap && !local && bssid.size() == 17;
}

std::string lower(std::string text) {
  for (char& c : text) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  return text;
}

TEST_F(LocateToolTest, TheRequestCarriesTheRoundsMeasurementsLessTheOptedOut) {
  Service service(tempFile("requests"), "60.172,24.945,400");
  ASSERT_TRUE(service.running());
  const Outcome run = runTool({"--locate", service.url(), "--locate-key", "k y&z", "--rounds", "2",
                               "--interval", "0", "--json"},
                              kScenario);
  ASSERT_EQ(0, run.exitStatus) << run.err;
  EXPECT_EQ("", run.err);
  const std::vector<Json> requests = service.requests();
  ASSERT_EQ(2u, requests.size());

  const std::string version = runTool({"--version"}).out;  // "lodestack-scan 1.2.3\n"
  const std::string userAgent = "lodestack-scan/" + version.substr(15, version.size() - 16);
  for (const Json& request : requests) {
    EXPECT_EQ("POST", request["method"]);
    EXPECT_EQ("/v1/geolocate?key=k%20y%26z", request["path"]);
    EXPECT_EQ(userAgent, request["headers"].value("User-Agent", "")) << request["headers"];
    EXPECT_EQ("application/json", request["headers"].value("Content-Type", ""));
  }

  // Round 1: a GSM cell with a neighbour whose id is known and one whose id
  // is not (no tower); the scenario's levels are RXLEV, sent in dBm.
  const Json first = Json::parse(requests[0]["body"].get<std::string>());
  const Json& gsm = scenario_["cellular"]["results"][0]["elements"][0];
  ASSERT_EQ(2u, first["cellTowers"].size()) << first;
  const Json& serving = first["cellTowers"][0];
  EXPECT_EQ("gsm", serving["radioType"]);
  EXPECT_EQ(gsm["mcc"], serving["mobileCountryCode"]);
  EXPECT_EQ(gsm["mnc"], serving["mobileNetworkCode"]);
  EXPECT_EQ(gsm["lac"], serving["locationAreaCode"]);
  EXPECT_EQ(gsm["cid"], serving["cellId"]);
  EXPECT_EQ(gsm["rxLevel"].get<int>() - 110, serving["signalStrength"]);
  EXPECT_EQ(gsm["timingAdvance"], serving["timingAdvance"]);
  const Json& neighbour = first["cellTowers"][1];
  EXPECT_EQ(gsm["neighbours"][0]["cid"], neighbour["cellId"]);
  EXPECT_EQ(gsm["neighbours"][0]["lac"], neighbour["locationAreaCode"]);
  EXPECT_EQ(gsm["neighbours"][0]["rxLevel"].get<int>() - 110, neighbour["signalStrength"]);
  EXPECT_EQ(gsm["mnc"], neighbour["mobileNetworkCode"]);

  // Round 2: a WCDMA cell, its RSCP already in dBm.
  const Json second = Json::parse(requests[1]["body"].get<std::string>());
  const Json& wcdma = scenario_["cellular"]["results"][1]["elements"][0];
  ASSERT_EQ(2u, second["cellTowers"].size()) << second;
  EXPECT_EQ("wcdma", second["cellTowers"][0]["radioType"]);
  EXPECT_EQ(wcdma["ucid"], second["cellTowers"][0]["cellId"]);
  EXPECT_EQ(wcdma["lac"], second["cellTowers"][0]["locationAreaCode"]);
  EXPECT_EQ(wcdma["mnc"], second["cellTowers"][0]["mobileNetworkCode"]);
  EXPECT_EQ(wcdma["neighbours"][0]["ucid"], second["cellTowers"][1]["cellId"]);
  EXPECT_EQ(wcdma["neighbours"][0]["rscp"], second["cellTowers"][1]["signalStrength"]);

  // Each round's access points, in the scenario's order, less the ones to
  // leave out.
  for (std::size_t round = 0; round < 2; ++round) {
    const Json body = Json::parse(requests[round]["body"].get<std::string>());
    Json expected = Json::array();
    for (const Json& ap : scenario_["wlan"]["results"][round]["elements"]) {
      if (!expectedToBeSent(ap)) continue;
      Json entry = {{"macAddress", lower(ap["bssid"])}};
      if (ap.contains("rxLevel")) entry["signalStrength"] = ap["rxLevel"];
      expected.push_back(entry);
    }
    EXPECT_GE(expected.size(), 2u);
    EXPECT_EQ(expected, body["wifiAccessPoints"]) << "round " << round + 1;
  }

  // --geolocation-request prints the very bodies sent.
  const Outcome printed =
      runTool({"--geolocation-request", "--rounds", "2", "--interval", "0"}, kScenario);
  ASSERT_EQ(0, printed.exitStatus) << printed.err;
  const std::vector<std::string> lines = linesOf(printed.out);
  ASSERT_EQ(2u, lines.size());
  EXPECT_EQ(requests[0]["body"], lines[0]);
  EXPECT_EQ(requests[1]["body"], lines[1]);
}

TEST_F(LocateToolTest, TheKeyComesFromTheOptionOrTheEnvironment) {
  Service service(tempFile("requests"), "60.172,24.945,400");
  ASSERT_TRUE(service.running());
  const Args once = {"--rounds", "1", "--interval", "0", "--kinds", "wlan"};
  const Env env = {{"LODESTACK_GEOLOCATION_KEY", "from-env"}};
  const auto run = [&](const std::string& url, const Args& more, const Env& environment) {
    Args args = once;
    args.push_back("--locate");
    args.push_back(url);
    args.insert(args.end(), more.begin(), more.end());
    EXPECT_EQ(0, runTool(args, kScenario, environment).exitStatus);
  };
  run(service.url("/v1/geolocate?lang=en"), {}, env);
  run(service.url(), {"--locate-key", "from-option"}, env);
  run(service.url(), {}, Env());
  const std::vector<Json> requests = service.requests();
  ASSERT_EQ(3u, requests.size());
  EXPECT_EQ("/v1/geolocate?lang=en&key=from-env", requests[0]["path"]);
  EXPECT_EQ("/v1/geolocate?key=from-option", requests[1]["path"]);
  EXPECT_EQ("/v1/geolocate", requests[2]["path"]);
}

TEST_F(LocateToolTest, AnAnswerBecomesAPositionComparedWithTheFix) {
  const double lat = 60.172, lng = 24.945;
  const double distance = haversineMetres(fix_["latitude"], fix_["longitude"], lat, lng);
  ASSERT_GT(distance, 350);
  ASSERT_LT(distance, 400);

  // 400 m: the fix is inside the circle.
  Service wide(tempFile("wide"), "60.172,24.945,400");
  ASSERT_TRUE(wide.running());
  const Outcome json =
      runTool({"--locate", wide.url(), "--rounds", "1", "--interval", "0", "--json"}, kScenario);
  ASSERT_EQ(0, json.exitStatus) << json.err;
  EXPECT_EQ("", json.err);
  const std::vector<Json> located = linesOfKind(json.out, "location");
  ASSERT_EQ(1u, located.size()) << json.out;
  const Json& position = located[0];
  EXPECT_EQ("location", Json::parse(linesOf(json.out).back())["kind"]) << "after the round";
  EXPECT_DOUBLE_EQ(lat, position["latitude"].get<double>());
  EXPECT_DOUBLE_EQ(lng, position["longitude"].get<double>());
  EXPECT_DOUBLE_EQ(400, position["accuracy"].get<double>());
  EXPECT_NEAR(distance, position["distance"].get<double>(), 0.05);
  EXPECT_EQ(true, position["inside"]);
  // The record's 50 % circle: a circular Gaussian whose 95 % circle is 400 m
  // has a deviation of 400 / sqrt(2 ln 20) per axis, and its radius r holds
  // half the probability where exp(-r^2 / 2 sigma^2) = 1/2.
  const double sigma = 400 / std::sqrt(2 * std::log(20.0));
  const double cep = position["horizontalCepUncertainty"].get<double>();
  EXPECT_NEAR(0.5, std::exp(-cep * cep / (2 * sigma * sigma)), 1e-4);

  const Outcome text =
      runTool({"--locate", wide.url(), "--rounds", "1", "--interval", "0"}, kScenario);
  ASSERT_EQ(0, text.exitStatus) << text.err;
  const std::string line = linesOf(text.out).back();
  const std::string head =
      "location: latitude 60.1720000, longitude 24.9450000, accuracy 400.0 m; ";
  ASSERT_EQ(0u, line.find(head)) << line;
  EXPECT_NEAR(distance, std::stod(line.substr(head.size())), 0.06) << line;
  EXPECT_NE(std::string::npos, line.find(" m from the GNSS fix, inside the accuracy circle"))
      << line;

  // 300 m: outside.
  Service narrow(tempFile("narrow"), "60.172,24.945,300");
  ASSERT_TRUE(narrow.running());
  const Outcome outside =
      runTool({"--locate", narrow.url(), "--rounds", "1", "--interval", "0", "--json"}, kScenario);
  ASSERT_EQ(0, outside.exitStatus) << outside.err;
  const std::vector<Json> far = linesOfKind(outside.out, "location");
  ASSERT_EQ(1u, far.size());
  EXPECT_EQ(false, far[0]["inside"]);

  // Without GNSS there is no fix to compare with.
  const Outcome alone = runTool({"--locate", wide.url(), "--rounds", "1", "--interval", "0",
                                 "--kinds", "cellular,wlan", "--json"},
                                kScenario);
  ASSERT_EQ(0, alone.exitStatus) << alone.err;
  const std::vector<Json> unmatched = linesOfKind(alone.out, "location");
  ASSERT_EQ(1u, unmatched.size());
  EXPECT_FALSE(unmatched[0].contains("distance"));
  EXPECT_FALSE(unmatched[0].contains("inside"));
}

TEST_F(LocateToolTest, FailuresSayWhyOnceAndTheNextRoundGoesOn) {
  Service service(tempFile("requests"), "60.172,24.945,400");
  ASSERT_TRUE(service.running());
  struct Case {
    std::string failure;  // the mode of the first answer; the second is normal
    std::string message;
  };
  const Case cases[] = {
      {"notfound", "no position for these measurements"},
      {"ratelimited", "the service answered HTTP 429: Too many requests, slow down"},
      {"forbidden", "the service answered HTTP 403: Missing or invalid API key."},
      {"slow", "no answer within 1 s"},
      {"malformed", "the answer is not a position: not JSON"},
      {"incomplete", "the answer is not a position: no numeric \"lat\" and \"lng\""},
  };
  std::size_t posted = 0;
  for (const Case& c : cases) {
    const Outcome run =
        runTool({"--locate", service.url("/" + c.failure + ",normal/v1/geolocate"),
                 "--locate-timeout", "1", "--rounds", "2", "--interval", "0", "--json"},
                kScenario);
    EXPECT_EQ(0, run.exitStatus) << c.failure;
    EXPECT_EQ("lodestack-scan: location: " + c.message + "\n", run.err) << c.failure;
    // Both rounds ran whole; only the second found a position.
    EXPECT_EQ(2u, linesOfKind(run.out, "cellular").size()) << c.failure;
    EXPECT_EQ(2u, linesOfKind(run.out, "wlan").size()) << c.failure;
    EXPECT_EQ(1u, linesOfKind(run.out, "location").size()) << c.failure;
    posted += 2;
    EXPECT_EQ(posted, service.requests().size()) << c.failure << ": one request per round";
  }

  // A port where nothing listens: bound, never listening, so it refuses.
  const int socketFd = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
  ASSERT_GE(socketFd, 0);
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
  socklen_t length = sizeof address;
  ASSERT_EQ(0, bind(socketFd, reinterpret_cast<sockaddr*>(&address), sizeof address));
  ASSERT_EQ(0, getsockname(socketFd, reinterpret_cast<sockaddr*>(&address), &length));
  const std::string closed = "http://127.0.0.1:" + std::to_string(ntohs(address.sin_port)) + "/";
  const Outcome refused =
      runTool({"--locate", closed, "--rounds", "2", "--interval", "0", "--json"}, kScenario);
  close(socketFd);
  EXPECT_EQ(0, refused.exitStatus);
  const std::vector<std::string> errors = linesOf(refused.err);
  ASSERT_EQ(2u, errors.size()) << refused.err;
  for (const std::string& error : errors) {
    EXPECT_EQ(0u, error.find("lodestack-scan: location: could not connect to the service ("))
        << error;
  }
  EXPECT_EQ(2u, linesOfKind(refused.out, "wlan").size());
  EXPECT_TRUE(linesOfKind(refused.out, "location").empty());
}

TEST_F(LocateToolTest, BadLocateOptionsAreUsageErrors) {
  for (const Args& args : {Args{"--locate", "ftp://127.0.0.1/"}, Args{"--locate", "http://"},
                           Args{"--locate", "http://127.0.0.1/", "--locate-timeout", "0"},
                           Args{"--locate", "http://127.0.0.1/", "--locate-timeout", "soon"}}) {
    const Outcome run = runTool(args);
    EXPECT_EQ(2, run.exitStatus) << args.back();
    EXPECT_EQ("", run.out);
    EXPECT_EQ(1u, linesOf(run.err).size()) << run.err;
  }
}

TEST_F(LocateToolTest, TooFewAccessPointsAndNoCellSendNothing) {
  Service service(tempFile("requests"), "60.172,24.945,400");
  ASSERT_TRUE(service.running());
  // The scenario's third WLAN result keeps one access point once the
  // opted-out one is gone.
  const Outcome run =
      runTool({"--locate", service.url(), "--kinds", "wlan", "--rounds", "3", "--interval", "0"},
              kScenario);
  EXPECT_EQ(0, run.exitStatus);
  EXPECT_EQ("lodestack-scan: location: no request sent: fewer than two access points and no cell\n",
            run.err);
  EXPECT_EQ(2u, service.requests().size());
}

TEST_F(LocateToolTest, ASignalEndsTheRunWhileTheServiceIsSlow) {
  Service service(tempFile("requests"), "60.172,24.945,400");
  ASSERT_TRUE(service.running());
  Tool tool({"--locate", service.url("/slow/v1/geolocate"), "--rounds", "0", "--interval", "0",
             "--kinds", "wlan", "--json"},
            kScenario);
  ASSERT_TRUE(tool.waitForLines(1));
  const Clock::time_point deadline = Clock::now() + std::chrono::seconds(10);
  while (service.requests().empty() && Clock::now() < deadline) usleep(10000);
  ASSERT_EQ(1u, service.requests().size());
  const Clock::time_point interrupted = Clock::now();
  tool.signal(SIGINT);
  const Outcome run = tool.finish();
  EXPECT_EQ(130, run.exitStatus) << run.err;
  EXPECT_EQ("", run.err);
  EXPECT_LT(Clock::now() - interrupted, std::chrono::seconds(3)) << "the exchange was abandoned";
}

}  // namespace
