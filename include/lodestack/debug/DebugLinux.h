// DebugLinux: the logger of this library's Linux platform, and the way an
// application turns the Debug facade on.
//
// Each line starts with the local time to the millisecond
// ("2024-05-01 12:34:56.789"), then the component and the process id. Log
// files must be plain names inside the log directory (no "/", not "." or
// ".."), so a configuration file cannot make the logger truncate a file
// elsewhere by its name alone; its "path" lines still choose the directory.
// The platform log is syslog (facility user, priority debug, the program's
// own identity): each message that passes a component's mask is copied
// there as "component/pid  message", unless the configuration says
// "no_platform_logging".
//
// Typical use, for a program's "--log-config FILE" option:
//   if (DebugLinux::install(file, nullptr) != Ok) ... report; it logs anyway
//   ... run ...
//   Debug::release();
#ifndef LODESTACK_DEBUG_DEBUGLINUX_H
#define LODESTACK_DEBUG_DEBUGLINUX_H

#include "lodestack/core/Status.h"
#include "lodestack/debug/DebugCommon.h"

namespace lodestack {

class LODESTACK_EXPORT DebugLinux : public DebugCommon {
 public:
  DebugLinux();
  ~DebugLinux() override;

  // Creates a DebugLinux, reads `configFile` with log files in `logDir`
  // ("./" when null) and installs it as the process-wide logger, so that
  // Debug::log and the rest of the facade write through it from then on;
  // Debug::release() uninstalls and destroys it. Any thread may call.
  // Returns Ok: installed, configuration read. FileError: installed all the
  // same, but the configuration file could not be read or a log file could
  // not be opened (without a file, every component logs at mask 15 into
  // "lodestack.log" in `logDir`; the failure is the log's first message).
  // Refused: a logger is installed already; nothing changed. OutOfMemory.
  static Status install(const char* configFile, const char* logDir);

 protected:
  void makePrefix(char* buffer, bool raw, const char* component) override;
  void platformInit() override;
  bool checkLogFileName(const char* name) override;
  int platformId() override;
  void platformLog(const char* prefix, const char* component, int id, const char* format,
                   va_list args) override LODESTACK_PRINTF(5, 0);
};

}  // namespace lodestack

#endif  // LODESTACK_DEBUG_DEBUGLINUX_H
