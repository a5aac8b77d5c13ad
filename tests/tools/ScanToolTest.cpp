// lodestack-scan end to end: the built program run as a child process on
// the host platform's scenarios, and on services mocked on a private bus.
#include <gtest/gtest.h>

#include <signal.h>
#include <sys/stat.h>

#include <algorithm>
#include <cctype>
#include <string>
#include <utility>
#include <vector>

#include "ToolProcess.h"
#include "platform/MockServices.h"

namespace {

using namespace tooltest;

// Where each record of a results file starts.
std::vector<std::size_t> recordOffsets(const std::string& bytes) {
  std::vector<std::size_t> offsets;
  for (std::size_t at = 12; at + 4 <= bytes.size();) {
    offsets.push_back(at);
    const auto* p = reinterpret_cast<const unsigned char*>(bytes.data() + at);
    at += 4 + (p[0] | p[1] << 8 | p[2] << 16 | static_cast<std::size_t>(p[3]) << 24);
  }
  return offsets;
}

using ScanToolTest = ToolTest;

// Whether `text` follows `shape`, where 'd' stands for a decimal digit and
// 'x' for a lower-case hex digit.
bool hasShape(const std::string& text, const std::string& shape) {
  if (text.size() != shape.size()) return false;
  for (std::size_t i = 0; i < text.size(); ++i) {
    const bool ok = shape[i] == 'd'   ? std::isdigit(static_cast<unsigned char>(text[i])) != 0
                    : shape[i] == 'x' ? std::string("0123456789abcdef").find(text[i]) !=
                                            std::string::npos
                                      : text[i] == shape[i];
    if (!ok) return false;
  }
  return true;
}
bool isIsoTime(const Json& v) {
  return v.is_string() && hasShape(v.get<std::string>(), "dddd-dd-ddTdd:dd:ddZ");
}
bool isBssid(const Json& v) {
  return v.is_string() && (hasShape(v.get<std::string>(), "xx:xx:xx:xx:xx:xx") ||
                           hasShape(v.get<std::string>(), "xx:xx:xx:xx:xx:xx:xx:xx"));
}

TEST_F(ScanToolTest, JsonLinesCarryKindRequestStatusAndTree) {
  const Outcome run = runTool({"--json", "--rounds", "2", "--interval", "0"});
  ASSERT_EQ(0, run.exitStatus) << run.err;
  EXPECT_EQ("", run.err);
  std::vector<unsigned int> requestIds;
  for (const std::string& line : linesOf(run.out)) {
    const Json result = Json::parse(line);  // throws on a line that is not JSON
    const std::string kind = result.at("kind");
    ASSERT_TRUE(result.at("requestId").is_number_unsigned()) << line;
    ASSERT_TRUE(result.at("status").is_string()) << line;
    const Json& m = result.at("measurements");
    if (kind == "gnss") continue;
    requestIds.push_back(result["requestId"]);
    EXPECT_EQ("Ok", result["status"]) << line;
    if (kind == "cellular") {
      ASSERT_FALSE(m.at("geran").empty()) << line;
      for (const char* key : {"mcc", "mnc", "lac", "cid"}) EXPECT_TRUE(m["geran"][0].contains(key));
      EXPECT_TRUE(isIsoTime(m["geran"][0].at("timeStamp"))) << line;
      EXPECT_TRUE(m.at("utraFdd")[0].contains("ucid")) << line;
    } else {
      ASSERT_EQ("wlan", kind);
      ASSERT_FALSE(m.at("wlan").empty()) << line;
      for (const Json& ap : m["wlan"]) {
        EXPECT_TRUE(isBssid(ap.at("bssid"))) << ap;
        EXPECT_TRUE(ap.at("rxLevel").is_number_integer()) << ap;
      }
    }
  }
  // Two rounds, each one cellular and one WLAN request.
  EXPECT_EQ(std::vector<unsigned int>({1, 2, 3, 4}), requestIds);

  // A round without requests lasts until the next fix.
  const Outcome fixes = runTool({"--json", "--kinds", "gnss", "--rounds", "2", "--interval", "0"});
  ASSERT_EQ(0, fixes.exitStatus) << fixes.err;
  const std::vector<std::string> lines = linesOf(fixes.out);
  ASSERT_EQ(2u, lines.size()) << fixes.out;
  for (const std::string& line : lines) {
    const Json fix = Json::parse(line);
    EXPECT_EQ("gnss", fix["kind"]);
    EXPECT_EQ(0, fix["requestId"]);
    const Json& position = fix["measurements"].at("gnss").at(0);
    EXPECT_LE(std::abs(position.at("latitude").get<double>()), 90.0) << line;
    EXPECT_LE(std::abs(position.at("longitude").get<double>()), 180.0) << line;
    EXPECT_GE(position.at("speed").get<double>(), 0.0) << line;
    EXPECT_TRUE(isIsoTime(position.at("timeStamp"))) << line;
  }
}

TEST_F(ScanToolTest, DecodeOfTheResultsFileGivesTheSameOutput) {
  for (const bool json : {true, false}) {
    const std::string out = tempFile(json ? "json" : "text");
    Args scan = {"--rounds", "2", "--interval", "0", "--out", out};
    Args decode = {"decode", out};
    if (json) {
      scan.push_back("--json");
      decode.push_back("--json");
    }
    const Outcome live = runTool(scan);
    ASSERT_EQ(0, live.exitStatus) << live.err;
    const Outcome again = runTool(decode);
    EXPECT_EQ(0, again.exitStatus) << again.err;
    EXPECT_EQ(live.out, again.out) << (json ? "json" : "text");
  }
}

TEST_F(ScanToolTest, EncryptedResultsAndTheDebugLog) {
  // Keys and logs in places of the test's own.
  const std::string keys = tempFile("keys");
  setenv("LODESTACK_SECURE_STORAGE_DIR", keys.c_str(), 1);
  const std::string logs = tempFile("logs");
  ASSERT_EQ(0, mkdir(logs.c_str(), 0700));
  const std::string config = tempFile("log.conf");
  writeFile(config, "; the radio adaptation only\npath " + logs + "/\nRadioAdapt 1 radio.log\n"
                    "Measurements 0 measurements.log\ndefault 0 other.log\n");
  const std::string out = tempFile("encrypted");

  const Outcome live = runTool({"--rounds", "1", "--interval", "0", "--kinds", "cellular,wlan",
                                "--json", "--out", out, "--encrypt", "scan-store",
                                "--log-config", config});
  ASSERT_EQ(0, live.exitStatus) << live.err;
  EXPECT_EQ(std::string::npos, readFile(out).find("LODESCAN")) << "stored in the clear";
  const Outcome decoded = runTool({"decode", out, "--decrypt", "scan-store", "--json"});
  EXPECT_EQ(0, decoded.exitStatus) << decoded.err;
  EXPECT_EQ(live.out, decoded.out);

  // Without the store's key nothing of the file is printed.
  for (const Args& wrong : {Args{"decode", out}, Args{"decode", out, "--decrypt", "no-such-store"}}) {
    const Outcome refused = runTool(wrong);
    EXPECT_EQ(1, refused.exitStatus);
    EXPECT_EQ("", refused.out);
    EXPECT_EQ(1u, linesOf(refused.err).size()) << refused.err;
  }

  // The configuration let the radio adaptation's lines through, not the
  // provider's.
  const std::string radioLog = readFile(logs + "/radio.log");
  EXPECT_NE(std::string::npos, radioLog.find("RadioAdapt/")) << radioLog;
  EXPECT_NE(std::string::npos, radioLog.find("request 1 of kind 1 started")) << radioLog;
  EXPECT_EQ(std::string::npos, radioLog.find("Measurements")) << radioLog;
  EXPECT_EQ("", readFile(logs + "/measurements.log"));

  const Outcome missing = runTool({"--rounds", "1", "--log-config", logs + "/none.conf"});
  EXPECT_EQ(1, missing.exitStatus);
  EXPECT_EQ(1u, linesOf(missing.err).size()) << missing.err;
  const Outcome needsOut = runTool({"--rounds", "1", "--encrypt", "scan-store"});
  EXPECT_EQ(2, needsOut.exitStatus) << "--encrypt without --out";
  unsetenv("LODESTACK_SECURE_STORAGE_DIR");
  std::system(("rm -rf " + keys + " " + logs).c_str());
}

TEST_F(ScanToolTest, DamagedResultsFilesStopAtTheBadRecord) {
  const std::string out = tempFile("whole");
  ASSERT_EQ(0, runTool({"--rounds", "2", "--interval", "0", "--kinds", "cellular,wlan", "--out",
                        out})
                   .exitStatus);
  const std::string whole = readFile(out);
  const std::vector<std::size_t> at = recordOffsets(whole);
  ASSERT_EQ(4u, at.size());
  const std::vector<std::string> all = linesOf(runTool({"decode", out, "--json"}).out);
  ASSERT_EQ(4u, all.size());

  const auto check = [&](const std::string& bytes, std::size_t goodRecords,
                         const std::string& error) {
    const std::string damaged = tempFile("damaged");
    writeFile(damaged, bytes);
    const Outcome run = runTool({"decode", damaged, "--json"});
    EXPECT_EQ(1, run.exitStatus);
    EXPECT_EQ(std::vector<std::string>(all.begin(), all.begin() + goodRecords), linesOf(run.out));
    EXPECT_EQ("lodestack-scan: " + damaged + ": " + error + "\n", run.err);
  };
  check(whole.substr(0, whole.size() - 3), 3,
        "truncated record at byte offset " + std::to_string(at[3]));
  std::string corrupt = whole;
  corrupt[at[1] + 4] = 9;  // the record's kind
  check(corrupt, 1, "corrupt record at byte offset " + std::to_string(at[1]));
}

TEST_F(ScanToolTest, BadCommandLinesAndFilesGiveOneLineAndFail) {
  const std::string badScenario = tempFile("bad_scenario.json");
  writeFile(badScenario, "{\"cellular\": [\n");
  const std::string notResults = tempFile("not_results");
  writeFile(notResults, "some other file\n");
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
      {{"decode"}, "", 2},
      {{"--scenario", "/nonexistent/street.json"}, "", 1},
      {{"--scenario", badScenario}, "", 1},
      {{"--rounds", "1"}, badScenario, 1},
      {{"--rounds", "1", "--out", notResults}, "", 1},
      {{"decode", notResults}, "", 1},
      {{"decode", "/nonexistent/results"}, "", 1},
  };
  for (const Case& c : cases) {
    const Outcome run = runTool(c.args, c.scenario);
    const std::string what = c.args[0] + " " + (c.args.size() > 1 ? c.args[1] : "");
    EXPECT_EQ(c.exitStatus, run.exitStatus) << what;
    EXPECT_EQ("", run.out) << what;
    EXPECT_EQ(0u, run.err.find("lodestack-scan: ")) << what << ": " << run.err;
    EXPECT_EQ(1, std::count(run.err.begin(), run.err.end(), '\n')) << what << ": " << run.err;
  }
  EXPECT_EQ("some other file\n", readFile(notResults));

