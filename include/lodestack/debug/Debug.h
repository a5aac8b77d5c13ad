// Debug: the library's logging facade, and the component names it logs under.
//
// Every subsystem writes its diagnostics through these static functions,
// naming its component ("core", "crypto", "datatypes", "Measurements",
// "RadioAdapt"; "WPOXEL" by default) and a level bit. Nothing is written
// unless a logger has been provided: with none installed, every entry point
// returns at once. Any thread may call; the functions never throw.
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

  // printf-style message of `level` under `component`.
  static void log(LogLevel level, const char* component, const char* format, ...)
      LODESTACK_PRINTF(3, 4);
  // The same under the default component.
  static void log2(LogLevel level, const char* format, ...) LODESTACK_PRINTF(2, 3);
  static void logva(LogLevel level, const char* component, const char* format, va_list args)
      LODESTACK_PRINTF(3, 0);
};

}  // namespace lodestack

#endif  // LODESTACK_DEBUG_DEBUG_H
