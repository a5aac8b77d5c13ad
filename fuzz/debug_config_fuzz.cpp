// Fuzzes the debug configuration reader with arbitrary text: lines of any
// length, any tokens, NUL bytes. The logger under test refuses every log
// file name except "console" (standard output, sent to /dev/null here), so
// that "path" lines cannot make it create files anywhere; what it writes is
// then checked to reach the settings it reports.
#include <fcntl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>

#include <lodestack/lodestack.h>

using namespace lodestack;

namespace {

class ConsoleOnlyDebug : public DebugCommon {
 protected:
  void makePrefix(char* buffer, bool, const char*) override { buffer[0] = '\0'; }
  void platformInit() override {}
  bool checkLogFileName(const char*) override { return false; }
  int platformId() override { return 1; }
  void platformLog(const char*, const char*, int, const char* format, va_list args) override {
    char text[64];
    std::vsnprintf(text, sizeof text, format, args);
  }
};

// The configuration lives in a memory file opened by its /proc name.
int configFile() {
  static const int fd = [] {
    std::freopen("/dev/null", "w", stdout);
    return memfd_create("debug-config", 0);
  }();
  return fd;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  const int fd = configFile();
  if (fd < 0 || ftruncate(fd, 0) != 0 ||
      pwrite(fd, data, size, 0) != static_cast<ssize_t>(size))
    return 0;
  const std::string path = "/proc/self/fd/" + std::to_string(fd);
  ConsoleOnlyDebug* logger = new ConsoleOnlyDebug;
  logger->readConfig(path.c_str(), "/nonexistent-log-dir", nullptr);
  for (const char* component : {"default", "core", "crypto", "Measurements", "WPOXEL", ""}) {
    const DebugCommon::ComponentSetting setting = logger->getComponentLogSettings(component);
    if (setting.file != nullptr && setting.file != stdout) std::abort();  // every name was refused
    logger->writeLogEll(Debug::Level1, false, component, "line %d of %s\n", 1, component);
  }
  logger->addRef();
  logger->removeRef();  // deletes it
  return 0;
}
