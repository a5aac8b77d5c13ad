// lodestack-scan end to end: the built program run as a child process on
// the host platform's scenarios, and on services mocked on a private bus.
#include <gtest/gtest.h>

#include <signal.h>
#include <sys/stat.h>

#include <algorithm>
#include <string>
#include <vector>

#include "ToolProcess.h"
#include "platform/MockServices.h"

namespace {

using namespace tooltest;

TEST(ScanTool, JsonLinesCarryKindRequestStatusAndTree) {
  const Outcome run = runTool({"--json", "--rounds", "2", "--interval", "0"});
  ASSERT_EQ(0, run.exitStatus) << run.err;
  EXPECT_EQ("", run.err);
  std::vector<unsigned int> requestIds;
  for (const Json& result : jsonLines(run.out)) {
    ASSERT_TRUE(result.at("requestId").is_number_unsigned()) << result;
    EXPECT_EQ("Ok", result.at("status")) << result;
    const Json& m = result.at("measurements");
    if (result.at("kind") == "gnss") {
      EXPECT_EQ(0, result["requestId"]);
      for (const char* key : {"latitude", "longitude", "speed", "timeStamp"})
        EXPECT_TRUE(m.at("gnss").at(0).contains(key)) << key << " in " << result;
      continue;
    }
    requestIds.push_back(result["requestId"]);
    if (result["kind"] == "cellular") {
      EXPECT_FALSE(m.at("geran").empty() || m.at("utraFdd").empty()) << result;
    } else {
      EXPECT_EQ("wlan", result["kind"]);
      EXPECT_GE(m.at("wlan").size(), 25u) << "the default street's access points";
    }
  }
  // Two rounds, each one cellular and one WLAN request.
  EXPECT_EQ(std::vector<unsigned int>({1, 2, 3, 4}), requestIds);

  // A round without requests lasts until the next fix.
  const Outcome fixes = runTool({"--json", "--kinds", "gnss", "--rounds", "2", "--interval", "0"});
  ASSERT_EQ(0, fixes.exitStatus) << fixes.err;
  EXPECT_EQ(2u, jsonLines(fixes.out, "gnss").size()) << fixes.out;
  EXPECT_EQ(2u, linesOf(fixes.out).size()) << fixes.out;
}

// decode prints a results file as the run printed its results (as JSON
// lines, the interrupted and encrypted runs check that), and what was good
// of a damaged one before the one-line error.
TEST(ScanTool, DecodeGivesTheRunsOutputUpToTheDamage) {
  TemporaryDirectory dir;
  const std::string out = dir.file("results");
  const Outcome live = runTool({"--rounds", "2", "--interval", "0", "--out", out});
  ASSERT_EQ(0, live.exitStatus) << live.err;
  const Outcome again = runTool({"decode", out});
  EXPECT_EQ(0, again.exitStatus) << again.err;
  EXPECT_EQ(live.out, again.out);

  const std::vector<std::string> whole = linesOf(runTool({"decode", out, "--json"}).out);
  const std::string bytes = readText(out);
  writeText(out, bytes.substr(0, bytes.size() - 3));
  const Outcome run = runTool({"decode", out, "--json"});
  EXPECT_EQ(1, run.exitStatus);
  EXPECT_EQ(std::vector<std::string>(whole.begin(), whole.end() - 1), linesOf(run.out))
      << "all but the record cut short";
  EXPECT_EQ(0u, run.err.find("lodestack-scan: " + out + ": truncated record at byte offset "))
      << run.err;
  EXPECT_EQ(1u, linesOf(run.err).size()) << run.err;
}

TEST(ScanTool, EncryptedResultsAndTheDebugLog) {
  // Keys and logs in places of the test's own.
  TemporaryDirectory dir;
  const Env keys = {{"LODESTACK_SECURE_STORAGE_DIR", dir.file("keys")}};
  const std::string logs = dir.file("logs");
  ASSERT_EQ(0, mkdir(logs.c_str(), 0700));
  const std::string config = dir.file("log.conf");
  writeText(config, "; the radio adaptation only\npath " + logs + "/\nRadioAdapt 1 radio.log\n"
                    "Measurements 0 measurements.log\ndefault 0 other.log\n");
  const std::string out = dir.file("encrypted");

  const Outcome live = runTool({"--rounds", "1", "--interval", "0", "--kinds", "cellular,wlan",
                                "--json", "--out", out, "--encrypt", "scan-store",
                                "--log-config", config},
                               "", keys);
  ASSERT_EQ(0, live.exitStatus) << live.err;
  const Outcome decoded = runTool({"decode", out, "--decrypt", "scan-store", "--json"}, "", keys);
  EXPECT_EQ(0, decoded.exitStatus) << decoded.err;
  EXPECT_EQ(live.out, decoded.out);

  EXPECT_EQ(1, runTool({"decode", out}, "", keys).exitStatus) << "stored in the clear";

  // The configuration let the radio adaptation's lines through, not the
  // provider's.
  const std::string radioLog = readText(logs + "/radio.log");
  EXPECT_NE(std::string::npos, radioLog.find("RadioAdapt/")) << radioLog;
  EXPECT_NE(std::string::npos, radioLog.find("request 1 of kind 1 started")) << radioLog;
  EXPECT_EQ(std::string::npos, radioLog.find("Measurements")) << radioLog;
  EXPECT_EQ("", readText(logs + "/measurements.log"));
}

TEST(ScanTool, BadCommandLinesAndFilesGiveOneLineAndFail) {
  TemporaryDirectory dir;
  const std::string badScenario = dir.file("bad_scenario.json");
  writeText(badScenario, "{\"cellular\": [\n");
  const std::string notResults = dir.file("not_results");
  writeText(notResults, "some other file\n");
  struct Case {
    Args args;
    std::string scenario;
    int exitStatus;
  };
  const Case cases[] = {
      {{"--bogus"}, "", 2},
      {{"--rounds", "-1"}, "", 2},
      {{"--interval", "soon"}, "", 2},
      {{"--kinds", "foo"}, "", 2},
      {{"--gnss", "gpsd:localhost:0"}, "", 2},
      {{"--wlan", "iwd"}, "", 2},
      {{"--cells", "ofono"}, "", 2},
      {{"--json", "--geolocation-request"}, "", 2},
      {{"--rounds", "1", "--encrypt", "scan-store"}, "", 2},  // without --out
      {{"--locate", "ftp://127.0.0.1/"}, "", 2},
      {{"--locate", "http://"}, "", 2},
      {{"--locate", "http://127.0.0.1/", "--locate-timeout", "0"}, "", 2},
      {{"--locate", "http://127.0.0.1/", "--locate-timeout", "soon"}, "", 2},
      {{"decode"}, "", 2},
      {{"--scenario", "/nonexistent/street.json"}, "", 1},
      {{"--scenario", badScenario}, "", 1},
      {{"--rounds", "1"}, badScenario, 1},
      {{"--rounds", "1", "--out", notResults}, "", 1},
      {{"--rounds", "1", "--log-config", "/nonexistent/log.conf"}, "", 1},
      {{"decode", notResults}, "", 1},
      {{"decode", "/nonexistent/results"}, "", 1},
  };
  for (const Case& c : cases) {
    const Outcome run = runTool(c.args, c.scenario);
    std::string what = c.scenario;
    for (const std::string& arg : c.args) what += " " + arg;
    EXPECT_EQ(c.exitStatus, run.exitStatus) << what;
    EXPECT_EQ("", run.out) << what;
    EXPECT_EQ(0u, run.err.find("lodestack-scan: ")) << what << ": " << run.err;
    EXPECT_EQ(1, std::count(run.err.begin(), run.err.end(), '\n')) << what << ": " << run.err;
  }
  EXPECT_EQ("some other file\n", readText(notResults));

  const Outcome version = runTool({"--version"});
  EXPECT_EQ(0, version.exitStatus);
  EXPECT_EQ(0u, version.out.find("lodestack-scan ")) << version.out;
}

TEST(ScanTool, BusServicesReachTheOutput) {
  using namespace lodestack::testing;
  PrivateBus bus;  // DBUS_SYSTEM_BUS_ADDRESS reaches the tool
  ASSERT_EQ("", bus.error());
  auto nm = startNetworkManager(bus);
  auto mm = startModemManager(bus);
  ASSERT_EQ("", nm->error() + mm->error());
  ASSERT_EQ("", setUpNetworkManager(*nm, {{"ap1", "00:1A:2B:3C:4D:5E", 77},
                                          {"ap2", "0a:0b:0c:0d:0e:0f", 40}}));
  ASSERT_EQ("", addModem(*mm,
                         "ret = [{\"cell-type\": dbus.UInt32(2), \"serving\": True, "
                         "\"operator-id\": \"24491\", \"lac\": \"1234\", \"ci\": \"5BA0\", "
                         "\"rx-level\": dbus.UInt32(40)}, "
                         "{\"cell-type\": dbus.UInt32(5), \"serving\": True, "
                         "\"operator-id\": \"24491\", \"ci\": \"121E303\"}, "
                         "{\"cell-type\": dbus.UInt32(6), \"serving\": False}]"));

  const Outcome run = runTool({"--wlan", "networkmanager", "--cells", "modemmanager", "--rounds",
                               "2", "--json", "--interval", "0"});
  ASSERT_EQ(0, run.exitStatus) << run.err;
  const std::vector<Json> cellular = jsonLines(run.out, "cellular");
  const std::vector<Json> wlan = jsonLines(run.out, "wlan");
  EXPECT_EQ(2u, cellular.size());
  EXPECT_EQ(2u, wlan.size());
  for (const Json& result : cellular) {
    ASSERT_EQ("Ok", result["status"]) << result;
    const Json& m = result["measurements"];
    EXPECT_EQ(23456, m.at("geran").at(0).at("cid")) << result;
    EXPECT_EQ(18998019, m.at("eutra")[0].at("ucid")) << result;
  }
  for (const Json& result : wlan) {
    ASSERT_EQ("Ok", result["status"]) << result;
    const Json& aps = result["measurements"].at("wlan");
    ASSERT_EQ(2u, aps.size()) << result;
    EXPECT_EQ("00:1a:2b:3c:4d:5e", aps[0].at("bssid"));
    EXPECT_EQ(77, aps[0].at("rssi"));
    EXPECT_FALSE(aps[0].contains("rxLevel")) << "NetworkManager gives no dBm";
    EXPECT_EQ("0a:0b:0c:0d:0e:0f", aps[1].at("bssid"));
  }
  EXPECT_EQ("lodestack-scan: cellular request 1: skipped 1 NR and 0 CDMA cell(s): lodestack has "
            "no records for them\n",
            run.err)
      << "told once";
}

// On a bus without WLAN services the first request (made before the
// library heard from the bus) ends in the WLAN time-out, the next is refused
// at once; the reason is said once, plainly.
TEST(ScanTool, AutoWithoutWlanSourceSaysSo) {
  lodestack::testing::PrivateBus bus;
  ASSERT_EQ("", bus.error());
  const Outcome run = runTool({"--wlan", "auto", "--kinds", "wlan", "--rounds", "2", "--interval", "0"});
  EXPECT_EQ(0, run.exitStatus);
  const std::vector<std::string> lines = linesOf(run.out);
  ASSERT_EQ(2u, lines.size()) << run.out;
  EXPECT_TRUE(lines[0] == "wlan request 1: Timeout" || lines[0] == "wlan request 0: Failed")
      << lines[0];
  EXPECT_EQ("wlan request 0: Failed", lines[1]) << "known absent: refused at once";
  EXPECT_EQ("lodestack-scan: no WLAN source: neither wpa_supplicant (fi.w1.wpa_supplicant1) nor "
            "NetworkManager (org.freedesktop.NetworkManager) is on the system bus\n",
            run.err);
}

TEST(ScanTool, SignalsEndTheRunCleanly) {
  TemporaryDirectory dir;
  const std::string out = dir.file("interrupted");
  Tool tool({"--rounds", "0", "--interval", "0", "--json", "--out", out});
  ASSERT_TRUE(tool.waitForLines(3));
  tool.signal(SIGINT);
  const Outcome interrupted = tool.finish();
  EXPECT_EQ(130, interrupted.exitStatus) << interrupted.err;
  EXPECT_EQ("", interrupted.err);
  // Every result printed was recorded whole.
  const Outcome decoded = runTool({"decode", out, "--json"});
  EXPECT_EQ(0, decoded.exitStatus) << decoded.err;
  EXPECT_EQ(interrupted.out, decoded.out);

  Tool terminated({"--rounds", "0", "--interval", "0"});
  ASSERT_TRUE(terminated.waitForLines(1));
  terminated.signal(SIGTERM);
  EXPECT_EQ(143, terminated.finish().exitStatus);
}

}  // namespace
