// DebugCommon: a per-component, mask-filtered file logger configured by a
// small text file; the logger behind the Debug facade.
//
// Abstract: a platform subclass supplies the line prefix, the process
// integer, the log file name check and the platform log (DebugLinux is the
// one of this library). Objects are made with new and reference counted
// through addRef/removeRef: at zero the object deletes itself, and if it was
// the process-wide logger it is uninstalled first. The log files it opens
// are its own and are closed with it; "console" is standard output.
//
// Configuration file: plain text, read in pieces of at most 127 characters
// (a longer line becomes several lines), each split into tokens at blanks,
// tabs, carriage returns and newlines. Empty lines and lines whose first
// token starts with ";" are ignored. Lines:
//   path DIR                 log directory for the files of the lines after
//   no_platform_logging      messages are not copied to the platform log
//   default MASK FILE        the setting of every component not named
//   COMPONENT MASK FILE      the setting of one component (a later line
//                            for it replaces an earlier one)
// MASK is decimal: a message of level L is written when L AND MASK is not 0;
// MASK 0 silences the component and opens no file. FILE is a name in the
// log directory, or "console"; components naming the same file share it.
// Without a "default" line, the default is mask 15 into the default file.
//
// Threads: every operation takes the process-wide DebugMutex (lock/unlock),
// so any thread may log, and each line is written and flushed whole. The
// mutex is not recursive: the hooks of a subclass must not log.
#ifndef LODESTACK_DEBUG_DEBUGCOMMON_H
#define LODESTACK_DEBUG_DEBUGCOMMON_H

#include <cstdarg>
#include <cstdio>
#include <map>
#include <string>

#include "lodestack/core/Export.h"
#include "lodestack/core/Status.h"
#include "lodestack/debug/Debug.h"

namespace lodestack {

class LODESTACK_EXPORT DebugCommon {
 public:
  struct ComponentSetting {
    unsigned int mask;  // Debug::LogLevel bits
    FILE* file;         // null: no file (the platform log may still see it)
  };

  // Room makePrefix may fill, terminator included.
  static const unsigned int kPrefixSize = 64;

  virtual ~DebugCommon();
  DebugCommon(const DebugCommon&) = delete;
  DebugCommon& operator=(const DebugCommon&) = delete;

  // Reads `configFile` (format above). Log files go to `logDir` ("./" when
  // null) unless a "path" line says otherwise; the default file is
  // `defaultFileName` ("lodestack.log" when null). Settings read before a
  // failure stay. False when the file cannot be opened or read or a log file
  // cannot be opened; "DEBUG: couldn't read config file" is then written
  // (level 1, component "default").
  bool readConfig(const char* configFile, const char* logDir, const char* defaultFileName);
  // The log file `name` in `dir`, opened with "w" (truncating an old log) or
  // the one already opened for that path; stdout for "console". Null when
  // the subclass refuses the name or the file cannot be opened.
  FILE* addLogFile(const char* dir, const char* name);
  // The component's setting, or the default setting when it has none.
  ComponentSetting getComponentLogSettings(const char* component);
  // Writes when `level` AND the component's mask is not 0, into the
  // component's file.
  void writeLogVa(Debug::LogLevel level, bool raw, const char* component, const char* format,
                  va_list args) LODESTACK_PRINTF(5, 0);
  // Writes into `file` (none when null): the prefix, "  ", the component,
  // "/", the platform integer and "  " unless `raw`, then the message; then
  // the message goes to the platform log too unless "no_platform_logging".
  void writeLogVa(FILE* file, bool raw, const char* component, const char* format, va_list args)
      LODESTACK_PRINTF(5, 0);
  void writeLogEll(Debug::LogLevel level, bool raw, const char* component, const char* format,
                   ...) LODESTACK_PRINTF(5, 6);
  // The log directory.
  std::string logPath() const;

  // Counter + 1, logged as "DebugCommon::addRef: counter N"; returns N.
  int addRef();
  // Logs "DebugCommon::removeRef: counter N" with the current value, then
  // counter - 1; at 0 the object is destroyed (see above). Returns the new
  // value; the object must not be touched after a 0.
  int removeRef();

  // Take and release the process-wide DebugMutex.
  static void lock();
  static void unlock();

  // Makes `logger` the process-wide logger of the Debug facade and takes a
  // reference to it (addRef). Ok; Refused when one is installed already (or
  // `logger` is null), nothing changed. Debug::release() takes it down.
  static Status install(DebugCommon* logger);

 protected:
  DebugCommon();

  // Whether a process-wide logger is installed (it may change at once).
  static bool installed();

  // Writes the line prefix (at most kPrefixSize bytes, terminator included).
  virtual void makePrefix(char* buffer, bool raw, const char* component) = 0;
  // Called at the start of readConfig.
  virtual void platformInit() = 0;
  // Whether addLogFile may open a file of this name.
  virtual bool checkLogFileName(const char* name) = 0;
  // The integer printed after the component name.
  virtual int platformId() = 0;
  // One message for the platform's log.
  virtual void platformLog(const char* prefix, const char* component, int id, const char* format,
                           va_list args) LODESTACK_PRINTF(5, 0) = 0;

 private:
  friend class Debug;

  // The same operations, with the DebugMutex already held.
  FILE* openLogFile(const char* dir, const char* name);
  const ComponentSetting& settingOf(const char* component) const;
  void write(unsigned int level, bool raw, const char* component, const char* format,
             va_list args) LODESTACK_PRINTF(5, 0);
  void writeTo(FILE* file, bool raw, const char* component, const char* format, va_list args)
      LODESTACK_PRINTF(5, 0);
  void writeEll(unsigned int level, bool raw, const char* component, const char* format, ...)
      LODESTACK_PRINTF(5, 6);
  void applyLine(char* line, bool& success);
  int reference();
  int release();

  // The facade's entries: each does nothing when no logger is installed.
  static void forward(unsigned int level, bool raw, const char* component, const char* format,
                      va_list args) LODESTACK_PRINTF(4, 0);
  static void forwardToPlatform(const char* format, va_list args) LODESTACK_PRINTF(1, 0);
  static void releaseInstalled();

  std::map<std::string, FILE*> files_;  // by full path
  std::map<std::string, ComponentSetting> settings_;
  ComponentSetting default_;
  std::string logDir_;
  bool platformLogging_;
  int counter_;
};

}  // namespace lodestack

#endif  // LODESTACK_DEBUG_DEBUGCOMMON_H
