#include "lodestack/debug/DebugLinux.h"

#include <sys/time.h>
#include <syslog.h>
#include <time.h>
#include <unistd.h>

#include <cstdio>
#include <cstring>
#include <ctime>
#include <new>

namespace lodestack {

DebugLinux::DebugLinux() = default;
DebugLinux::~DebugLinux() = default;

Status DebugLinux::install(const char* configFile, const char* logDir) {
  // Checked first so that a refused logger does not truncate the log files
  // of the installed one; install() below settles a race between two callers.
  if (DebugCommon::installed()) return Refused;
  DebugLinux* logger = new (std::nothrow) DebugLinux;
  if (!logger) return OutOfMemory;
  const bool configured = logger->readConfig(configFile, logDir, nullptr);
  if (DebugCommon::install(logger) != Ok) {
    delete logger;
    return Refused;
  }
  return configured ? Ok : FileError;
}

void DebugLinux::makePrefix(char* buffer, bool, const char*) {
  timeval now;
  gettimeofday(&now, nullptr);
  tm local;
  const time_t seconds = now.tv_sec;
  localtime_r(&seconds, &local);
  char stamp[32];
  std::strftime(stamp, sizeof stamp, "%Y-%m-%d %H:%M:%S", &local);
  std::snprintf(buffer, kPrefixSize, "%s.%03ld", stamp, static_cast<long>(now.tv_usec / 1000));
}

// localtime_r need not look at TZ itself.
void DebugLinux::platformInit() { tzset(); }

bool DebugLinux::checkLogFileName(const char* name) {
  return name[0] != '\0' && std::strchr(name, '/') == nullptr && std::strcmp(name, ".") != 0 &&
         std::strcmp(name, "..") != 0;
}

int DebugLinux::platformId() { return static_cast<int>(getpid()); }

void DebugLinux::platformLog(const char*, const char* component, int id, const char* format,
                             va_list args) {
  char message[1024];
  std::vsnprintf(message, sizeof message, format, args);
  syslog(LOG_USER | LOG_DEBUG, "%s/%d  %s", component, id, message);
}

}  // namespace lodestack