  const Outcome version = runTool({"--version"});
  EXPECT_EQ(0, version.exitStatus);
  EXPECT_EQ(0u, version.out.find("lodestack-scan ")) << version.out;
}

TEST_F(ScanToolTest, BusServicesReachTheOutput) {
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
  int cellular = 0, wlan = 0;
  for (const std::string& line : linesOf(run.out)) {
    const Json result = Json::parse(line);
    const Json& m = result.at("measurements");
    if (result["kind"] == "cellular") {
      ++cellular;
      ASSERT_EQ("Ok", result["status"]) << line;
      const Json& gsm = m.at("geran").at(0);
      EXPECT_EQ(244, gsm.at("mcc")) << line;
      EXPECT_EQ(91, gsm.at("mnc")) << line;
      EXPECT_EQ(4660, gsm.at("lac")) << line;
      EXPECT_EQ(23456, gsm.at("cid")) << line;
      EXPECT_EQ(18998019, m.at("eutra")[0].at("ucid")) << line;
    } else if (result["kind"] == "wlan") {
      ++wlan;
      ASSERT_EQ("Ok", result["status"]) << line;
      ASSERT_EQ(2u, m.at("wlan").size()) << line;
      EXPECT_EQ("00:1a:2b:3c:4d:5e", m["wlan"][0].at("bssid"));
      EXPECT_EQ(77, m["wlan"][0].at("rssi"));
      EXPECT_FALSE(m["wlan"][0].contains("rxLevel")) << "NetworkManager gives no dBm";
      EXPECT_EQ("0a:0b:0c:0d:0e:0f", m["wlan"][1].at("bssid"));
    }
  }
  EXPECT_EQ(2, cellular);
  EXPECT_EQ(2, wlan);
  EXPECT_EQ("lodestack-scan: cellular request 1: skipped 1 NR and 0 CDMA cell(s): lodestack has "
            "no records for them\n",
            run.err)
      << "told once";
}

// On a bus without WLAN services the first request (made before the
// library heard from the bus) ends in the WLAN time-out, the next is refused
// at once; the reason is said once, plainly.
TEST_F(ScanToolTest, AutoWithoutWlanSourceSaysSo) {
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

TEST_F(ScanToolTest, SignalsEndTheRunCleanly) {
  const std::string out = tempFile("interrupted");
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
