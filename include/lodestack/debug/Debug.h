// Debug: the library's logging facade, and the component names it logs under.
//
// Every subsystem writes its diagnostics through these static functions,
// naming its component ("core", "crypto", "datatypes", "Measurements",
// "RadioAdapt"; "WPOXEL" by default) and a level bit. Nothing is written
// unless an application has installed a process-wide logger
// (DebugCommon::install, or DebugLinux::install from a configuration file):
// with none installed, every entry point returns at once, and the library
// never installs one itself. With one installed, each call is forwarded to
// it under its lock, and the logger's configuration decides what is written
// where. Any thread may call; the functions never throw.
#ifndef LODESTACK_DEBUG_DEBUG_H
#define LODESTACK_DEBUG_DEBUG_H

#include <cstdarg>

#include "lodestack/core/Export.h"

#if defined(__GNUC__) || defined(__clang__)
#define LODESTACK_PRINTF(format_index, first_arg) \
  __attribute__((format(printf, format_index, first_arg)))
#else
#define LODESTACK_PRINTF(format_index, first_arg)
#endif

namespace lodestack {

class DebugCommon;

// Component names, one per subsystem.
LODESTACK_EXPORT extern const char* const gCoreDebugComponentName;          // "core"
LODESTACK_EXPORT extern const char* const gCryptoDebugComponentName;        // "crypto"
LODESTACK_EXPORT extern const char* const gDatatypesComponentName;          // "datatypes"
LODESTACK_EXPORT extern const char* const gMeasurementsComponentName;       // "Measurements"
LODESTACK_EXPORT extern const char* const gRadioAdaptationComponentName;    // "RadioAdapt"

class LODESTACK_EXPORT Debug {
 public:
  // A message of level L is written when L AND its component's mask is
  // non-zero. The library's own messages use level 1.
  enum LogLevel : unsigned int { Level1 = 1, Level2 = 2, Level4 = 4, Level8 = 8 };

  static const char* const defaultComponentName;  // "WPOXEL"

  Debug() = delete;

  // printf-style message of `level` under `component`, after the logger's
  // line prefix (time stamp, component, process id).
  static void log(LogLevel level, const char* component, const char* format, ...)
      LODESTACK_PRINTF(3, 4);
  // The same under the default component.
  static void log2(LogLevel level, const char* format, ...) LODESTACK_PRINTF(2, 3);
  static void logva(LogLevel level, const char* component, const char* format, va_list args)
      LODESTACK_PRINTF(3, 0);

  // As log and log2, but the line is written raw, without the prefix: output
  // meant to be compared by test scripts.
  static void testLog(LogLevel level, const char* component, const char* format, ...)
      LODESTACK_PRINTF(3, 4);
  static void testLog2(LogLevel level, const char* format, ...) LODESTACK_PRINTF(2, 3);

  // `length` bytes of `data` in hexadecimal, 16 to a line, each line led by
  // the offset of its first byte.
  static void dump(LogLevel level, const char* component, const void* data, unsigned int length);
  static void dump2(LogLevel level, const void* data, unsigned int length);

  // A timing mark: the message after "PERF <microseconds of the monotonic
  // clock>: ", so that intervals between marks can be read off the log. The
  // message is cut at 511 characters.
  static void perf(LogLevel level, const char* component, const char* format, ...)
      LODESTACK_PRINTF(3, 4);
  static void perf2(LogLevel level, const char* format, ...) LODESTACK_PRINTF(2, 3);

  // A message for the platform's system log only, whatever the masks and the
  // "no_platform_logging" setting say.
  static void systemLog(const char* format, ...) LODESTACK_PRINTF(1, 2);

  // Drops one reference to the installed logger (DebugCommon::removeRef);
  // the last one uninstalls and destroys it. Nothing when none is installed.
  static void release();

  // Always null: the library does not create a logger on its own.
  static DebugCommon* init();
};

}  // namespace lodestack

#endif  // LODESTACK_DEBUG_DEBUG_H
