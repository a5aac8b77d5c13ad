// Runs the built lodestack-scan as a child process for the tool's tests and
// collects what it prints.
#ifndef LODESTACK_TESTS_TOOLS_TOOLPROCESS_H
#define LODESTACK_TESTS_TOOLS_TOOLPROCESS_H

#include <gtest/gtest.h>

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include <nlohmann/json.hpp>

#include "support/TemporaryDirectory.h"

namespace tooltest {

using Json = nlohmann::json;
using Clock = std::chrono::steady_clock;
using Args = std::vector<std::string>;
using lodestack::testing::readText;
using lodestack::testing::TemporaryDirectory;
using lodestack::testing::writeText;

struct Outcome {
  int exitStatus = -1;  // -1 when the child did not exit normally
  std::string out;
  std::string err;
};

// Variables set in the child's environment, name and value.
using Env = std::vector<std::pair<std::string, std::string>>;

// The tool (or another `program`) running as a child, its standard output
// collected through a pipe and its standard error through a file. Of the
// host platform's variables only LODESTACK_SCENARIO reaches it; no proxy or
// geolocation key reaches it but through `env`.
class Tool {
 public:
  explicit Tool(const Args& args, const std::string& scenario = std::string(),
                const Env& env = Env(), const std::string& program = LODESTACK_SCAN_TOOL) {
    int out[2];
    const int err = open(dir_.file("stderr").c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600);
    if (err < 0 || pipe2(out, O_CLOEXEC) != 0) return;
    pid_ = fork();
    if (pid_ == 0) {
      dup2(out[1], 1);
      dup2(err, 2);
      unsetenv("LODESTACK_GNSS");
      if (scenario.empty())
        unsetenv("LODESTACK_SCENARIO");
      else
        setenv("LODESTACK_SCENARIO", scenario.c_str(), 1);
      for (const char* name : {"LODESTACK_GEOLOCATION_KEY", "http_proxy", "HTTP_PROXY",
                               "https_proxy", "HTTPS_PROXY", "all_proxy", "ALL_PROXY"}) {
        unsetenv(name);
      }
      for (const auto& [name, value] : env) setenv(name.c_str(), value.c_str(), 1);
      std::vector<char*> argv{const_cast<char*>(program.c_str())};
      for (const std::string& a : args) argv.push_back(const_cast<char*>(a.c_str()));
      argv.push_back(nullptr);
      execv(argv[0], argv.data());
      _exit(127);
    }
    close(err);
    close(out[1]);
    out_ = out[0];
  }
  ~Tool() {
    if (pid_ > 0 && !reaped_) {
      kill(pid_, SIGKILL);
      waitpid(pid_, nullptr, 0);
    }
    if (out_ >= 0) close(out_);
  }

  // Collects output until stdout holds `lines` lines or the child closed it.
  bool waitForLines(std::size_t lines) {
    while (std::count(outcome_.out.begin(), outcome_.out.end(), '\n') < static_cast<long>(lines)) {
      if (!pump()) return false;
    }
    return true;
  }
  void signal(int number) { kill(pid_, number); }
  const std::string& out() const { return outcome_.out; }

  // Everything the child writes, and how it ended.
  Outcome finish() {
    while (pump()) {
    }
    int status = 0;
    if (waitpid(pid_, &status, 0) == pid_ && WIFEXITED(status)) {
      outcome_.exitStatus = WEXITSTATUS(status);
    }
    reaped_ = true;
    outcome_.err = readText(dir_.file("stderr"));
    return outcome_;
  }

 private:
  // One read of stdout; false once the child closed it or has run far too
  // long.
  bool pump() {
    if (Clock::now() > deadline_) {
      ADD_FAILURE() << "lodestack-scan ran too long";
      return false;
    }
    if (out_ < 0) return false;
    pollfd ready = {out_, POLLIN, 0};
    if (poll(&ready, 1, 1000) <= 0) return true;
    char buffer[4096];
    const ssize_t n = read(out_, buffer, sizeof buffer);
    if (n > 0) {
      outcome_.out.append(buffer, static_cast<std::size_t>(n));
      return true;
    }
    close(out_);
    out_ = -1;
    return false;
  }

  TemporaryDirectory dir_;
  pid_t pid_ = -1;
  int out_ = -1;
  bool reaped_ = false;
  Outcome outcome_;
  const Clock::time_point deadline_ = Clock::now() + std::chrono::seconds(120);
};

inline Outcome runTool(const Args& args, const std::string& scenario = std::string(),
                       const Env& env = Env()) {
  return Tool(args, scenario, env).finish();
}

inline std::vector<std::string> linesOf(const std::string& text) {
  std::vector<std::string> lines;
  std::istringstream in(text);
  for (std::string line; std::getline(in, line);) lines.push_back(line);
  return lines;
}

// The --json lines of `out`, those of `kind` only when one is named; a line
// that is not JSON throws.
inline std::vector<Json> jsonLines(const std::string& out, const std::string& kind = "") {
  std::vector<Json> found;
  for (const std::string& line : linesOf(out)) {
    Json object = Json::parse(line);
    if (kind.empty() || object.value("kind", "") == kind) found.push_back(std::move(object));
  }
  return found;
}

}  // namespace tooltest

#endif  // LODESTACK_TESTS_TOOLS_TOOLPROCESS_H
