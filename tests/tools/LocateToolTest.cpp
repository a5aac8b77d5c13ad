// lodestack-scan --locate end to end: the built program posts to a stand-in
// geolocation service on 127.0.0.1 (tests/tools/geolocation_server.py),
// which logs every request it gets. Nothing leaves the machine.
#include <gtest/gtest.h>

#include <arpa/inet.h>
#include <netinet/in.h>
#include <sys/socket.h>

#include <cmath>
#include <string>
#include <vector>

#include "ToolProcess.h"

namespace {

using namespace tooltest;

const std::string kTestDir = LODESTACK_TOOL_TEST_DIR;
const std::string kScenario = kTestDir + "/locate.json";

// The stand-in service, running while the object lives; its normal answer
// is 60.172 N 24.945 E within 400 m.
class Service {
 public:
  Service() {
    if (server_.waitForLines(1)) port_ = std::atoi(server_.out().c_str());  // the port it took
  }

  bool running() const { return port_ > 0; }
  std::string url(const std::string& path = "/v1/geolocate") const {
    return "http://127.0.0.1:" + std::to_string(port_) + path;
  }
  // The requests it got, in order: {"method", "path", "headers", "body"}.
  std::vector<Json> requests() const { return jsonLines(readText(dir_.file("log"))); }

 private:
  TemporaryDirectory dir_;
  Tool server_{{kTestDir + "/geolocation_server.py", dir_.file("log"), "--answer",
                "60.172,24.945,400"},
               "", Env(), "/usr/bin/python3"};
  int port_ = 0;
};

TEST(LocateTool, TheRequestCarriesTheRoundsMeasurementsLessTheOptedOut) {
  Service service;
  ASSERT_TRUE(service.running());
  const Outcome run = runTool({"--locate", service.url(), "--locate-key", "k y&z", "--rounds", "2",
                               "--interval", "0", "--json"},
                              kScenario, {{"LODESTACK_GEOLOCATION_KEY", "from-env"}});
  ASSERT_EQ(0, run.exitStatus) << run.err;
  EXPECT_EQ("", run.err);
  const std::vector<Json> requests = service.requests();
  ASSERT_EQ(2u, requests.size());

  const std::string version = runTool({"--version"}).out;  // "lodestack-scan 1.2.3\n"
  const std::string userAgent = "lodestack-scan/" + version.substr(15, version.size() - 16);
  for (const Json& request : requests) {
    EXPECT_EQ("POST", request["method"]);
    EXPECT_EQ("/v1/geolocate?key=k%20y%26z", request["path"]) << "the option before the variable";
    EXPECT_EQ(userAgent, request["headers"].value("User-Agent", "")) << request["headers"];
    EXPECT_EQ("application/json", request["headers"].value("Content-Type", ""));
  }

  // The scenario's rounds. Round 1: a GSM cell, its levels RXLEV sent in
  // dBm, with a neighbour whose id is known and one whose id is not (no
  // tower); of its access points, an opted-out name, locally administered
  // addresses and an 8-byte identifier are left out. Round 2: a WCDMA cell,
  // its RSCP already in dBm.
  EXPECT_EQ(Json::parse(R"({"cellTowers": [
      {"radioType": "gsm", "mobileCountryCode": 244, "mobileNetworkCode": 91,
       "locationAreaCode": 4660, "cellId": 23456, "signalStrength": -72, "timingAdvance": 2},
      {"radioType": "gsm", "mobileCountryCode": 244, "mobileNetworkCode": 91,
       "locationAreaCode": 4660, "cellId": 23457, "signalStrength": -80}],
      "wifiAccessPoints": [{"macAddress": "00:1a:2b:3c:4d:01", "signalStrength": -51},
                           {"macAddress": "00:1a:2b:3c:4d:03", "signalStrength": -60},
                           {"macAddress": "00:1a:2b:3c:4d:05"}]})"),
            Json::parse(requests[0]["body"].get<std::string>()));
  EXPECT_EQ(Json::parse(R"({"cellTowers": [
      {"radioType": "wcdma", "mobileCountryCode": 244, "mobileNetworkCode": 5,
       "locationAreaCode": 4097, "cellId": 16846773},
      {"radioType": "wcdma", "mobileCountryCode": 244, "mobileNetworkCode": 5,
       "cellId": 16846774, "signalStrength": -85}],
      "wifiAccessPoints": [{"macAddress": "00:1a:2b:3c:4d:06", "signalStrength": -48},
                           {"macAddress": "00:1a:2b:3c:4d:07", "signalStrength": -70}]})"),
            Json::parse(requests[1]["body"].get<std::string>()));

  // --geolocation-request prints the very bodies sent.
  const Outcome printed =
      runTool({"--geolocation-request", "--rounds", "2", "--interval", "0"}, kScenario);
  ASSERT_EQ(0, printed.exitStatus) << printed.err;
  EXPECT_EQ(std::vector<std::string>({requests[0]["body"], requests[1]["body"]}),
            linesOf(printed.out));
}

