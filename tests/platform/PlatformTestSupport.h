// Helpers shared by the platform tests: an environment variable set for one
// scope, waiting on another process, and a child process that ends with
// the test.
#ifndef LODESTACK_TESTS_PLATFORM_PLATFORMTESTSUPPORT_H
#define LODESTACK_TESTS_PLATFORM_PLATFORMTESTSUPPORT_H

#include <fcntl.h>
#include <signal.h>
#include <stdlib.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <functional>
#include <optional>
#include <string>
#include <thread>
#include <vector>

namespace lodestack {
namespace testing {

// Sets an environment variable for one scope.
class EnvScope {
 public:
  EnvScope(const char* name, const std::string& value) : name_(name) {
    if (const char* old = getenv(name)) old_ = old;
    setenv(name, value.c_str(), 1);
  }
  ~EnvScope() {
    if (old_)
      setenv(name_.c_str(), old_->c_str(), 1);
    else
      unsetenv(name_.c_str());
  }
  EnvScope(const EnvScope&) = delete;
  EnvScope& operator=(const EnvScope&) = delete;

 private:
  std::string name_;
  std::optional<std::string> old_;
};

// Calls `done` every 20 ms, without turning any loop, until it returns true
// (then true) or `seconds` pass (then false).
inline bool waitFor(const std::function<bool()>& done, double seconds) {
  const auto until = std::chrono::steady_clock::now() + std::chrono::duration<double>(seconds);
  while (!done()) {
    if (std::chrono::steady_clock::now() >= until) return false;
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
  }
  return true;
}

// Runs argv (argv[0] a full path) with its output discarded. Ended
// by SIGTERM and reaped by stop() or with this object; the kernel sends the
// SIGTERM itself should the test die first.
class ChildProcess {
 public:
  bool start(const std::vector<std::string>& argv) {
    std::vector<char*> args;
    for (const std::string& a : argv) args.push_back(const_cast<char*>(a.c_str()));
    args.push_back(nullptr);
    const pid_t parent = getpid();
    pid_ = fork();
    if (pid_ == 0) {  // only async-signal-safe calls until exec
      prctl(PR_SET_PDEATHSIG, SIGTERM);
      if (getppid() != parent) _exit(127);
      const int discard = open("/dev/null", O_WRONLY);
      dup2(discard, 1);
      dup2(discard, 2);
      execv(args[0], args.data());
      _exit(127);
    }
    return pid_ > 0;
  }
  void stop() {
    if (pid_ <= 0) return;
    kill(pid_, SIGTERM);
    waitpid(pid_, nullptr, 0);
    pid_ = -1;
  }
  ~ChildProcess() { stop(); }

 private:
  pid_t pid_ = -1;
};

}  // namespace testing
}  // namespace lodestack

#endif  // LODESTACK_TESTS_PLATFORM_PLATFORMTESTSUPPORT_H