TEST(LocateTool, AnAnswerBecomesAPositionComparedWithTheFix) {
  Service service;
  ASSERT_TRUE(service.running());
  // The scenario's one fix is at 60.17 N 24.94 E: by the haversine formula
  // on the sphere of the library's geodesy, 354.9 m from the answer, inside
  // its 400 m.
  const double rad = M_PI / 180;
  const double a = std::pow(std::sin(0.002 * rad / 2), 2) +
                   std::cos(60.17 * rad) * std::cos(60.172 * rad) *
                       std::pow(std::sin(0.005 * rad / 2), 2);
  const double distance = 2 * 6371010.0 * std::asin(std::sqrt(a));
  const Outcome json =
      runTool({"--locate", service.url(), "--rounds", "1", "--interval", "0", "--json"}, kScenario);
  ASSERT_EQ(0, json.exitStatus) << json.err;
  EXPECT_EQ("", json.err);
  EXPECT_EQ(1u, jsonLines(json.out, "location").size()) << json.out;
  const Json position = jsonLines(json.out).back();
  EXPECT_EQ("location", position["kind"]) << "after the round";
  EXPECT_DOUBLE_EQ(60.172, position["latitude"].get<double>());
  EXPECT_DOUBLE_EQ(24.945, position["longitude"].get<double>());
  EXPECT_DOUBLE_EQ(400, position["accuracy"].get<double>());
  EXPECT_NEAR(400 * 0.48101, position["horizontalCepUncertainty"].get<double>(), 0.01);
  EXPECT_NEAR(distance, position["distance"].get<double>(), 0.05);
  EXPECT_EQ(true, position["inside"]);

  // Without GNSS there is no fix to compare with.
  const Outcome alone = runTool({"--locate", service.url(), "--rounds", "1", "--interval", "0",
                                 "--kinds", "cellular,wlan"},
                                kScenario);
  ASSERT_EQ(0, alone.exitStatus) << alone.err;
  EXPECT_EQ("location: latitude 60.1720000, longitude 24.9450000, accuracy 400.0 m",
            linesOf(alone.out).back());
}

TEST(LocateTool, FailuresSayWhyOnceAndTheNextRoundGoesOn) {
  Service service;
  ASSERT_TRUE(service.running());
  struct Case {
    std::string failure;  // the mode of the first answer; the second is normal
    std::string message;
  };
  const Case cases[] = {
      {"notfound", "no position for these measurements"},
      {"ratelimited", "the service answered HTTP 429: Too many requests, slow down"},
      {"slow", "no answer within 1 s"},
      {"malformed", "the answer is not a position: not JSON"},
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
    EXPECT_EQ(2u, jsonLines(run.out, "cellular").size()) << c.failure;
    EXPECT_EQ(2u, jsonLines(run.out, "wlan").size()) << c.failure;
    EXPECT_EQ(1u, jsonLines(run.out, "location").size()) << c.failure;
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
  EXPECT_EQ(2u, jsonLines(refused.out, "wlan").size());
  EXPECT_TRUE(jsonLines(refused.out, "location").empty());
}

// The key from the environment joins the address's own query; the
// scenario's third WLAN result keeps one access point once the opted-out one
// is gone, too few to send without a cell.
TEST(LocateTool, TheKeyFromTheEnvironmentAndTooFewAccessPoints) {
  Service service;
  ASSERT_TRUE(service.running());
  const Outcome run = runTool({"--locate", service.url("/v1/geolocate?lang=en"), "--kinds", "wlan",
                               "--rounds", "3", "--interval", "0"},
                              kScenario, {{"LODESTACK_GEOLOCATION_KEY", "from-env"}});
  EXPECT_EQ(0, run.exitStatus);
  EXPECT_EQ("lodestack-scan: location: no request sent: fewer than two access points and no cell\n",
            run.err);
  const std::vector<Json> requests = service.requests();
  ASSERT_EQ(2u, requests.size());
  EXPECT_EQ("/v1/geolocate?lang=en&key=from-env", requests[0]["path"]);
}

TEST(LocateTool, ASignalEndsTheRunWhileTheServiceIsSlow) {
  Service service;
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
